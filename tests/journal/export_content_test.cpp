// What the lines of an export say, and in which order they come.

#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <string>

namespace {

using namespace std::string_literals;

// In a zone that is five hours and three quarters ahead.
const std::string kShown = "2021-05-04 18:52:21 +0000 ";
const std::string kNothing = kShown + "0x00000 0x0 0 (null)((null)):(null) [(null)] ";

/// An entry behind which the system starts another file.
simulator::JournalEntry lastOfFile(long after, const std::string& text) {
  constexpr int kMany = 260;
  Fields fields;
  for (int field = 0; field < kMany; ++field) {
    fields.emplace_back("FIELD" + std::to_string(field), "x");
  }
  return message(after, text, fields);
}

// clang-format off

TEST(ExportLines, ShowEachFieldFromWhereItIs) {
  const std::string longText(8 << 20, 'x');
  const std::pair<Fields, std::string> cases[] = {
      {{{"MESSAGE", "all"}, {"_SOURCE_REALTIME_TIMESTAMP", "1620133640000000"}, {"TID", "6699"},
        {"_PID", "42"}, {"SYSLOG_PID", "43"}, {"VELL_ACTIVITY_ID", "1f"}, {"_EXE", "/bin/linkd"},
        {"_COMM", "comm"}, {"SYSLOG_IDENTIFIER", "ident"}, {"VELL_SENDER_IMAGE_PATH", "/lib/r.so"},
        {"VELL_SUBSYSTEM", "vell"}, {"_SYSTEMD_UNIT", "linkd.service"}, {"VELL_CATEGORY", "calls"}},
       "2021-05-04 18:52:20 +0000 0x01a2b 0x1f 42 linkd(r.so):vell [calls] all\n"},
      {{{"MESSAGE", "second"}, {"_SOURCE_REALTIME_TIMESTAMP", "36028797018963968"}, {"_PID", "42"},
        {"_EXE", "/usr/bin/linkd"}, {"_COMM", "comm"}, {"SYSLOG_IDENTIFIER", "ident"},
        {"_SYSTEMD_UNIT", "linkd.service"}},
       kShown + "0x0002a 0x0 42 linkd(linkd):linkd.service [ident] second\n"},
      {{{"MESSAGE", "third"}, {"_SOURCE_REALTIME_TIMESTAMP", "soon"}, {"SYSLOG_PID", "43"},
        {"_COMM", "comm"}, {"SYSLOG_IDENTIFIER", "ident"}},
       kShown + "0x00000 0x0 43 comm((null)):(null) [ident] third\n"},
      {{{"MESSAGE", longText + "end"}, {"SYSLOG_IDENTIFIER", "ident"}},
       kShown + "0x00000 0x0 0 ident((null)):(null) [ident] " + longText + "end\n"},
      {{{"MESSAGE", "a\nb\n\n50%d %s \0 c"s}}, kNothing + "a\nb\n\n50%d %s \0 c\n"s},
      {{{"MESSAGE", "odd"}, {"TID", "-1"}, {"_PID", "99999999999"}, {"SYSLOG_PID", "7 "},
        {"VELL_ACTIVITY_ID", "0xFFffFFffFFffFFff"}, {"_EXE", "linkd"},
        {"VELL_SENDER_IMAGE_PATH", "/lib/"}},
       kShown + "0x174876e7ff 0xffffffffffffffff 0 linkd():(null) [(null)] odd\n"},
      {{{"MESSAGE", ""}, {"_EXE", ""}, {"VELL_SUBSYSTEM", ""}, {"VELL_CATEGORY", ""}},
       kShown + "0x00000 0x0 0 (): [] \n"},
      {{{"MESSAGE", "ä\x80 \xE2\x82"}, {"_COMM", "p\xFF"}, {"VELL_SUBSYSTEM", "s\xC3"},
        {"VELL_SENDER_IMAGE_PATH", "/\xFE/i\xC0\xAF"}, {"VELL_CATEGORY", "c\xF5"}},
       kShown + "0x00000 0x0 0 p\uFFFD(i\uFFFD\uFFFD):s\uFFFD [c\uFFFD] ä\uFFFD \uFFFD\n"},
      {{{"MESSAGE", "of two"}, {"MESSAGE", "not this"}}, kNothing + "of two\n"},
      {{{"PRIORITY", "3"}, {"_COMM", "without a message"}}, ""}};
  // clang-format on
  DeviceJournal device;
  StoredEntries stored;
  std::string lines;
  for (const auto& [fields, line] : cases) {
    stored.push_back({kTime + std::chrono::microseconds(999'999), fields});
    lines += line;
  }
  device.store("system.journal", stored);
  EXPECT_EQ(device.run({"-p"}, "TZ=EAST-5:45"), lines + kStarted);
}

TEST(ExportOrder, IsOnePeriodAfterTheOtherWithoutCopies) {
  // The clock is set back twice, the second time to before everything. Each time the system starts
  // another file.
  DeviceJournal device;
  device.store("system.journal",
               {message(10, "b"), lastOfFile(20, "c"), message(15, "d"), lastOfFile(25, "f"),
                message(5, "g"), message(6, "h"), message(6, "h"), message(30, "i")});
  // Of other chains, and so by its times. What is logged twice at one time is no copy.
  device.store("user-1.journal", {message(24, "e"), message(31, "j")});
  device.store("../user-2@1.journal", {message(1, "a")});
  device.store("../../../../run/log/journal/system.journal", {message(31, "k")});
  // Copied as a file and entry by entry, of another namespace, and no journal at all.
  device.change("cd $J; cp system.journal a@1.journal~; cp ../user-2@1.journal .; mkdir b.journal");
  device.store("user-1@1.journal", {message(24, "e"), message(31, "j")});
  device.store("../" + kJournals.filename().string() + ".other/system.journal",
               {message(0, "other")});
  EXPECT_EQ(lastWords(device.run()), "a b c d e f g h h i j k " + kAll);
}

}  // namespace
