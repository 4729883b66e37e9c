#include "logdump/logdump_command.h"

#include "logdump/os_log_context.h"
#include "platform/manager_names.h"
#include "tests/in_process/device.h"
#include "tests/unit/console.h"
#include "tool/server_state.h"
#include "tool/vell_shell.h"

#include <gtest/gtest.h>

namespace {

const std::string kFolder = "/private/var/wireless/Library/Logs/Faultkeeper/Baseband/";

/// What a run of the tool with some words showed, and what it asked the manager.
struct Run {
  bool result;
  std::string output;
  std::string errors;
  std::vector<in_process::Request> requests;
};

Run runTool(const std::string& profile, std::list<std::string> words) {
  auto& device = in_process::startDevice("RADIO_TYPE=1\n" + profile);
  words.push_front("velltool");
  const Console console;
  const bool result = VellShell().run(words);
  return {result, console.output(), console.errors(), device.requests()};
}

MessageDict dict(std::initializer_list<MessageDict::Entry> entries) {
  MessageDict made;
  for (const auto& [key, value] : entries) {
    made.set(key, value);
  }
  return made;
}

const in_process::Request kModeQuery = {
    "GetTraceProperty", dict({{"TraceName", "SystemLogs"}, {"TracePropertyName", "TraceMode"}})};

in_process::Request telephonyRequest(const std::string& reason, std::int64_t mode, bool nonui) {
  auto arguments = dict({{"TraceAction", "CollectTelephonyLogs"},
                         {"TraceDumpStateReason", reason},
                         {"TraceDumpStatePerformCompression", mode}});
  if (nonui) {
    arguments.set("TraceUserConfirmation", false);
  }
  return {"TraceDumpState", arguments};
}

in_process::Request coreRequest(const std::string& reason, std::int64_t mode, bool nonui) {
  auto arguments = dict({{"BasebandResetType", "Hard"},
                         {"BasebandResetSubType", "OtherErrors"},
                         {"TraceAction", "CollectTelephonyLogsWithCoredump"},
                         {"BasebandResetReason", reason},
                         {"TraceDumpStatePerformCompression", mode}});
  if (nonui) {
    arguments.set("TraceUserConfirmation", false);
  }
  return {"TraceDumpState", arguments};
}

constexpr const char* kByUser = "[velltool] User triggered";

}  // namespace

TEST(LogdumpCommand, CollectsTelephonyLogs) {
  const std::string success = "Telephony log collection: Success\n";
  const struct {
    std::string profile;
    std::list<std::string> words;
    in_process::Request request;
    std::string output;
  } cases[] = {
      {"", {}, telephonyRequest(kByUser, 0, false), success + "Path = " + kFolder + "log-bb-T-*\n"},
      {"",
       {"nonui", "tar"},
       telephonyRequest(kByUser, 2, true),
       success + "Path = " + kFolder + "log-bb-T.tar\n"},
      {"COMPRESSION_SUPPORTED=no",
       {"TAR.GZ", "NonUI", "my", "why"},
       telephonyRequest("[velltool] my", 1, true),
       success + "Path = " + kFolder + "log-bb-T.tar.gz\n"},
      {"SystemLogs.TraceMode=0x3",
       {"tar.gz"},
       telephonyRequest(kByUser, 0, false),
       success + "Path = " + kFolder + "log-bb-T-*\n"},
      {"DEFAULT_COMPRESSION=7",
       {"why", "tar"},
       telephonyRequest("[velltool] why", 7, false),
       success + "Path = " + kFolder + "log-bb-T-*\n"},
      {"TIMESTAMP_TYPE=missing",
       {},
       telephonyRequest(kByUser, 0, false),
       success + "Path = " + kFolder + "log-bb--*\n"},
      {"TIMESTAMP_TYPE=integer",
       {"tar"},
       telephonyRequest(kByUser, 2, false),
       success + "Path = " + kFolder + "log-bb-.tar\n"},
      {"TRACE_DUMP_STATE=no-dictionary", {}, telephonyRequest(kByUser, 0, false), success},
      {"TRACE_DUMP_STATE=status:-1",
       {},
       telephonyRequest(kByUser, 0, false),
       "Telephony log collection: Failed\n"},
      {"TRACE_DUMP_STATE=die\nGET_TRACE_PROPERTY=no-dictionary",
       {""},
       telephonyRequest("[velltool] ", 0, false),
       "Telephony log collection: Failed\n"},
  };
  for (const auto& testCase : cases) {
    SCOPED_TRACE(testCase.profile + " -> " + testCase.output);
    auto words = testCase.words;
    words.insert(words.begin(), {"logdump", "tel"});
    const auto run = runTool("TIMESTAMP=T\n" + testCase.profile, words);
    EXPECT_TRUE(run.result);
    EXPECT_EQ(run.output, testCase.output);
    EXPECT_EQ(run.requests, (std::vector{kModeQuery, testCase.request}));
  }
}

