// What the manager says of its traces is read twice, by two lists of words that differ on purpose.

#include "logdump/logdump_command.h"
#include "logdump/system_logs_trace.h"
#include "logdump/trace_flag.h"
#include "platform/work_queue.h"
#include "tests/in_process/device.h"

#include <gtest/gtest.h>

namespace {

bool isModeThree(const std::string& value) {
  in_process::startDevice("SystemLogs.TraceMode='" + value + "'");
  const auto queue = WorkQueue::create("test");
  const auto manager = vell::client::CreateManager("test", queue);
  const auto node = LogdumpCommand::create("logdump", {}, manager, queue);
  return isSystemLogsTraceModeThree(dynamic_cast<LogdumpCommand&>(*node));
}

}  // namespace

TEST(TraceValues, AreReadAsAFlagAndAsAMode) {
  enum class Flag { on, off, unchanged };
  const struct {
    std::string value;
    Flag flag;
    bool modeThree;
  } cases[] = {
      {"false", Flag::off, false},     {"OFF", Flag::off, false},
      {"No", Flag::off, false},        {"true", Flag::on, false},
      {"On", Flag::on, false},         {"yes", Flag::on, false},
      {"FULL", Flag::on, false},       {"lite", Flag::on, false},
      {"0", Flag::off, false},         {"-0", Flag::off, false},
      {"0x0", Flag::off, false},       {"1", Flag::on, false},
      {"3", Flag::on, true},           {"0x3", Flag::on, true},
      {"03", Flag::on, true},          {"+3", Flag::on, true},
      {" \t3", Flag::on, true},        {"-3", Flag::on, false},
      {"010", Flag::on, false},        {"2147483647", Flag::on, false},
      {"3 ", Flag::unchanged, false},  {"3x", Flag::unchanged, false},
      {"09", Flag::unchanged, false},  {"2147483648", Flag::unchanged, false},
      {"", Flag::unchanged, false},    {"abc", Flag::unchanged, false},
      {"on ", Flag::unchanged, false}, {"Unknown", Flag::unchanged, false},
  };
  for (const auto& [value, expected, modeThree] : cases) {
    SCOPED_TRACE("'" + value + "'");
    for (const bool before : {false, true}) {
      bool flag = before;
      parseTraceFlag(value, flag);
      EXPECT_EQ(flag, expected == Flag::unchanged ? before : expected == Flag::on);
    }
    EXPECT_EQ(isModeThree(value), modeThree);
  }
}
