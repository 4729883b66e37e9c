#include "logdump/logdump_command.h"

#include "logdump/os_log_context.h"
#include "tests/help_text.h"
#include "tests/in_process/device.h"
#include "tests/in_process/log_device.h"
#include "tests/unit/console.h"
#include "tool/vell_shell.h"

#include <gtest/gtest.h>

TEST(LogdumpCommand, IsFoundBelowARootOfTheProgramsName) {
  in_process::device.programName = "mytool";
  const Console console("cd logdump\nhelp\nquit\n");
  EXPECT_TRUE(VellShell().run({"/opt/other"}));
  const auto* entries =
      "\t              bb  -  [nocompress|tar.gz|tar] <reason> collect baseband logs only\n\n"
      "\t            core  -  [nocompress|tar.gz|tar] [nonui] <reason> collect telephony logs with "
      "coredump\n\n"
      "\t           oslog  -  [history size] [output txt file path] -p <process1 process2..> "
      "-i <imagePath1 imagePath2..> collect oslog to txt\n\n"
      "\t             tel  -  [nocompress|tar.gz|tar] [nonui] <reason> collect telephony logs\n\n";
  EXPECT_EQ(console.output(), "(/mytool)>> (/mytool/logdump)>> " + helpText("logdump", entries) +
                                  "(/mytool/logdump)>> ");
  EXPECT_EQ(in_process::device.clientCalls,
            (std::vector<std::string>{"CreateManager velltool velltool.queue",
                                      "RegisterEventHandler ServerStateChange", "EventsOff",
                                      "EventsOn"}));
  EXPECT_EQ(in_process::logDevice.longestWait, std::chrono::milliseconds(500));
}

TEST(OsLogContext, IsMadeOnce) {
  EXPECT_EQ(&GetOsLogContext(), &GetOsLogContext());
  EXPECT_EQ(GetOsLogContext().subsystem + " " + GetOsLogContext().category, "org.velltool global");
}
