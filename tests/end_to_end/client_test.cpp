// The clients of the manager and of its helper by themselves, against a real bus and real services.

#include "platform/bus/bus_answer.h"
#include "platform/bus/bus_connection.h"
#include "platform/bus/bus_handles.h"
#include "platform/manager_client.h"
#include "platform/manager_names.h"
#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <chrono>
#include <cstdlib>
#include <future>
#include <memory>
#include <thread>

namespace {

using vell::client::PerformCommand;
using States = std::vector<std::string>;

/// A device, and a client of its manager, whose queue can be held up.
class Client : public testing::Test {
 protected:
  void start(const std::string& profile) {
    device.emplace(profile);
    setenv("DBUS_SYSTEM_BUS_ADDRESS", device->busAddress().c_str(), 1);
    manager = vell::client::CreateManager("test", queue);
    onQueue([&] { queueThread = std::this_thread::get_id(); });
  }

  /// Whether the call comes from the queue that was handed in.
  void expectOnQueue() const { EXPECT_EQ(std::this_thread::get_id(), queueThread); }

  /// Collects the states that events tell, the present one first.
  void collectStates() {
    vell::client::RegisterEventHandler(manager, vell::kEventServerStateChange,
                                       [this](const MessageDict& payload, const WorkGroup&) {
                                         expectOnQueue();
                                         states.push_back(payload.getString(vell::kKeyServerState));
                                       });
    vell::client::EventsOn(manager);
    ask();
  }

  void expectStates(const States& expected) const {
    onQueue([&] { EXPECT_EQ(states, expected); });
  }

  /// The status of a command.
  std::int32_t ask() {
    MessageDict reply;
    return PerformCommand(manager, vell::kCommandGetTraceProperty, {}, &reply).status;
  }

  /// Asks for a collection. The status comes from the queue.
  std::future<std::int32_t> startToAsk() {
    const auto answered = std::make_shared<std::promise<std::int32_t>>();
    MessageDict request;
    request.set(vell::kKeyTraceAction, vell::kCollectTelephonyLogs);
    PerformCommand(
        manager, vell::kCommandTraceDumpState,
        [this, answered](const CommandResult& result, const MessageDict& reply) {
          expectOnQueue();
          EXPECT_FALSE(reply.isDictionary());
          answered->set_value(result.status);
        },
        request);
    return answered->get_future();
  }

  /// Runs `work` on the queue and waits for it.
  void onQueue(const std::function<void()>& work) const {
    const auto done = std::make_shared<std::promise<void>>();
    queue.submit([&work, done] { work(), done->set_value(); });
    done->get_future().wait();
  }

  States states;  // that events have told of
  std::optional<SimulatedDevice> device;
  const WorkQueue queue = WorkQueue::create("test");
  std::thread::id queueThread;
  std::shared_ptr<vell::client::Manager> manager;
};

/// Somebody on the bus, who sends signals to the client and may own the manager's name.
class Peer {
 public:
  explicit Peer(const char* signatureOfState = "v") : stateSignature(signatureOfState) {
    sd_bus* opened = nullptr;
    sd_bus_open_system(&opened);
    bus.reset(opened);
    sd_bus_add_filter(opened, nullptr, answer, this);
    // The bus gives out its names in the order in which they are asked for.
    const char* name = nullptr;
    EXPECT_GE(sd_bus_get_unique_name(opened, &name), 0);
  }

  void sendEvent(const char* state) const {
    send(kPath, kName, "Event", "sv", vell::kEventServerStateChange, "a{sv}", 1,
         vell::kKeyServerState, "s", state);
  }

  void sendEventWithoutDictionary() const {
    send(kPath, kName, "Event", "sv", vell::kEventServerStateChange, "s", "Started");
  }

