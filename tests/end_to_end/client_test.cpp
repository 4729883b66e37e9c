// The clients of the manager and of its helper by themselves, against a real bus and real services.

#include "platform/helper_client.h"
#include "platform/helper_names.h"
#include "platform/manager_client.h"
#include "platform/manager_names.h"
#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <future>

namespace {

using vell::client::CreateManager;
using vell::client::PerformCommand;

/// A device, and a client of its manager, whose queue can be held up.
class Client : public testing::Test {
 protected:
  void start(const std::string& profile) {
    device.emplace(profile);
    setenv("DBUS_SYSTEM_BUS_ADDRESS", device->busAddress().c_str(), 1);
    manager = CreateManager("test", queue);
  }

  /// The status of a command that the manager answers or does not.
  std::int32_t statusOf(const char* command) {
    MessageDict reply;
    return PerformCommand(manager, command, {}, &reply).status;
  }

  /// Holds the queue up until what this gives is destroyed.
  std::shared_ptr<void> holdQueue() {
    const auto gate = std::make_shared<std::promise<void>>();
    queue.submit([gate, opened = gate->get_future().share()] { opened.wait(); });
    return {nullptr, [gate](void*) { gate->set_value(); }};
  }

  void drainQueue() {
    std::promise<void> drained;
    queue.submit([&] { drained.set_value(); });
    drained.get_future().wait();
  }

  std::vector<std::string> states;  // that events have told of
  std::optional<SimulatedDevice> device;
  const WorkQueue queue = WorkQueue::create("test");
  std::shared_ptr<vell::client::Manager> manager;
};

}  // namespace

TEST_F(Client, AsksSynchronouslyWhileItsQueueIsBusyAndFromItsQueue) {
  start("");
  auto held = holdQueue();
  EXPECT_EQ(statusOf(vell::kCommandGetTraceProperty), 0);
  held.reset();
  std::promise<std::int32_t> asked;
  queue.submit([&] { asked.set_value(statusOf(vell::kCommandGetTraceProperty)); });
  EXPECT_EQ(asked.get_future().get(), 0);
}

TEST_F(Client, DeliversNothingOnceEventsAreOff) {
  start("MANAGER=absent");
  auto service = device->serve("manager");
  // Anew, so that the coming of the service is no event.
  manager = CreateManager("test", queue);
  vell::client::RegisterEventHandler(manager, vell::kEventServerStateChange,
                                     [&](const MessageDict& payload, const WorkGroup&) {
                                       states.push_back(payload.getString(vell::kKeyServerState));
                                     });
  vell::client::EventsOn(manager);
  EXPECT_EQ(statusOf(vell::kCommandGetTraceProperty), 0);
  drainQueue();
  EXPECT_EQ(states, std::vector<std::string>{"Started"});

  auto held = holdQueue();
  service.write("state Stopped\n");
  while (!service.readLine().starts_with("Event")) {
  }
  // What is answered after the event has come behind it.
  EXPECT_EQ(statusOf(vell::kCommandGetTraceProperty), 0);
  vell::client::EventsOff(manager);
  held.reset();
  drainQueue();
  EXPECT_EQ(states, std::vector<std::string>{"Started"});
  vell::client::EventsOn(manager);
  EXPECT_EQ(statusOf(vell::kCommandGetTraceProperty), 0);
  drainQueue();
  // The end of the service is an event, too.
  vell::client::EventsOff(manager);
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
  drainQueue();
  EXPECT_TRUE(watch.expired());
}

TEST_F(Client, StartsNoService) {
  start("BUS=no");
  // A bus that would start the manager, and show by another error that it had tried.
  const auto configuration = device->root() / "run/bus.conf";
  auto text = contentOf(configuration);
  text.insert(text.find("  <auth>"),
              "  <servicedir>" + device->root().string() + "</servicedir>\n");
  std::ofstream(configuration) << text;
  std::ofstream(device->root() / "org.vell.Manager1.service")
      << "[D-BUS Service]\nName=org.vell.Manager1\nExec=/no/such/program\n";
  const auto bus = device->serve("bus");
  EXPECT_EQ(statusOf(vell::kCommandTraceDumpState), vell::kStatusManagerNotRunning);
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
    const bool patient = milliseconds == 60000;
    EXPECT_EQ(result.status == 0, patient);
    EXPECT_EQ(reply.getString(vell::helper::kKeyTimestampString), patient ? "H" : "");
    EXPECT_EQ(taken >= std::chrono::milliseconds(300), patient);
  }
}
