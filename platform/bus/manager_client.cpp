#include "platform/manager_client.h"

#include "platform/bus/bus_answer.h"
#include "platform/bus/bus_connection.h"
#include "platform/bus/bus_dictionary.h"
#include "platform/device/saved_traces.h"
#include "platform/manager_names.h"
#include "platform/process_end.h"

#include <future>
#include <map>
#include <mutex>
#include <utility>

namespace {

constexpr const char* kBusName = "org.vell.Manager1";
constexpr const char* kObjectPath = "/org/vell/Manager1";
constexpr const char* kInterface = "org.vell.Manager1";

/// The state that is delivered while no manager runs.
constexpr const char* kServerStateStopped = "Stopped";

BusCall managerCall(const char* interface, const char* member,
                    std::function<bool(sd_bus_message*)> fill) {
  return {kBusName, kObjectPath, interface, member, std::move(fill)};
}

/// One command, on its way and until it is answered.
struct Request {
  std::string command;
  MessageDict dict;
};

/// Answers a command while no manager runs: from the saved traces where they can.
BusAnswer answerWithoutManager(const Request& request) {
  const auto saved = request.command == vell::kCommandGetTraceProperty
                         ? savedTraceProperty(request.dict.getString(vell::kKeyTraceName),
                                              request.dict.getString(vell::kKeyTracePropertyName))
                         : std::nullopt;
  if (!saved) {
    return failedAnswer(vell::kStatusManagerNotRunning, "The manager is not running");
  }
  MessageDict reply;
  reply.set(vell::kKeyTracePropertyValue, *saved);
  return {CommandResult(), std::move(reply)};
}

MessageDict stateEvent(MessageDict::Value state) {
  MessageDict payload;
  payload.set(vell::kKeyServerState, std::move(state));
  return payload;
}

/// State in the reply to a read of the property.
MessageDict::Value readState(BusOutcome outcome, sd_bus_message* reply) {
  if (outcome == BusOutcome::noOwner) {
    return kServerStateStopped;
  }
  MessageDict::Value state = MessageDict::OtherType{};
  if (outcome == BusOutcome::answered &&
      (sd_bus_message_has_signature(reply, "v") <= 0 || !readValue(reply, state))) {
    state = MessageDict::OtherType{};
  }
  return state;
}

/// The event handlers, and whether events are delivered to them.
class Subscriptions {
 public:
  explicit Subscriptions(WorkQueue deliveryQueue) : queue(std::move(deliveryQueue)) {}

  void add(const std::string& eventName, vell::client::EventHandler handler) {
    const std::lock_guard lock(mutex);
    handlers[eventName] = std::make_shared<vell::client::EventHandler>(std::move(handler));
  }

  void switchOn() {
    const std::lock_guard lock(mutex);
    on = std::make_shared<Delivery>();
  }

  void switchOff() {
    std::shared_ptr<Delivery> ended;
    {
      const std::lock_guard lock(mutex);
      ended.swap(on);
    }
    if (ended) {
      const std::lock_guard lock(ended->mutex);
      ended->on = false;
    }
  }

  bool areOn() const {
    const std::lock_guard lock(mutex);
    return on != nullptr;
  }

  /// Takes the payload of an event of that name to the queue. Empty when nobody listens to it.
  std::function<void(MessageDict)> listener(const std::string& eventName) const {
    const std::lock_guard lock(mutex);
    const auto found = handlers.find(eventName);
    if (!on || found == handlers.end()) {
      return nullptr;
    }
    return [this, delivery = on, handler = found->second](MessageDict payload) {
      queue.submit([delivery, handler, event = std::move(payload)]() mutable {
        // Asked again: delivery may have been switched off while the event waited on the queue.
        const std::lock_guard handling(delivery->mutex);
        if (delivery->on) {
          (*handler)(std::move(event), WorkGroup::create());
        }
      });
    };
  }