  void sendOwnerChange(const char* from, const char* to) const {
    send("/org/freedesktop/DBus", kBusDaemon, "NameOwnerChanged", "sss", kName, from, to);
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
  static constexpr const char* kClient = ":1.0";  ///< The first on its bus.

  /// Sends a signal to the client and waits until it has come out of its bus.
  template <typename... Contents>
  void send(const char* path, const char* interface, const char* member,
            Contents... contents) const {
    sd_bus_message* signal = nullptr;
    sd_bus_message_new_signal(bus.get(), &signal, path, interface, member);
    const BusMessagePtr owner(signal);
    EXPECT_GE(sd_bus_message_append(signal, contents...), 0);
    EXPECT_GE(sd_bus_send_to(bus.get(), signal, kClient, nullptr), 0);
    EXPECT_GE(sd_bus_call_method(bus.get(), kClient, "/", "org.freedesktop.DBus.Peer", "Ping",
                                 nullptr, nullptr, ""),
              0);
  }

  static int answer(sd_bus_message* call, void* userdata, sd_bus_error* /*error*/) {
    auto& peer = *static_cast<Peer*>(userdata);
    if (sd_bus_message_is_method_call(call, nullptr, "Get") > 0) {
      sd_bus_reply_method_return(call, peer.stateSignature, "s", "Started", "second");
    } else if (sd_bus_message_is_method_call(call, nullptr, "PerformCommand") > 0) {
      sd_bus_reply_method_errorf(call, SD_BUS_ERROR_SERVICE_UNKNOWN, "the manager's own words");
    } else {
      return 0;
    }
    peer.lastAnswered = sd_bus_message_get_member(call);
    return 1;
  }

  const char* const stateSignature;  ///< Of its reply to a read of the state, "v" and perhaps "s".
  BusPtr bus;
  std::string lastAnswered;
};

}  // namespace

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
  // What is answered after the event has come behind it. The queue need not be free for that.
  EXPECT_EQ(ask(), 0);
  vell::client::EventsOff(manager);
  gate.set_value();
  expectStates({"Started"});
  vell::client::EventsOn(manager);
  EXPECT_EQ(ask(), 0);
  // The end of the service is an event, too.
  onQueue([&] {
    EXPECT_EQ(ask(), 0);
    vell::client::EventsOff(manager);
  });
  EXPECT_EQ(states, (States{"Started", "Stopped"}));
}

TEST_F(Client, BelievesOnlyTheBusAndTheOwnerOfTheManagersName) {
  start("BUS=no");
  // A bus that would start the manager, and show by another error that it had tried.
  EXPECT_EQ(device->runLine(R"(cd "$VELL_SYSROOT"
      sed -i "s|  <auth>|<servicedir>$PWD</servicedir>&|" run/bus.conf
      printf '[D-BUS Service]\nName=org.vell.Manager1\nExec=/no/such\n' >manager.service)"),
            (ProcessResult{0, "", ""}));
  auto bus = std::optional(device->serve("bus"));
  collectStates();
  EXPECT_EQ(ask(), vell::kStatusManagerNotRunning);
  const Peer owner;
  const Peer stranger;
  stranger.sendEvent("Started");
  stranger.sendOwnerChange("", ":1.2");
  expectStates({"Stopped"});
  owner.takeName();
  owner.sendEvent("Starting");
  owner.sendEventWithoutDictionary();
  stranger.sendEvent("Started");
  stranger.sendOwnerChange(":1.1", "");
  expectStates({"Stopped", "Starting", ""});
  owner.releaseName();
  owner.sendEvent("Started");
  owner.answerUpTo("Get");  // which was asked while it owned the name
  owner.sendEvent("Started");
  expectStates({"Stopped", "Starting", "", "Stopped"});

  owner.takeName();
  owner.sendEvent("Starting");
  auto answer = startToAsk();
  owner.answerUpTo("PerformCommand");
  // The owner's word that no manager runs is not the bus's.
  EXPECT_EQ(answer.get(), kStatusBusFailure);
  expectStates({"Stopped", "Starting", "", "Stopped", "Starting", "Started"});

  bus.reset();
  bus = device->serve("bus");
  EXPECT_EQ(ask(), vell::kStatusManagerNotRunning);
  const Peer namesake("vs");  // The new bus counts its connections anew.
  namesake.sendEvent("Started");
  onQueue([&] { EXPECT_EQ(states.back(), "Stopped"); });
  // A second value behind the state makes it no state.
  namesake.takeName();
  namesake.answerUpTo("Get");
  answer = startToAsk();
  namesake.answerUpTo("PerformCommand");
  answer.get();
  onQueue([&] { EXPECT_EQ(states.back(), ""); });
}

TEST_F(Client, FailsOutstandingRequestsWhenReleased) {
  start("TRACE_DUMP_STATE=silent");
  EXPECT_EQ(ask(), 0);  // and so is connected
  auto answer = startToAsk();
  manager.reset();
  EXPECT_EQ(answer.get(), kStatusBusFailure);
}
