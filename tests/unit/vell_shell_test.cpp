#include "tool/vell_shell.h"

#include "logdump/logdump_command.h"
#include "platform/manager_names.h"
#include "tests/in_process/device.h"
#include "tests/in_process/log_device.h"
#include "tests/unit/console.h"
#include "tool/server_state.h"

#include <gtest/gtest.h>

TEST(VellShell, FollowsTheManagerBeforeItPromptsUnderTheProgramsName) {
  in_process::device.programName = "mytool";
  const Console console("cd logdump\nbb\nquit\n");
  EXPECT_TRUE(VellShell().run({"/opt/other"}));
  EXPECT_EQ(console.output(),
            "(/mytool)>> (/mytool/logdump)>> Baseband logs are not enabled\n"
            "(/mytool/logdump)>> ");
  EXPECT_EQ(in_process::device.clientCalls,
            (std::vector<std::string>{"CreateManager velltool velltool.queue",
                                      "RegisterEventHandler ServerStateChange", "EventsOff",
                                      "EventsOn"}));
  EXPECT_EQ(in_process::logDevice.longestWait, std::chrono::milliseconds(500));

  const auto event = [](const char* key, MessageDict::Value state) {
    return MessageDict::fromEntries({{key, std::move(state)}});
  };
  const std::pair<const char*, MessageDict> others[] = {
      {"no dictionary", MessageDict::notADictionary()},
      {"no key", event("State", "Started")},
      {"another type", event(vell::kKeyServerState, true)},
      {"another state", event(vell::kKeyServerState, "started")}};
  // Of two values of a key the later one counts.
  const auto started = MessageDict::fromEntries({{"a", true},
                                                 {"a", false},
                                                 {vell::kKeyServerState, false},
                                                 {vell::kKeyServerState, "Started"}});
  EXPECT_EQ(started.entries().size(), 2U);
  for (const auto& [other, payload] : others) {
    in_process::device.eventHandler(started, {});
    EXPECT_TRUE(IsServerRunning()) << other;
    in_process::device.eventHandler(payload, {});
    EXPECT_FALSE(IsServerRunning()) << other;
  }
}

TEST(OsLogContext, IsTheSameOnEveryCall) {
  EXPECT_EQ(&GetOsLogContext(), &GetOsLogContext());
  EXPECT_EQ(GetOsLogContext().subsystem + " " + GetOsLogContext().category, "org.velltool global");
}
