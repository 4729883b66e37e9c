// The manager and the bus come, go, hang and die while the tool runs.

#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <chrono>
#include <csignal>

namespace {

const std::string kCore = "Telephony log collection with Coredump: ";
const std::string kPath = "Path = /private/var/wireless/Library/Logs/Faultkeeper/Baseband/log-bb-T";
const std::string kCollected = "Telephony log collection: Success\n" + kPath + "-*\n";

/// Types a command at the tool's prompt and gives all that it answers with, the next prompt last.
std::string answerTo(TestProcess& tool, const std::string& command) {
  tool.write(command + "\n");
  return tool.readUntil(kPrompt);
}

/// Has logs collected until the tool, which follows the manager on its own time, answers
/// `expected`.
void expectInTime(TestProcess& tool, const std::string& expected) {
  const auto limit = std::chrono::steady_clock::now() + std::chrono::minutes(1);
  std::string answer;
  while (answer != expected + kPrompt && std::chrono::steady_clock::now() < limit) {
    answer = answerTo(tool, "logdump tel");
  }
  EXPECT_EQ(answer, expected + kPrompt);
}

/// Has a request cut short by the end of `service` when it has reached the manager.
void expectFailure(TestProcess& tool, TestProcess& manager, TestProcess& service) {
  tool.write("logdump core\n");
  manager.readUntil("PerformCommand TraceDumpState {BasebandResetType");
  service.sendSignal(SIGKILL);
  EXPECT_EQ(tool.readUntil(kPrompt), kCore + "Failed\n" + kPrompt);
  expectInTime(tool, "");
}

}  // namespace

TEST(ManagerLife, ToolFollowsTheManagerAndTheBus) {
  const SimulatedDevice device(
      "RADIO_TYPE=1\nBUS=no\nTIMESTAMP=T\n"
      "TRACE_DUMP_STATE=silent\nTRACE_DUMP_STATE.CollectTelephonyLogs=answer\n");
  auto tool = device.start({VELLTOOL_PATH});
  EXPECT_EQ(tool.readUntil(kPrompt), kPrompt);
  EXPECT_EQ(answerTo(tool, "logdump tel"), kPrompt);
  for (int life = 0; life < 2; ++life) {
    SCOPED_TRACE(life);
    auto bus = device.serve("bus");
    auto manager = device.serve("manager");
    EXPECT_EQ(manager.readLine(), "OpenClient \"velltool\"");
    expectInTime(tool, kCollected);
    manager.write("state Stopping\n");
    manager.readUntil("Event ServerStateChange");
    expectInTime(tool, "");
    manager.write("state Started\nevent Unrelated Stopped\n");
    manager.readUntil("Event Unrelated");
    expectInTime(tool, kCollected);
    expectFailure(tool, manager, manager);
    auto successor = device.serve("manager");
    EXPECT_EQ(successor.readLine(), "OpenClient \"velltool\"");
    expectInTime(tool, kCollected);
    if (life == 0) {
      // The bus ends a connection that sends it more than 32 MiB at once.
      EXPECT_EQ(answerTo(tool, "logdump tel " + std::string(33 << 20, 'x')),
                "Telephony log collection: Failed\n" + kPrompt);
      expectInTime(tool, kCollected);
    }
    expectFailure(tool, successor, bus);
  }
  tool.write("quit\n");
  EXPECT_EQ(tool.finish().status, 0);
}

TEST(ManagerLife, TwoToolsWaitForAnAnswerLongerThanTheBusLibraryWould) {
#ifdef VELL_SANITIZED
  GTEST_SKIP() << "Takes 26 seconds; the plain build has waited.";
#endif
  const SimulatedDevice device("RADIO_TYPE=1\nTIMESTAMP=T\nTRACE_DUMP_STATE=slow:26000");
  EXPECT_EQ(device.runLine(R"(exec 4< <("$0" logdump tel); "$0" logdump core; cat <&4)"),
            (ProcessResult{0, kCore + "Success\n" + kPath + "-cd\n" + kCollected, ""}));
}