 private:
  /// Lives from one EventsOn to the next EventsOff or EventsOn.
  struct Delivery {
    std::recursive_mutex mutex;  ///< Held while a handler runs, which may itself end the delivery.
    bool on = true;              ///< Guarded by `mutex`.
  };

  const WorkQueue queue;
  mutable std::mutex mutex;
  std::map<std::string, std::shared_ptr<const vell::client::EventHandler>>
      handlers;                  ///< Guarded by `mutex`.
  std::shared_ptr<Delivery> on;  ///< Guarded by `mutex`. Empty while delivery is off.
};

}  // namespace

class vell::client::Manager {
 public:
  Manager(std::string name, WorkQueue workQueue)
      : queue(workQueue),
        subscriptions(std::move(workQueue)),
        clientName(std::move(name)),
        connection("manager.client",
                   {[this](sd_bus* bus) { onConnected(bus); }, [this] { onLost(); }}) {}

  Manager(const Manager&) = delete;
  Manager& operator=(const Manager&) = delete;
  ~Manager() { subscriptions.switchOff(); }

  void perform(std::string command, MessageDict dict, std::function<void(BusAnswer)> handler) {
    const auto request =
        std::make_shared<const Request>(Request{std::move(command), std::move(dict)});
    connection.call(
        managerCall(kInterface, "PerformCommand",
                    [request](sd_bus_message* message) {
                      return appendText(message, request->command) &&
                             appendDictionary(message, request->dict);
                    }),
        [request, handler = std::move(handler)](BusOutcome outcome, sd_bus_message* reply) {
          switch (outcome) {
            case BusOutcome::answered:
              return handler(readAnswer(reply, AnswerForm::statusMessageReply));
            case BusOutcome::noOwner:
              return handler(answerWithoutManager(*request));
            case BusOutcome::failed:
              return handler(failedAnswer(kStatusBusFailure, "The bus failed"));
          }
        });
  }

  void switchEventsOn() {
    subscriptions.switchOn();
    connection.post([this] { deliverState(); });
  }

  const WorkQueue queue;
  Subscriptions subscriptions;

 private:
  // All of these run on the connection's thread.

  void onConnected(sd_bus* bus) {
    sd_bus_slot* slot = nullptr;
    if (checked(sd_bus_match_signal_async(bus, &slot, kBusName, kObjectPath, kInterface, "Event",
                                          onEvent, nullptr, this)) >= 0) {
      events.reset(slot);
    }
    const std::string ownerRule =
        std::string(
            "type='signal',sender='org.freedesktop.DBus',interface='org.freedesktop.DBus',"
            "member='NameOwnerChanged',arg0='") +
        kBusName + "'";
    if (checked(sd_bus_add_match_async(bus, &slot, ownerRule.c_str(), onOwnerChanged, nullptr,
                                       this)) >= 0) {
      ownerChanges.reset(slot);
    }
    askForOwner();
    openClient();
    if (stateTold) {
      deliverState();
    }
  }

  void onLost() {
    events.reset();
    ownerChanges.reset();
    owner.clear();
    tellState(kServerStateStopped);
  }

  /// The bus answers in order: a change of owner that is told before the answer is older than it.
  void askForOwner() {
    connection.call({kBusDaemon, "/org/freedesktop/DBus", kBusDaemon, "GetNameOwner",
                     [](sd_bus_message* message) {
                       return checked(sd_bus_message_append(message, "s", kBusName)) >= 0;
                     }},
                    [this](BusOutcome outcome, sd_bus_message* reply) {
                      const char* name = nullptr;
                      if (outcome == BusOutcome::answered &&
                          checked(sd_bus_message_read(reply, "s", &name)) > 0) {
                        owner = name;
                      }
                    });
  }

  void openClient() {
    connection.call(
        managerCall(kInterface, "OpenClient",
                    [this](sd_bus_message* message) { return appendText(message, clientName); }),
        [](BusOutcome, sd_bus_message*) {});
  }

