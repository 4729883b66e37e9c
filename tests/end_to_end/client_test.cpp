// The clients of the manager and of its helper by themselves, against a real bus and real services.

#include "platform/bus/bus_connection.h"
#include "platform/bus/bus_handles.h"
#include "platform/helper_client.h"
#include "platform/helper_names.h"
#include "platform/manager_client.h"
#include "platform/manager_names.h"
#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <future>
#include <memory>

namespace {

using vell::client::PerformCommand;

/// A device, and a client of its manager, whose queue can be held up.
class Client : public testing::Test {
 protected:
  void start(const std::string& profile) {
    device.emplace(profile);
    setenv("DBUS_SYSTEM_BUS_ADDRESS", device->busAddress().c_str(), 1);
    manager = vell::client::CreateManager("test", queue);
  }

  /// Collects the states that events tell, the present one first.
  void collectStates() {
    vell::client::RegisterEventHandler(manager, vell::kEventServerStateChange,
                                       [this](const MessageDict& payload, const WorkGroup&) {
                                         states.push_back(payload.getString(vell::kKeyServerState));
                                       });
    vell::client::EventsOn(manager);
    ask();
  }

  void expectStates(const std::vector<std::string>& expected) const {
    onQueue([&] { EXPECT_EQ(states, expected); });
  }

  /// The status of a command.
  std::int32_t ask() {
    MessageDict reply;
    return PerformCommand(manager, vell::kCommandGetTraceProperty, {}, &reply).status;
  }

  /// Runs `work` on the queue and waits for it.
  void onQueue(const std::function<void()>& work) const {
    const auto done = std::make_shared<std::promise<void>>();
    queue.submit([&work, done] { work(), done->set_value(); });
    done->get_future().wait();
  }

  std::vector<std::string> states;  // that events have told of
  std::optional<SimulatedDevice> device;
  const WorkQueue queue = WorkQueue::create("test");
  std::shared_ptr<vell::client::Manager> manager;
};

/// Somebody on the bus who sends signals to whom they like, and may own the manager's name.
class Stranger {
 public:
  Stranger() {
    sd_bus* opened = nullptr;
    sd_bus_open_system(&opened);
    bus.reset(opened);
    sd_bus_add_filter(opened, nullptr, answer, &lastAnswered);
  }

  void sendEvent(const char* state) const {
    sendToAll(kPath, kName, "Event", "sv", vell::kEventServerStateChange, "a{sv}", 1,
              vell::kKeyServerState, "s", state);
  }

  void sendOwnerChange(const char* from, const char* to) const {
    sendToAll("/org/freedesktop/DBus", kBusDaemon, "NameOwnerChanged", "sss", kName, from, to);
  }

  void takeName() const { ASSERT_GT(sd_bus_request_name(bus.get(), kName, 0), 0); }
  void releaseName() const { ASSERT_GE(sd_bus_release_name(bus.get(), kName), 0); }

  /// Answers the calls that have come or come, up to one of `member`.
  void answerUpTo(const std::string& member) const {
    while (lastAnswered != member) {
      if (sd_bus_process(bus.get(), nullptr) == 0) {
        sd_bus_wait(bus.get(), UINT64_MAX);
      }
    }
  }

 private:
  static constexpr const char* kName = "org.vell.Manager1";
  static constexpr const char* kPath = "/org/vell/Manager1";

  /// Addresses a signal to each connection there is, and waits until each has handled it.
  template <typename... Contents>
  void sendToAll(const char* path, const char* interface, const char* member,
                 Contents... contents) const {
    char** names = nullptr;
    ASSERT_GE(sd_bus_list_names(bus.get(), &names, nullptr), 0);
    const char* own = nullptr;
    sd_bus_get_unique_name(bus.get(), &own);
    for (char** name = names; *name != nullptr; std::free(*name++)) {
      if (**name == ':' && std::string_view(*name) != own) {
        sd_bus_message* signal = nullptr;
        sd_bus_message_new_signal(bus.get(), &signal, path, interface, member);
        const BusMessagePtr owner(signal);
        EXPECT_GE(sd_bus_message_append(signal, contents...), 0);
        EXPECT_GE(sd_bus_send_to(bus.get(), signal, *name, nullptr), 0);
        EXPECT_GE(sd_bus_call_method(bus.get(), *name, "/", "org.freedesktop.DBus.Peer", "Ping",
                                     nullptr, nullptr, ""),
                  0);
      }
    }
    std::free(names);
  }

  static int answer(sd_bus_message* call, void* userdata, sd_bus_error* /*error*/) {
    if (sd_bus_message_is_method_call(call, nullptr, "Get") > 0) {
      sd_bus_reply_method_return(call, "v", "s", "Started");
    } else if (sd_bus_message_is_method_call(call, nullptr, "PerformCommand") > 0) {
      sd_bus_reply_method_errorf(call, SD_BUS_ERROR_SERVICE_UNKNOWN, "the manager's own words");
    } else {
      return 0;
    }
    *static_cast<std::string*>(userdata) = sd_bus_message_get_member(call);
    return 1;
  }

  BusPtr bus;
  std::string lastAnswered;
};

}  // namespace

TEST_F(Client, AsksSynchronouslyWhileItsQueueIsBusyAndFromItsQueue) {
  start("");
  std::promise<void> gate;
  queue.submit([&] { gate.get_future().wait(); });
  EXPECT_EQ(ask(), 0);
  gate.set_value();
  onQueue([&] { EXPECT_EQ(ask(), 0); });
}

