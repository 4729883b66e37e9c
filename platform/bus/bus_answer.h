#pragma once

#include "platform/command_result.h"
#include "platform/message_dict.h"

#include <systemd/sd-bus.h>

#include <cstdint>

/// The answer to a command on the bus.
struct BusAnswer {
  CommandResult result;
  MessageDict reply;  ///< `notADictionary()` unless the command succeeded.
};

/// Status of a command that the bus failed in any way but a missing owner.
inline constexpr std::int32_t kStatusBusFailure = static_cast<std::int32_t>(0xE020E002U);

/// The answer to a command that was not carried out.
BusAnswer failedAnswer(std::int32_t status, const char* message);

/// Which members the answers of a service have.
enum class AnswerForm {
  statusReply,         ///< Signature `iv`.
  statusMessageReply,  ///< Signature `isv`.
};

/// Reads an answer. A `message` with another signature is a failure of the bus. On the thread that
/// owns the message.
BusAnswer readAnswer(sd_bus_message* message, AnswerForm form);
