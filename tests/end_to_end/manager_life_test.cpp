// The manager, its helper and the bus come, go, hang and die while the tool runs.

#include "tests/end_to_end/simulated_device.h"
#include "tests/end_to_end/system_log_socket.h"

#include <gtest/gtest.h>

#include <chrono>
#include <csignal>
#include <fstream>

namespace {

using Lines = std::vector<std::string>;

const std::string kPrompt = "(/velltool)>> ";
const std::string kFailed = "Telephony log collection: Failed\n" + kPrompt;
const std::string kCollected =
    "Telephony log collection: Success\n"
    "Path = /private/var/wireless/Library/Logs/Faultkeeper/Baseband/log-bb-T-*\n" +
    kPrompt;
const std::string kRefusal = "Server is not running. Please try after server starts.\n";
const std::string kScratch =
    "Baseband log collection: Success (Vell not running)\n"
    "Path = /private/var/wireless/Library/Logs/VellManager/DIAG.scratch\n";

/// Types a command at the tool's prompt and gives all that it answers with, the next prompt last.
std::string answerTo(TestProcess& tool, const std::string& command) {
  tool.write(command + "\n");
  return tool.readUntil(kPrompt);
}

/// Types `command` until the tool, which follows the manager on its own time, answers `expected`.
void expectInTime(TestProcess& tool, const std::string& command, const std::string& expected) {
  const auto limit = std::chrono::steady_clock::now() + std::chrono::minutes(1);
  std::string answer;
  while (answer != expected && std::chrono::steady_clock::now() < limit) {
    answer = answerTo(tool, command);
  }
  EXPECT_EQ(answer, expected);
}

/// Reads the lines of a service until one starts with `text`.
void awaitLine(TestProcess& service, const std::string& text) {
  while (!service.readLine().starts_with(text)) {
  }
}

TestProcess startShell(const SimulatedDevice& device) {
  auto tool = device.startTool({});
  EXPECT_EQ(tool.readUntil(kPrompt), kPrompt);
  return tool;
}

}  // namespace

TEST(ManagerLife, IsRefusedWithoutAManager) {
  const struct {
    std::string profile;
    Lines words;
  } cases[] = {
      {"MANAGER=absent", {"logdump", "tel"}},
      {"BUS=no", {"logdump", "core", "--", "help"}},
      {"SERVER_STATE=Stopped", {"logdump", "oslog"}},
      {"SERVER_STATE=started", {"logdump", "tel"}},
      {"SERVER_STATE_TYPE=integer", {"logdump", "tel"}},
      {"SERVER_STATE_TYPE=other", {"logdump", "core"}},
  };
  for (const auto& [profile, words] : cases) {
    SCOPED_TRACE(profile);
    const SimulatedDevice device("RADIO_TYPE=1\n" + profile);
    EXPECT_EQ(device.runTool(words), (ProcessResult{1, "", kRefusal}));
    EXPECT_TRUE(device.collections().empty());
  }
}

TEST(ManagerLife, IsFollowedThroughStartsAndStops) {
  const SimulatedDevice device("RADIO_TYPE=1\nMANAGER=absent\nTIMESTAMP=T");
  auto tool = startShell(device);
  EXPECT_EQ(answerTo(tool, "logdump tel"), kPrompt);
  {
    auto manager = device.serve("manager");
    EXPECT_EQ(manager.readLine(), "OpenClient \"velltool\"");
    expectInTime(tool, "logdump tel", kCollected);
    manager.write("event Unrelated Stopped\nstate Stopping\n");
    awaitLine(manager, "Event ServerStateChange");
    expectInTime(tool, "logdump tel", kPrompt);
    manager.write("state Started\n");
    awaitLine(manager, "Event ServerStateChange");
    expectInTime(tool, "logdump tel", kCollected);
    manager.sendSignal(SIGKILL);
    static_cast<void>(manager.finish());
  }
  expectInTime(tool, "logdump tel", kPrompt);
  auto manager = device.serve("manager");
  expectInTime(tool, "logdump tel", kCollected);
  tool.write("quit\n");
  EXPECT_EQ(tool.finish().status, 0);
}

