#pragma once

#include <optional>
#include <string>

/// The value that the saved trace settings hold for a property of a trace; empty when they hold
/// none. The settings are read anew at each call; what is wrong with them is said in the system log
/// once in the life of the process.
std::optional<std::string> savedTraceProperty(const std::string& trace,
                                              const std::string& property);