TEST_F(Client, DeliversNothingOnceEventsAreOff) {
  start("MANAGER=absent");
  auto service = device->serve("manager");
  // Anew, so that the coming of the service is no event.
  manager = vell::client::CreateManager("test", queue);
  collectStates();
  expectStates({"Started"});

  std::promise<void> gate;
  queue.submit([&] { gate.get_future().wait(); });
  service.write("state Stopped\n");
  service.readUntil("Event");
  // What is answered after the event has come behind it.
  EXPECT_EQ(ask(), 0);
  vell::client::EventsOff(manager);
  gate.set_value();
  expectStates({"Started"});
  vell::client::EventsOn(manager);
  EXPECT_EQ(ask(), 0);
  // The end of the service is an event, too.
  onQueue([&] { vell::client::EventsOff(manager); });
  EXPECT_EQ(states, (std::vector<std::string>{"Started", "Stopped"}));
}

TEST_F(Client, IgnoresSignalsOfStrangersWhileTheManagerRuns) {
  start("");
  collectStates();
  const Stranger stranger;
  stranger.sendEvent("Stopped");
  stranger.sendOwnerChange(":1.0", "");
  expectStates({"Started"});
}

TEST_F(Client, FollowsOnlyTheOwnerOfTheManagersName) {
  start("MANAGER=absent");
  collectStates();
  const Stranger stranger;
  stranger.sendEvent("Started");
  stranger.sendOwnerChange("", ":1.0");
  expectStates({"Stopped"});
  stranger.takeName();
  stranger.sendEvent("Starting");
  expectStates({"Stopped", "Starting"});
  stranger.releaseName();
  stranger.sendEvent("Started");
  stranger.answerUpTo("Get");  // which was asked while it owned the name
  stranger.sendEvent("Started");
  expectStates({"Stopped", "Starting", "Stopped"});
}

TEST_F(Client, ForgetsTheOwnerWithTheBus) {
  start("BUS=no");
  auto bus = std::make_unique<TestProcess>(device->serve("bus"));
  collectStates();
  const Stranger owner;
  owner.takeName();
  owner.sendEvent("Starting");
  expectStates({"Stopped", "Starting"});
  bus.reset();
  bus = std::make_unique<TestProcess>(device->serve("bus"));
  EXPECT_EQ(ask(), vell::kStatusManagerNotRunning);
  const Stranger namesake;  // the new bus counts its connections anew
  namesake.sendEvent("Started");
  onQueue([&] { EXPECT_EQ(std::count(states.begin(), states.end(), "Started"), 0); });
}

TEST_F(Client, TakesOnlyTheBusesWordThatNoManagerRuns) {
  start("MANAGER=absent");
  const Stranger stranger;
  stranger.takeName();
  std::promise<std::int32_t> answered;
  PerformCommand(
      manager, vell::kCommandTraceDumpState,
      [&](const CommandResult& result, const MessageDict&) { answered.set_value(result.status); },
      {});
  stranger.answerUpTo("PerformCommand");
  const auto status = answered.get_future().get();
  EXPECT_NE(status, 0);
  EXPECT_NE(status, vell::kStatusManagerNotRunning);
}

TEST_F(Client, FailsOutstandingRequestsWhenReleased) {
  start("GET_TRACE_PROPERTY=silent");
  std::promise<std::int32_t> answered;
  auto token = std::make_shared<int>();
  const std::weak_ptr<int> watch = token;
  PerformCommand(
      manager, vell::kCommandGetTraceProperty,
      [&answered, held = std::move(token)](const CommandResult& result, const MessageDict& reply) {
        EXPECT_FALSE(reply.isDictionary());
        answered.set_value(result.status);
      },
      {});
  manager.reset();
  EXPECT_NE(answered.get_future().get(), 0);
  onQueue([&] { EXPECT_TRUE(watch.expired()); });
}

TEST_F(Client, StartsNoService) {
  start("BUS=no");
  // A bus that would start the manager, and show by another error that it had tried.
  EXPECT_EQ(device->runLine(R"(cd "$VELL_SYSROOT"
      sed -i "s|  <auth>|<servicedir>$PWD</servicedir>&|" run/bus.conf
      printf '[D-BUS Service]\nName=org.vell.Manager1\nExec=/no/such\n' >manager.service)"),
            (ProcessResult{0, "", ""}));
  const auto bus = device->serve("bus");
  MessageDict reply;
  EXPECT_EQ(PerformCommand(manager, vell::kCommandTraceDumpState, {}, &reply).status,
            vell::kStatusManagerNotRunning);
}

TEST_F(Client, WaitsForTheHelperWithinItsTimeLimit) {
  start("HELPER_TIMESTAMP=H\nHELPER_ANSWER=slow:300");
  for (const std::int64_t milliseconds : {60000, 10, 0, -1}) {
    MessageDict request;
    request.set(vell::helper::kKeyTimeout, milliseconds);
    MessageDict reply;
    const auto start = std::chrono::steady_clock::now();
    const auto result = vell::HelperClient::create("test", nullptr)
                            ->perform(4, vell::helper::kCommandTidewellStatus, request, reply);
    const auto taken = std::chrono::steady_clock::now() - start;
    EXPECT_EQ(result.status == 0, milliseconds == 60000);
    EXPECT_EQ(taken >= std::chrono::milliseconds(300), milliseconds == 60000);
    EXPECT_EQ(reply.getString(vell::helper::kKeyTimestampString), milliseconds == 60000 ? "H" : "");
  }
}