TEST(ManagerLife, AnswersARequestThatItsDeathCutsShort) {
  const std::string healthy =
      "RADIO_TYPE=1\nMANAGER=absent\nTIMESTAMP=T\nBaseband.TraceEnabled=yes\n";
  const struct {
    std::string command;
    std::string fault;
    std::string requestToDieIn;
    std::string answer;
  } cases[] = {
      {"logdump core", "TRACE_DUMP_STATE=silent", "PerformCommand TraceDumpState",
       "Telephony log collection with Coredump: Failed\n" + kPrompt},
      {"logdump tel", "GET_TRACE_PROPERTY=silent", "PerformCommand GetTraceProperty", kFailed},
      {"logdump bb", "GET_TRACE_PROPERTY.SystemLogs.TraceMode=silent",
       "PerformCommand GetTraceProperty {TraceName: s \"SystemLogs\"", kScratch + kPrompt},
      {"logdump bb", "GET_TRACE_PROPERTY=silent", "PerformCommand GetTraceProperty",
       "Baseband log collection: Failed\n" + kPrompt},
      {"logdump bb", "TRACE_DUMP_STATE=silent", "PerformCommand TraceDumpState",
       "Baseband log collection: Failed\n" + kPrompt},
  };
  for (const auto& [command, fault, requestToDieIn, answer] : cases) {
    SCOPED_TRACE(command + " with " + fault);
    const SimulatedDevice device(healthy + fault);
    auto manager = device.serve("manager");
    auto tool = startShell(device);
    tool.write(command + "\n");
    awaitLine(manager, requestToDieIn);
    manager.sendSignal(SIGKILL);
    EXPECT_EQ(tool.readUntil(kPrompt), answer);

    std::ofstream(device.root() / "etc/vell/device.conf") << healthy;
    auto successor = device.serve("manager");
    expectInTime(tool, "logdump tel", kCollected);
  }
}

TEST(ManagerLife, OutlastsTheLossOfTheBus) {
  const SimulatedDevice device(
      "RADIO_TYPE=1\nBUS=no\nTIMESTAMP=T\nBaseband.TraceEnabled=yes\nTRACE_DUMP_STATE=silent\n"
      "TRACE_DUMP_STATE.CollectTelephonyLogs=answer\n");
  auto tool = startShell(device);
  EXPECT_EQ(answerTo(tool, "logdump bb"), kScratch + kPrompt);
  EXPECT_EQ(answerTo(tool, "logdump tel"), kPrompt);
  for (int life = 0; life < 2; ++life) {
    SCOPED_TRACE(life);
    auto bus = device.serve("bus");
    auto manager = device.serve("manager");
    expectInTime(tool, "logdump tel", kCollected);
    tool.write("logdump core\n");
    awaitLine(manager, "PerformCommand TraceDumpState {BasebandResetType");
    bus.sendSignal(SIGKILL);
    EXPECT_EQ(tool.readUntil(kPrompt),
              "Telephony log collection with Coredump: Failed\n" + kPrompt);
    expectInTime(tool, "logdump tel", kPrompt);
  }
}

TEST(ManagerLife, IsNotWaitedForOnABusThatLeadsNowhere) {
  const SimulatedDevice device("RADIO_TYPE=1\nBUS=no\nBaseband.TraceEnabled=yes");
  for (const auto* address :
       {"", "nonsense", "unix:path=/no/such/socket", "tcp:host=127.0.0.1,port=1"}) {
    SCOPED_TRACE(address);
    auto tool = device.start(
        {{"/bin/sh", "-c", R"(DBUS_SYSTEM_BUS_ADDRESS=$1 exec "$0" logdump bb -- logdump tel)",
          VELLTOOL_PATH, address},
         {},
         "",
         false});
    EXPECT_EQ(tool.finish(), (ProcessResult{1, kScratch, kRefusal}));
  }
}