  /// Delivers one state event for the state that the manager has now.
  void deliverState() {
    if (!subscriptions.areOn()) {
      return;
    }
    connection.call(managerCall("org.freedesktop.DBus.Properties", "Get",
                                [](sd_bus_message* message) {
                                  return checked(sd_bus_message_append(message, "ss", kInterface,
                                                                       "ServerState")) >= 0;
                                }),
                    [this](BusOutcome outcome, sd_bus_message* reply) {
                      // A former owner may be late; the state of the new one, or of none, is told
                      // by then.
                      if (outcome != BusOutcome::answered || isFrom(reply, owner)) {
                        tellState(readState(outcome, reply));
                      }
                    });
  }

  void tellState(MessageDict::Value state) {
    if (const auto tell = subscriptions.listener(kEventServerStateChange)) {
      tell(stateEvent(std::move(state)));
    }
    stateTold = true;
  }

  static int onEvent(sd_bus_message* signal, void* userdata, sd_bus_error* /*error*/) {
    auto& manager = *static_cast<Manager*>(userdata);
    const char* name = nullptr;
    if (!isFrom(signal, manager.owner) || sd_bus_message_has_signature(signal, "sv") <= 0 ||
        checked(sd_bus_message_read(signal, "s", &name)) <= 0) {
      return 0;
    }
    const auto tell = manager.subscriptions.listener(name);
    MessageDict payload;
    if (tell && readPayload(signal, payload)) {
      tell(std::move(payload));
    }
    return 0;
  }

  static int onOwnerChanged(sd_bus_message* signal, void* userdata, sd_bus_error* /*error*/) {
    auto& manager = *static_cast<Manager*>(userdata);
    const char* newOwner = nullptr;
    if (!isFrom(signal, kBusDaemon) ||
        checked(sd_bus_message_read(signal, "sss", nullptr, nullptr, &newOwner)) <= 0) {
      return 0;
    }
    manager.owner = newOwner;
    if (manager.owner.empty()) {
      manager.tellState(kServerStateStopped);
    } else {
      manager.openClient();
      manager.deliverState();
    }
    return 0;
  }

  const std::string clientName;
  std::string owner;       // unique name of the manager's connection; empty: none that is known
  bool stateTold = false;  // once it was, a new connection tells it anew
  BusSlotPtr events;
  BusSlotPtr ownerChanges;

  // Last, so that its thread has ended before anything that it uses goes.
  BusConnection connection;
};

std::shared_ptr<vell::client::Manager> vell::client::CreateManager(const std::string& clientName,
                                                                   WorkQueue queue) {
  return std::make_shared<Manager>(clientName, std::move(queue));
}

void vell::client::RegisterEventHandler(std::shared_ptr<Manager> manager,
                                        const std::string& eventName, EventHandler handler) {
  manager->subscriptions.add(eventName, std::move(handler));
}

void vell::client::EventsOn(std::shared_ptr<Manager> manager) {
  manager->switchEventsOn();
}

void vell::client::EventsOff(std::shared_ptr<Manager> manager) {
  manager->subscriptions.switchOff();
}

void vell::client::PerformCommand(std::shared_ptr<Manager> manager, const std::string& command,
                                  Completion completion, MessageDict request) {
  manager->perform(
      command, std::move(request),
      [queue = manager->queue, completion = std::move(completion)](BusAnswer answer) mutable {
        // Moved on, so that its last copy is released where it runs.
        queue.submit([completion = std::move(completion), answer = std::move(answer)]() mutable {
          completion(std::move(answer.result), std::move(answer.reply));
        });
      });
}

CommandResult vell::client::PerformCommand(std::shared_ptr<Manager> manager,
                                           const std::string& command, MessageDict request,
                                           MessageDict* reply) {
  const auto answered = std::make_shared<std::promise<BusAnswer>>();
  auto answer = answered->get_future();
  manager->perform(command, std::move(request),
                   [answered](BusAnswer given) { answered->set_value(std::move(given)); });
  auto given = answer.get();
  *reply = std::move(given.reply);
  return given.result;
}
