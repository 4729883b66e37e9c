// The manager and the bus come, go, hang and die while the tool runs.

#include "tests/end_to_end/simulated_device.h"

#include <gtest/gtest.h>

#include <chrono>
#include <csignal>

namespace {

using namespace std::chrono_literals;

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
  const auto limit = std::chrono::steady_clock::now() + 1min;
  std::string answer;
  while (answer != expected + kPrompt && std::chrono::steady_clock::now() < limit) {
    answer = answerTo(tool, "logdump tel");
  }
  EXPECT_EQ(answer, expected + kPrompt);
}

/// Has a request of `command` cut short by the end of `service` when `action` has reached the
/// manager.
void expectFailure(TestProcess& tool, const std::string& command, TestProcess& manager,
                   const std::string& action, TestProcess& service, const std::string& answer) {
  tool.write(command + "\n");
  manager.readUntil(action);
  service.sendSignal(SIGKILL);
  EXPECT_EQ(tool.readUntil(kPrompt), answer + kPrompt);
  expectInTime(tool, "");
}

}  // namespace

TEST(ManagerLife, ToolFollowsTheManagerAndTheBus) {
  const SimulatedDevice device(
      "RADIO_TYPE=1\nBUS=no\nTIMESTAMP=T\nBaseband.TraceEnabled=yes\n"
      "TRACE_DUMP_STATE=silent\nTRACE_DUMP_STATE.CollectTelephonyLogs=answer\n");
  const auto start = std::chrono::steady_clock::now();
  auto tool = device.start({VELLTOOL_PATH});
  EXPECT_EQ(tool.readUntil(kPrompt), kPrompt);
  // The first half second is the manager's, to tell its state.
  const auto taken = std::chrono::steady_clock::now() - start;
  EXPECT_TRUE(taken >= 500ms && taken < 10s) << taken / 1ms;
  EXPECT_EQ(answerTo(tool, "logdump bb"),
            "Baseband log collection: Success (Vell not running)\n"
            "Path = /private/var/wireless/Library/Logs/VellManager/DIAG.scratch\n" +
                kPrompt);
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
    expectFailure(tool, "logdump core", manager, "CollectTelephonyLogsWithCoredump", manager,
                  "Telephony log collection with Coredump: Failed\n");
    auto successor = device.serve("manager");
    EXPECT_EQ(successor.readLine(), "OpenClient \"velltool\"");
    expectInTime(tool, kCollected);
#ifndef VELL_SANITIZED  // A sanitizer takes up to 20 s for such a line.
    if (life == 0) {
      // The bus ends a connection that sends it more than 32 MiB at once.
      EXPECT_EQ(answerTo(tool, "logdump tel " + std::string(33 << 20, 'x')),
                "Telephony log collection: Failed\n" + kPrompt);
      expectInTime(tool, kCollected);
    }
#endif
    expectFailure(tool, "logdump bb", successor, "CollectBasebandLogs", bus,
                  "Baseband log collection: Failed\n");
  }
  EXPECT_TRUE(tool.wroteEachLineAtOnce());
  tool.write("quit\n");
  EXPECT_EQ(tool.finish().status, 0);
}
