#include "logdump/logdump_command.h"

#include "logdump/os_log_context.h"
#include "platform/manager_names.h"
#include "tests/in_process/device.h"
#include "tests/unit/console.h"
#include "tool/server_state.h"
#include "tool/vell_shell.h"

#include <gtest/gtest.h>

namespace {

/// What a run of the tool with some words showed.
struct Run {
  bool result;
  std::string output;
  std::string errors;
};

Run runTool(const std::string& profile, std::list<std::string> words) {
  in_process::startDevice("RADIO_TYPE=1\n" + profile);
  words.push_front("velltool");
  const Console console;
  const bool result = VellShell().run(words);
  return {result, console.output(), console.errors()};
}

MessageDict dict(std::initializer_list<MessageDict::Entry> entries) {
  MessageDict made;
  for (const auto& [key, value] : entries) {
    made.set(key, value);
  }
  return made;
}

}  // namespace

TEST(LogdumpCommand, AsksForTheVendorOfTheRadioOnceForCoreDumps) {
  const std::string output =
      "Telephony log collection with Coredump: Success\nPath = "
      "/private/var/wireless/Library/Logs/Faultkeeper/Baseband/log-bb-T-cd\n";
  EXPECT_EQ(runTool("TIMESTAMP=T", {"logdump", "core"}).output, output);
  EXPECT_EQ(runTool("TIMESTAMP=T\nRADIO_VENDOR=2", {"logdump", "core"}).output, output);
}

TEST(VellShell, NamesItsRootAfterTheProgramAndItsClientAfterTheTool) {
  auto& device = in_process::startDevice("");
  device.programName = "mytool";
  const Console console("cd logdump\nquit\n");
  EXPECT_TRUE(VellShell().run({"/opt/other"}));
  EXPECT_EQ(console.output(), "(/mytool)>> (/mytool/logdump)>> ");
  EXPECT_EQ(device.clientCalls, (std::vector<std::string>{"CreateManager velltool velltool.queue",
                                                          "RegisterEventHandler ServerStateChange",
                                                          "EventsOff", "EventsOn"}));
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
