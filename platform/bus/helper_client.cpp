#include "platform/helper_client.h"

#include "platform/bus/bus_answer.h"
#include "platform/bus/bus_connection.h"
#include "platform/bus/bus_dictionary.h"
#include "platform/helper_names.h"

#include <algorithm>
#include <chrono>
#include <future>
#include <optional>
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

class vell::HelperClient::Connection {
 public:
  explicit Connection(const char* name) : bus(name, {}) {}

  std::future<BusAnswer> perform(helper::TaskID task, const char* command,
                                 const MessageDict& request) {
    const auto promise = std::make_shared<std::promise<BusAnswer>>();
    bus.call(
        {kHelperBusName, kHelperPath, kHelperInterface, "Perform",
         [task, command = std::string(command), request](sd_bus_message* message) {
           return sd_bus_message_append(message, "u", task) >= 0 && appendText(message, command) &&
                  appendDictionary(message, request);
         }},
        [promise](BusOutcome outcome, sd_bus_message* reply) {
          promise->set_value(outcome == BusOutcome::answered
                                 ? readAnswer(reply, AnswerForm::statusReply)
                                 : failedAnswer(kStatusBusFailure, "The helper did not answer"));
        });
    return promise->get_future();
  }

 private:
  BusConnection bus;
};

vell::HelperClient::HelperClient(std::unique_ptr<Connection> opened)
    : connection(std::move(opened)) {}

vell::HelperClient::~HelperClient() = default;

std::shared_ptr<vell::HelperClient> vell::HelperClient::create(
    const char* name, std::shared_ptr<LogServer> /*logServer*/) {
  return std::shared_ptr<HelperClient>(new HelperClient(std::make_unique<Connection>(name)));
}

CommandResult vell::HelperClient::perform(helper::TaskID task, const char* command,
                                          MessageDict request, MessageDict& reply) {
  const auto patience = patienceOf(request);
  auto answered = connection->perform(task, command, request);
  if (answered.wait_for(patience) != std::future_status::ready) {
    reply = MessageDict::notADictionary();
    return {kStatusBusFailure, "The helper did not answer in time"};
  }
  auto answer = answered.get();
  reply = std::move(answer.reply);
  return answer.result;
}
