// The manager, its helper and the bus come, go, hang and die while the tool runs.

#include "tests/end_to_end/simulated_device.h"
#include "tests/end_to_end/system_log_socket.h"

#include <gtest/gtest.h>

#include <chrono>
#include <csignal>
#include <fstream>

namespace {

const std::string kCore = "Telephony log collection with Coredump: ";
const std::string kCollected =
    "Telephony log collection: Success\n" + kCollectionPath + "log-bb-T-*\n";
const std::string kRefusal = "Server is not running. Please try after server starts.\n";
const std::string kScratch =
    "Baseband log collection: Success (Vell not running)\n"
    "Path = /private/var/wireless/Library/Logs/VellManager/DIAG.scratch\n";

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
  while (answer != expected && std::chrono::steady_clock::now() < limit) {
    answer = answerTo(tool, "logdump tel");
  }
  EXPECT_EQ(answer, expected);
}

/// Has a request cut short by the end of `service` when it has reached the manager.
void expectFailure(TestProcess& tool, TestProcess& manager, TestProcess& service) {
  tool.write("logdump core\n");
  manager.readUntil("PerformCommand TraceDumpState {BasebandResetType");
  service.sendSignal(SIGKILL);
  EXPECT_EQ(tool.readUntil(kPrompt), kCore + "Failed\n" + kPrompt);
}

}  // namespace

TEST(ManagerLife, ToolRefusesCommandsWhileNoManagerRuns) {
  const std::pair<const char*, const char*> cases[] = {
      {"MANAGER=absent", "tel"},          {"BUS=no", "core -- help"},
      {"SERVER_STATE=Stopped", "oslog"},  {"SERVER_STATE=started", "tel"},
      {"SERVER_STATE='Started '", "tel"}, {"SERVER_STATE_TYPE=integer", "tel"},
      {"SERVER_STATE_TYPE=other", "core"}};
  for (const auto& [profile, words] : cases) {
    SCOPED_TRACE(profile);
    const SimulatedDevice device(std::string("RADIO_TYPE=1\n") + profile);
    EXPECT_EQ(device.runTool(std::string("logdump ") + words), (ProcessResult{1, "", kRefusal}));
    EXPECT_EQ(device.collections(), "");
  }
}

TEST(ManagerLife, ToolFollowsStartsAndStops) {
  const SimulatedDevice device(
      "RADIO_TYPE=1\nMANAGER=absent\nTIMESTAMP=T\n"
      "TRACE_DUMP_STATE.CollectTelephonyLogsWithCoredump=silent\n");
  auto tool = device.start({VELLTOOL_PATH});
  EXPECT_EQ(tool.readUntil(kPrompt), kPrompt);
  EXPECT_EQ(answerTo(tool, "logdump tel"), kPrompt);
  auto manager = device.serve("manager");
  EXPECT_EQ(manager.readLine(), "OpenClient \"velltool\"");
  expectInTime(tool, kCollected + kPrompt);
  manager.write("event Unrelated Stopped\nstate Stopping\n");
  manager.readUntil("Event ServerStateChange");
  expectInTime(tool, kPrompt);
  manager.write("state Started\n");
  manager.readUntil("Event ServerStateChange");
  expectInTime(tool, kCollected + kPrompt);
  expectFailure(tool, manager, manager);
  expectInTime(tool, kPrompt);
  const auto successor = device.serve("manager");
  expectInTime(tool, kCollected + kPrompt);
  // The bus ends a connection that sends it more than 32 MiB at once.
  EXPECT_EQ(answerTo(tool, "logdump tel " + std::string(33 << 20, 'x')),
            "Telephony log collection: Failed\n" + kPrompt);
  expectInTime(tool, kCollected + kPrompt);
  tool.write("quit\n");
  EXPECT_EQ(tool.finish().status, 0);
}

TEST(ManagerLife, ToolOutlastsTheLossOfTheBus) {
  const SimulatedDevice device(
      "RADIO_TYPE=1\nBUS=no\nTIMESTAMP=T\nBaseband.TraceEnabled=yes\nTRACE_DUMP_STATE=silent\n"
      "TRACE_DUMP_STATE.CollectTelephonyLogs=answer\n");
  auto tool = device.start({VELLTOOL_PATH});
  tool.readUntil(kPrompt);
  EXPECT_EQ(answerTo(tool, "logdump bb"), kScratch + kPrompt);
  EXPECT_EQ(answerTo(tool, "logdump tel"), kPrompt);
  for (int life = 0; life < 2; ++life) {
    auto bus = device.serve("bus");
    auto manager = device.serve("manager");
    expectInTime(tool, kCollected + kPrompt);
    expectFailure(tool, manager, bus);
    expectInTime(tool, kPrompt);
  }
}

TEST(ManagerLife, OnlyOneRequestWaitsForABusThatNeverGreets) {
  const SimulatedDevice device("RADIO_TYPE=1\nBUS=no\nBaseband.TraceEnabled=yes");
  const auto bus = device.serve("bus");
  bus.sendSignal(SIGSTOP);
  for (const auto& address : {std::string(), std::string("nonsense"), device.busAddress(),
                              std::string("tcp:host=127.0.0.1,port=1")}) {
    SCOPED_TRACE(address);
    const auto* line =
        "DBUS_SYSTEM_BUS_ADDRESS=$1 exec \"$0\" logdump bb -- logdump bb -- logdump tel";
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(device.runLine(line, {address}), (ProcessResult{1, kScratch + kScratch, kRefusal}));
    // The greeting is waited for by one request for 5 seconds, by no other.
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(13));
  }
}

TEST(ManagerLife, TwoToolsWaitForAnAnswerLongerThanTheBusLibraryWould) {
#ifdef VELL_SANITIZED
  GTEST_SKIP() << "Takes 26 seconds; the plain build has waited.";
#endif
  const SimulatedDevice device("RADIO_TYPE=1\nTIMESTAMP=T\nTRACE_DUMP_STATE=slow:26000");
  EXPECT_EQ(
      device.runLine(R"(exec 4< <("$0" logdump tel); "$0" logdump core; cat <&4)"),
      (ProcessResult{0, kCore + "Success\n" + kCollectionPath + "log-bb-T-cd\n" + kCollected, ""}));
}

TEST(SavedTraces, CountAsNoneWhenUnreadable) {
  const SimulatedDevice device("RADIO_TYPE=1\nMANAGER=absent");
  SystemLogSocket log(device.root());
  const auto settings = device.root() / "var/lib/vell/traces.conf";
  const std::string path = settings;
  const ProcessResult notFound = {1, "Baseband log collection: Failed\n", ""};

  std::ofstream(settings) << "Baseband.TraceEnabled 'yes'\nnonsense\n";
  EXPECT_EQ(device.runLine("printf 'logdump bb\\nlogdump bb\\n' | \"$0\"").output,
            kPrompt + notFound.output + kPrompt + notFound.output + kPrompt);
  EXPECT_EQ(log.messages(),
            (std::vector{path + ":1: not a KEY=value line", path + ":2: not a KEY=value line"}));

  std::filesystem::remove(settings);
  EXPECT_EQ(device.runTool("logdump bb"), notFound);
  std::filesystem::create_directory(settings);
  EXPECT_EQ(device.runTool("logdump bb"), notFound);
  EXPECT_EQ(log.messages(), std::vector{path + ": not a file"});
}
