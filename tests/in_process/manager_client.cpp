#include "platform/manager_client.h"

#include "platform/manager_names.h"
#include "tests/in_process/device.h"

#include <future>
#include <map>
#include <utility>
#include <vector>

class vell::client::Manager {
 public:
  explicit Manager(WorkQueue workQueue) : queue(std::move(workQueue)) {}

  /// Has `name` handled on the queue, and returns when it has been.
  void deliver(const std::string& name, const MessageDict& payload) {
    const auto handler = handlers.find(name);
    if (!on || handler == handlers.end()) {
      return;
    }
    std::promise<void> handled;
    queue.submit([&] {
      handler->second(payload, WorkGroup::create());
      handled.set_value();
    });
    handled.get_future().wait();
  }

  const WorkQueue queue;
  std::map<std::string, EventHandler> handlers;
  bool on = false;
};

namespace {

constexpr std::int32_t kStatusBusFailure = 1;

/// The clients of the present device. A handler may hold its own client, as the tool's does, so
/// they are let go by hand.
class Clients {
 public:
  Clients() = default;
  Clients(const Clients&) = delete;
  Clients& operator=(const Clients&) = delete;
  ~Clients() { close(); }

  void close() {
    for (const auto& client : opened) {
      client->handlers.clear();
    }
    opened.clear();
  }

  std::vector<std::shared_ptr<vell::client::Manager>> opened;
};

Clients& clients() {
  static Clients present;
  return present;
}

void noteCall(const std::string& call) {
  in_process::device().clientCalls.push_back(call);
}

std::pair<CommandResult, MessageDict> answerTo(const std::string& command,
                                               const MessageDict& request) {
  const auto& device = in_process::device();
  if (!device.managerRuns) {
    return {{vell::kStatusManagerNotRunning, ""}, MessageDict::notADictionary()};
  }
  auto answer = device.model.performCommand(command, request);
  if (answer.conduct != simulator::Conduct::Reply) {
    return {{kStatusBusFailure, ""}, MessageDict::notADictionary()};
  }
  return {{answer.status, answer.message}, answer.reply};
}

}  // namespace

void in_process::closeClients() {
  clients().close();
}

void in_process::sendEvent(const std::string& name, const MessageDict& payload) {
  for (const auto& client : clients().opened) {
    client->deliver(name, payload);
  }
}

std::shared_ptr<vell::client::Manager> vell::client::CreateManager(const std::string& clientName,
                                                                   WorkQueue queue) {
  noteCall("CreateManager " + clientName + " " + queue.label());
  return clients().opened.emplace_back(std::make_shared<Manager>(std::move(queue)));
}

void vell::client::RegisterEventHandler(std::shared_ptr<Manager> manager,
                                        const std::string& eventName, EventHandler handler) {
  noteCall("RegisterEventHandler " + eventName);
  manager->handlers[eventName] = std::move(handler);
}

void vell::client::EventsOn(std::shared_ptr<Manager> manager) {
  noteCall("EventsOn");
  manager->on = true;
  MessageDict stopped;
  stopped.set(kKeyServerState, "Stopped");
  const auto& device = in_process::device();
  manager->deliver(kEventServerStateChange,
                   device.managerRuns ? device.model.serverStatePayload() : stopped);
}

void vell::client::EventsOff(std::shared_ptr<Manager> manager) {
  noteCall("EventsOff");
  manager->on = false;
}

void vell::client::PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                                  Completion completion, MessageDict request) {
  manager->queue.submit([completion = std::move(completion), answer = answerTo(command, request)] {
    completion(answer.first, answer.second);
  });
}

CommandResult vell::client::PerformCommand(std::shared_ptr<Manager> /*manager*/,
                                           const std::string& command, MessageDict request,
                                           MessageDict* reply) {
  auto [result, payload] = answerTo(command, request);
  *reply = std::move(payload);
  return result;
}
