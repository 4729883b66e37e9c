#pragma once

#include <optional>
#include <string>

/// readLine (platform/line_reader.h) without editing and completion: std::cin and std::cout.
std::optional<std::string> readPlainLine(const std::string& prompt);
