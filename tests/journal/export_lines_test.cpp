// What one line of the export says of an entry of the journal.

#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using namespace std::string_literals;

const std::string kShown = "2021-05-04 13:07:21 +0000 ";
const std::string kNothing = kShown + "0x00000 0x0 0 (null)((null)):(null) [(null)] ";

struct LineCase {
  std::vector<std::pair<std::string, std::string>> fields;
  std::string line;
};

// clang-format off

TEST(ExportLines, ShowEachFieldFromWhereItIs) {
  const std::string longText(8 << 20, 'x');
  const LineCase cases[] = {
      {{{"MESSAGE", "all"}, {"_SOURCE_REALTIME_TIMESTAMP", "1620133640000000"}, {"TID", "6699"}, {"_PID", "42"},
        {"SYSLOG_PID", "43"}, {"VELL_ACTIVITY_ID", "1f"}, {"_EXE", "/usr/bin/linkd"}, {"_COMM", "comm"},
        {"SYSLOG_IDENTIFIER", "ident"}, {"VELL_SENDER_IMAGE_PATH", "/lib/libradio.so"}, {"VELL_SUBSYSTEM", "org.vell"},
        {"_SYSTEMD_UNIT", "linkd.service"}, {"VELL_CATEGORY", "calls"}},
       "2021-05-04 13:07:20 +0000 0x01a2b 0x1f 42 linkd(libradio.so):org.vell [calls] all\n"},
      {{{"MESSAGE", "second"}, {"_PID", "42"}, {"_EXE", "/usr/bin/linkd"}, {"SYSLOG_IDENTIFIER", "ident"},
        {"_SYSTEMD_UNIT", "linkd.service"}},
       kShown + "0x0002a 0x0 42 linkd(linkd):linkd.service [ident] second\n"},
      {{{"MESSAGE", "third"}, {"SYSLOG_PID", "43"}, {"_COMM", "comm"}, {"SYSLOG_IDENTIFIER", "ident"}},
       kShown + "0x00000 0x0 43 comm((null)):(null) [ident] third\n"},
      {{{"MESSAGE", "fourth"}, {"SYSLOG_IDENTIFIER", "ident"}},
       kShown + "0x00000 0x0 0 ident((null)):(null) [ident] fourth\n"},
      {{{"MESSAGE", "nothing else"}}, kNothing + "nothing else\n"},
      {{{"MESSAGE", "odd numbers"}, {"_SOURCE_REALTIME_TIMESTAMP", "soon"}, {"TID", "-1"}, {"_PID", "99999999999"},
        {"SYSLOG_PID", "7 "}, {"VELL_ACTIVITY_ID", "0xFFffFFffFFffFFff"}},
       kShown + "0x174876e7ff 0xffffffffffffffff 0 (null)((null)):(null) [(null)] odd numbers\n"},
      {{{"MESSAGE", "no date"}, {"_SOURCE_REALTIME_TIMESTAMP", "36028797018963968"}}, kNothing + "no date\n"},
      {{{"MESSAGE", "odd paths"}, {"_EXE", "linkd"}, {"VELL_SENDER_IMAGE_PATH", "/lib/"}},
       kShown + "0x00000 0x0 0 linkd():(null) [(null)] odd paths\n"},
      {{{"MESSAGE", "empty"}, {"_EXE", ""}, {"VELL_SUBSYSTEM", ""}, {"VELL_CATEGORY", ""}},
       kShown + "0x00000 0x0 0 (): [] empty\n"},
      {{{"MESSAGE", ""}}, kNothing + "\n"},
      {{{"MESSAGE", "a\nb\n\n50%d %s \0 c"s}}, kNothing + "a\nb\n\n50%d %s \0 c\n"s},
      {{{"MESSAGE", longText + "end"}}, kNothing + longText + "end\n"},
      {{{"MESSAGE", "ä\x80 \xE2\x82 \xED\xA0\x80 \xF0\x9F\x93"}, {"_COMM", "p\xFF"},
        {"VELL_SENDER_IMAGE_PATH", "/\xFE/i\xC0\xAF"}, {"VELL_SUBSYSTEM", "\xC3"}, {"VELL_CATEGORY", "\xF5"}},
       kShown + "0x00000 0x0 0 p\uFFFD(i\uFFFD\uFFFD):\uFFFD [\uFFFD] ä\uFFFD \uFFFD \uFFFD\uFFFD\uFFFD \uFFFD\n"},
      {{{"PRIORITY", "3"}, {"_COMM", "without a message"}}, ""},
  };
  DeviceJournal device;
  std::vector<StoredEntry> entries;
  std::string lines;
  for (const auto& each : cases) {
    entries.push_back({kTime + 999'999, each.fields});
    lines += each.line;
  }
  device.store("system.journal", entries);
  const auto result = device.run();
  EXPECT_EQ(result.status, 0);
  EXPECT_TRUE(result.content == lines) << result.content.substr(0, 2000);
  EXPECT_EQ(result.messages, std::vector{kStarted});
}

// clang-format on

TEST(ExportLines, ShowLocalTimeAsItWasAtTheEntry) {
  const std::string summerTime = "CET-1CEST,M3.5.0,M10.5.0/3";
  const struct {
    std::string zone;
    std::uint64_t seconds;
    std::string shown;
  } cases[] = {
      {"OLD-1NEW,J60/1:07:09,J300", 1'614'556'028, "2021-03-01 00:47:08 +0000"},
      {summerTime, 1'616'893'199, "2021-03-28 01:59:59 +0000"},
      {summerTime, 1'616'893'200, "2021-03-28 03:00:00 +0000"},
      {"WEST9:30", 1'620'100'000, "2021-05-03 18:16:40 +0000"},
      {"UTC0", 1'620'133'641, "2021-05-04 13:07:21 +0000"},
      {"EAST-5:45", 1'620'133'641, "2021-05-04 18:52:21 +0000"},
      {summerTime, 1'635'641'999, "2021-10-31 02:59:59 +0000"},
      {summerTime, 1'635'642'000, "2021-10-31 02:00:00 +0000"},
  };
  DeviceJournal device;
  std::vector<StoredEntry> entries;
  for (const auto& each : cases) {
    entries.push_back({each.seconds * 1'000'000, {{"MESSAGE", "m"}}});
  }
  device.store("system.journal", entries);
  for (const auto& each : cases) {
    const auto content = device.run({"-p"}, "TZ=" + each.zone).content;
    EXPECT_NE(content.find(each.shown), std::string::npos) << each.zone << "\n" << content;
  }
}

}  // namespace