TEST(ManagerLife, IsNotWaitedForOnABusThatNeverGreets) {
  const SimulatedDevice device("RADIO_TYPE=1\nBUS=no\nBaseband.TraceEnabled=yes");
  auto bus = device.serve("bus");
  bus.sendSignal(SIGSTOP);
  EXPECT_EQ(device.runTool({"logdump", "bb"}), (ProcessResult{0, kScratch, ""}));
}

TEST(ManagerLife, IsWaitedForLongerThanTheBusLibraryWould) {
  const SimulatedDevice device("RADIO_TYPE=1\nTIMESTAMP=T\nTRACE_DUMP_STATE=slow:26000");
  EXPECT_EQ(device.runTool({"logdump", "tel"}).output + kPrompt, kCollected);
}

TEST(ManagerLife, AnswersEachOfTwoToolsForItself) {
  const SimulatedDevice device(
      "RADIO_TYPE=1\nTIMESTAMP=T\nMANAGER=absent\nTRACE_DUMP_STATE=slow:50");
  auto manager = device.serve("manager");
  auto first = startShell(device);
  auto second = startShell(device);
  for (int round = 0; round < 5; ++round) {
    first.write("logdump tel first\n");
    second.write("logdump core second\n");
    EXPECT_EQ(first.readUntil(kPrompt), kCollected);
    EXPECT_EQ(second.readUntil(kPrompt),
              "Telephony log collection with Coredump: Success\n"
              "Path = /private/var/wireless/Library/Logs/Faultkeeper/Baseband/log-bb-T-cd\n" +
                  kPrompt);
  }
}

TEST(HelperLife, IsWaitedForNoLongerThanItsTimeLimit) {
  const SimulatedDevice device(
      "RADIO_TYPE=1\nMANAGER=absent\nINTERNAL_BUILD=yes\nBaseband.TraceEnabled=yes\n"
      "HELPER_ANSWER=silent");
  const auto start = std::chrono::steady_clock::now();
  EXPECT_EQ(device.runTool({"logdump", "bb"}), (ProcessResult{0, kScratch, ""}));
  const auto taken = std::chrono::steady_clock::now() - start;
  EXPECT_GE(taken, std::chrono::milliseconds(500 + 1500));
  EXPECT_LT(taken, std::chrono::seconds(10));
  EXPECT_EQ(device.requests("helper"), Lines{"Perform 4 TidewellStatus {Timeout: x 1500}"});
}

TEST(SavedTraces, CountAsNoneWhenTheyCannotBeRead) {
  const SimulatedDevice device("RADIO_TYPE=1\nMANAGER=absent\nJOURNAL=no");
  SystemLogSocket log(device.root());
  const auto settings = device.root() / "var/lib/vell/traces.conf";
  const ProcessResult notFound = {1, "Baseband log collection: Failed\n", ""};

  std::ofstream(settings) << "Baseband.TraceEnabled 'yes'\nnonsense\n";
  EXPECT_EQ(device.runTool({}, "logdump bb\nlogdump bb\n").output,
            kPrompt + notFound.output + kPrompt + notFound.output + kPrompt);
  EXPECT_EQ(log.messages(), (Lines{settings.string() + ":1: not a KEY=value line",
                                   settings.string() + ":2: not a KEY=value line"}));

  std::filesystem::remove(settings);
  EXPECT_EQ(device.runTool({"logdump", "bb"}), notFound);
  EXPECT_EQ(log.messages(), Lines{});

  std::filesystem::create_directory(settings);
  EXPECT_EQ(device.runTool({"logdump", "bb"}), notFound);
  EXPECT_EQ(log.messages(), Lines{settings.string() + ": not a file"});
}