TEST(LogdumpCommand, CollectsTelephonyLogsWithACoreDump) {
  const std::string success = "Telephony log collection with Coredump: Success\n";
  const struct {
    std::string profile;
    std::list<std::string> words;
    in_process::Request request;
    std::string output;
  } cases[] = {
      {"", {}, coreRequest(kByUser, 0, false), success + "Path = " + kFolder + "log-bb-T-cd\n"},
      // The vendor has been asked for once, and that answer stays.
      {"RADIO_VENDOR=2",
       {},
       coreRequest(kByUser, 0, false),
       success + "Path = " + kFolder + "log-bb-T-cd\n"},
      {"SystemLogs.TraceMode=3\nDEFAULT_COMPRESSION=tar.gz",
       {"nonui", "w"},
       coreRequest("[velltool] w", 1, true),
       success + "Path = " + kFolder + "log-bb-T.tar.gz\n"},
      {"TRACE_DUMP_STATE=status:5",
       {"tar"},
       coreRequest(kByUser, 2, false),
       "Telephony log collection with Coredump: Failed\n"},
  };
  for (const auto& testCase : cases) {
    SCOPED_TRACE(testCase.profile + " -> " + testCase.output);
    auto words = testCase.words;
    words.insert(words.begin(), {"logdump", "core"});
    const auto run = runTool("TIMESTAMP=T\n" + testCase.profile, words);
    EXPECT_TRUE(run.result);
    EXPECT_EQ(run.output, testCase.output);
    EXPECT_EQ(run.requests, (std::vector{testCase.request}));
  }
}

TEST(LogdumpCommand, RefusesAllButBasebandLogsWhileTheManagerIsDown) {
  const std::string refusal = "Server is not running. Please try after server starts.\n";
  for (const auto* word : {"tel", "core", "oslog"}) {
    const auto run = runTool("MANAGER=absent", {"logdump", word, "--", "logdump", "tel"});
    EXPECT_FALSE(run.result) << word;
    EXPECT_EQ(run.output, "") << word;
    EXPECT_EQ(run.errors, refusal) << word;
  }
  const auto run = runTool("MANAGER=absent", {"logdump", "bb"});
  EXPECT_FALSE(run.result);
  EXPECT_EQ(run.output, "Baseband log collection: Failed\n");
  EXPECT_EQ(run.errors, "");
}

TEST(VellShell, NamesItsRootAfterTheProgramAndItsClientAfterTheTool) {
  auto& device = in_process::startDevice("");
  device.programName = "mytool";
  const Console console("cd logdump\nquit\n");
  EXPECT_TRUE(VellShell().run({"/opt/other"}));
  EXPECT_EQ(console.output(), "(/mytool)>> (/mytool/logdump)>> ");
  EXPECT_EQ(device.clientNames, std::vector<std::string>{"velltool"});
  EXPECT_EQ(device.queueLabels, std::vector<std::string>{"velltool.queue"});
}

TEST(VellShell, ShowsTheHelpOfTheHandlers) {
  const auto run = runTool("", {"logdump"});
  EXPECT_FALSE(run.result);
  EXPECT_EQ(
      run.output,
      "\nOptions for command '\x1b[32mlogdump\x1b[39m':\n\n"
      "\t              bb  -  [nocompress|tar.gz|tar] <reason> collect baseband logs only\n\n"
      "\t            core  -  [nocompress|tar.gz|tar] [nonui] <reason> collect telephony logs "
      "with coredump\n\n"
      "\t           oslog  -  [history size] [output txt file path] -p <process1 process2..> "
      "-i <imagePath1 imagePath2..> collect oslog to txt\n\n"
      "\t             tel  -  [nocompress|tar.gz|tar] [nonui] <reason> collect telephony "
      "logs\n\n"
      "\t              cd  -  <sub-command>\n"
      "\t            help\n"
      "\t            back\n"
      "\t            quit\n\n");
}

TEST(ServerState, FollowsTheLatestEventOfItsName) {
  static_cast<void>(runTool("", {"help"}));
  EXPECT_TRUE(IsServerRunning());
  const MessageDict started = dict({{"ServerState", "Started"}});
  const MessageDict others[] = {
      dict({{"ServerState", "started"}}),       dict({{"ServerState", "Started "}}),
      dict({{"ServerState", std::int64_t{1}}}), dict({{"serverState", "Started"}}),
      dict({{"ServerState", "Stopped"}}),       MessageDict::notADictionary(),
  };
  for (const auto& other : others) {
    in_process::sendEvent(vell::kEventServerStateChange, other);
    EXPECT_FALSE(IsServerRunning());
    in_process::sendEvent("AnotherEvent", started);
    EXPECT_FALSE(IsServerRunning());
    in_process::sendEvent(vell::kEventServerStateChange, started);
    EXPECT_TRUE(IsServerRunning());
  }
}

TEST(OsLogContext, IsMadeOnce) {
  EXPECT_EQ(&GetOsLogContext(), &GetOsLogContext());
  EXPECT_EQ(GetOsLogContext().subsystem, "org.velltool");
  EXPECT_EQ(GetOsLogContext().category, "global");
}
