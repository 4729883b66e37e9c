#include "platform/bus/bus_answer.h"

#include "platform/bus/bus_dictionary.h"
#include "platform/process_end.h"

namespace {

bool readMembers(sd_bus_message* message, AnswerForm form, BusAnswer& answer) {
  const bool hasText = form == AnswerForm::statusMessageReply;
  const char* text = "";
  if (sd_bus_message_has_signature(message, hasText ? "isv" : "iv") <= 0 ||
      checked(sd_bus_message_read(message, "i", &answer.result.status)) <= 0 ||
      (hasText && checked(sd_bus_message_read(message, "s", &text)) <= 0)) {
    return false;
  }
  answer.result.message = text;
  return readPayload(message, answer.reply);
}

}  // namespace

BusAnswer failedAnswer(std::int32_t status, const char* message) {
  return {{status, message}, MessageDict::notADictionary()};
}

BusAnswer readAnswer(sd_bus_message* message, AnswerForm form) {
  BusAnswer answer;
  if (!readMembers(message, form, answer)) {
    return failedAnswer(kStatusBusFailure, "The answer has the wrong signature");
  }
  if (answer.result.status != 0) {
    answer.reply = MessageDict::notADictionary();
  }
  return answer;
}
