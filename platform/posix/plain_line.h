#pragma once

#include <iostream>
#include <optional>
#include <string>

/// readLine (platform/line_reader.h) without editing and completion: std::cin and std::cout.
inline std::optional<std::string> readPlainLine(const std::string& prompt) {
  std::cout << prompt << std::flush;
  std::string line;
  return std::cout && std::getline(std::cin, line) ? std::optional(line) : std::nullopt;
}
