// What the manager says of its traces is read twice, by two lists of words that differ on purpose.

#include "logdump/logdump_command.h"
#include "logdump/system_logs_trace.h"
#include "logdump/trace_flag.h"
#include "tests/in_process/device.h"

#include <gtest/gtest.h>

#include <optional>
#include <tuple>
#include <vector>

TEST(TraceValues, AreReadAsAFlagAndAsAMode) {
  const auto node = LogdumpCommand::create("logdump", {}, nullptr, {});
  // The flag, unless it stays as it is; and whether it is mode 3.
  const std::tuple<std::optional<bool>, std::vector<const char*>, bool> cases[] = {
      {false, {"false", "OFF", "No", "0", "-0", "0x0"}, false},
      {true, {"true", "On", "yes", "FULL", "lite", "1", "-3", "010", "2147483647"}, false},
      {true, {"3", "0x3", "03", "+3", " \t3"}, true},
      {std::nullopt, {"3 ", "3x", "09", "2147483648", "", "abc", "on ", "Unknown"}, false}};
  for (const auto& [expected, values, modeThree] : cases) {
    for (const std::string value : values) {
      SCOPED_TRACE("'" + value + "'");
      for (const bool before : {false, true}) {
        bool flag = before;
        parseTraceFlag(value, flag);
        EXPECT_EQ(flag, expected.value_or(before));
      }
      in_process::device.traceProperty = value;
      EXPECT_EQ(isSystemLogsTraceModeThree(dynamic_cast<LogdumpCommand&>(*node)), modeThree);
    }
  }
}
