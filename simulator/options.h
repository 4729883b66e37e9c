#pragma once

#include <optional>
#include <string>
#include <vector>

namespace simulator {

/// What the command line asks for: a device, or one of its services alone inside a device.
struct Options {
  std::string profile;               ///< Path of the profile; empty for the default device.
  std::vector<std::string> command;  ///< What to run in the device; empty for the user's shell.
  std::string service;               ///< `bus`, `manager`, `helper` or `journal`; empty: a device.
  std::string requestLog;            ///< Where the service writes its requests; empty: to stdout.
};

/// Reads the words that follow the program's name. Complains and is empty when they make no sense.
std::optional<Options> parseOptions(const std::vector<std::string>& words);

}  // namespace simulator
