// The clients of the manager and of its helper by themselves, against a real bus and real services.

#include "platform/helper_client.h"
#include "platform/helper_names.h"
#include "platform/manager_client.h"
#include "platform/manager_names.h"
#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <chrono>
#include <cstdlib>
#include <future>

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

  /// The status of a command that the manager answers or does not.
  std::int32_t ask() {
    MessageDict reply;
    return PerformCommand(manager, vell::kCommandGetTraceProperty, {}, &reply).status;
  }

  /// Has `work` done on the queue and waits for it.
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
  vell::client::RegisterEventHandler(manager, vell::kEventServerStateChange,
                                     [&](const MessageDict& payload, const WorkGroup&) {
                                       states.push_back(payload.getString(vell::kKeyServerState));
                                     });
  vell::client::EventsOn(manager);
  EXPECT_EQ(ask(), 0);
  onQueue([&] { EXPECT_EQ(states, std::vector<std::string>{"Started"}); });

  std::promise<void> gate;
  queue.submit([&] { gate.get_future().wait(); });
  service.write("state Stopped\n");
  service.readUntil("Event");
  // What is answered after the event has come behind it.
  EXPECT_EQ(ask(), 0);
  vell::client::EventsOff(manager);
  gate.set_value();
  onQueue([&] { EXPECT_EQ(states, std::vector<std::string>{"Started"}); });
  vell::client::EventsOn(manager);
  EXPECT_EQ(ask(), 0);
  // The end of the service is an event, too.
  onQueue([&] { vell::client::EventsOff(manager); });
  EXPECT_EQ(states, (std::vector<std::string>{"Started", "Stopped"}));
}

TEST_F(Client, AnswersWhatIsOutstandingWhenItGoes) {
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

TEST_F(Client, OfTheHelperWaitsForAnAnswerWithinItsTimeLimit) {
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
