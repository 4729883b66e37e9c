#include "platform/helper_client.h"

#include "platform/bus/bus_answer.h"
#include "platform/bus/bus_connection.h"
#include "platform/bus/bus_dictionary.h"
#include "platform/helper_names.h"
#include "platform/process_end.h"

#include <algorithm>
#include <chrono>
#include <future>
#include <string>
#include <utility>

namespace {

constexpr const char* kHelperBusName = "org.vell.Helper1";
constexpr const char* kHelperPath = "/org/vell/Helper1";
constexpr const char* kHelperInterface = "org.vell.Helper1";

/// Longest time limit, in milliseconds. Added to the present time it does not overflow.
constexpr std::int64_t kLongestWait = std::int64_t{1000} * 60 * 60 * 24 * 365;

/// Time limit that the request names.
std::chrono::milliseconds patienceOf(const MessageDict& request) {
  const auto& entries = request.entries();
  const auto found = std::find_if(entries.begin(), entries.end(), [](const auto& entry) {
    return entry.key == vell::helper::kKeyTimeout;
  });
  const auto* limit = found == entries.end() ? nullptr : std::get_if<std::int64_t>(&found->value);
  return std::chrono::milliseconds(
      limit == nullptr ? kLongestWait : std::clamp<std::int64_t>(*limit, 0, kLongestWait));
}

}  // namespace

vell::HelperClient::HelperClient(std::unique_ptr<BusConnection> opened)
    : connection(std::move(opened)) {}

vell::HelperClient::~HelperClient() = default;

std::shared_ptr<vell::HelperClient> vell::HelperClient::create(
    const char* name, std::shared_ptr<LogServer> /*logServer*/) {
  auto opened = std::make_unique<BusConnection>(name, BusConnection::Hooks());
  return std::shared_ptr<HelperClient>(new HelperClient(std::move(opened)));
}

CommandResult vell::HelperClient::perform(helper::TaskID task, const char* command,
                                          MessageDict request, MessageDict& reply) {
  const auto patience = patienceOf(request);
  const auto promise = std::make_shared<std::promise<BusAnswer>>();
  auto answered = promise->get_future();
  connection->call(
      {kHelperBusName, kHelperPath, kHelperInterface, "Perform",
       [task, command = std::string(command),
        request = std::move(request)](sd_bus_message* message) {
         return checked(sd_bus_message_append(message, "u", task)) >= 0 &&
                appendText(message, command) && appendDictionary(message, request);
       }},
      [promise](BusOutcome outcome, sd_bus_message* answer) {
        promise->set_value(outcome == BusOutcome::answered
                               ? readAnswer(answer, AnswerForm::statusReply)
                               : failedAnswer(kStatusBusFailure, "The helper did not answer"));
      });
  if (answered.wait_for(patience) != std::future_status::ready) {
    reply = MessageDict::notADictionary();
    return {kStatusBusFailure, "The helper did not answer in time"};
  }
  auto answer = answered.get();
  reply = std::move(answer.reply);
  return answer.result;
}
