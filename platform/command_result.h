#pragma once

#include <cstdint>
#include <string>

/// How a command of the manager or of its helper ended.
struct CommandResult {
  std::int32_t status = 0;  ///< 0 is success; every other value is a failure.
  std::string message;      ///< The other side's own words, for people; may be empty.
};
