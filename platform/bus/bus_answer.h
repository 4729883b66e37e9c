#pragma once

#include "platform/command_result.h"
#include "platform/message_dict.h"

#include <cstdint>
#include <utility>

/// What a command on the bus is answered with.
using BusAnswer = std::pair<CommandResult, MessageDict>;

/// The status of a command that the bus failed, other than by finding nobody to ask.
inline constexpr std::int32_t kStatusBusFailure = static_cast<std::int32_t>(0xE020E002U);

/// The answer to a command that was not carried out.
inline BusAnswer failedAnswer(std::int32_t status, const char* message) {
  return {{status, message}, MessageDict::notADictionary()};
}
