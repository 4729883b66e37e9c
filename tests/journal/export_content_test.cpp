// What the lines of an export say, and in which order they come.

#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;
using namespace std::string_literals;

const std::string kShown = "2021-05-04 13:07:21 +0000 ";
const std::string kNothing = kShown + "0x00000 0x0 0 (null)((null)):(null) [(null)] ";

/// An entry behind which the system starts another file.
simulator::JournalEntry lastOfFile(long after, const std::string& text) {
  constexpr int kMany = 260;
  auto entry = message(after, text);
  for (int field = 0; field < kMany; ++field) {
    entry.fields.emplace_back("FIELD" + std::to_string(field), "x");
  }
  return entry;
}

// clang-format off

TEST(ExportLines, ShowEachFieldFromWhereItIs) {
  const std::string longText(8 << 20, 'x');
  const std::pair<Fields, std::string> cases[] = {
      {{{"MESSAGE", "all"}, {"_SOURCE_REALTIME_TIMESTAMP", "1620133640000000"}, {"TID", "6699"},
        {"_PID", "42"}, {"SYSLOG_PID", "43"}, {"VELL_ACTIVITY_ID", "1f"}, {"_EXE", "/bin/linkd"},
        {"_COMM", "comm"}, {"SYSLOG_IDENTIFIER", "ident"}, {"VELL_SENDER_IMAGE_PATH", "/lib/r.so"},
        {"VELL_SUBSYSTEM", "vell"}, {"_SYSTEMD_UNIT", "linkd.service"}, {"VELL_CATEGORY", "calls"}},
       "2021-05-04 13:07:20 +0000 0x01a2b 0x1f 42 linkd(r.so):vell [calls] all\n"},
      {{{"MESSAGE", "second"}, {"_PID", "42"}, {"_EXE", "/usr/bin/linkd"},
        {"SYSLOG_IDENTIFIER", "ident"}, {"_SYSTEMD_UNIT", "linkd.service"}},
       kShown + "0x0002a 0x0 42 linkd(linkd):linkd.service [ident] second\n"},
      {{{"MESSAGE", "third"}, {"SYSLOG_PID", "43"}, {"_COMM", "c"}, {"SYSLOG_IDENTIFIER", "ident"}},
       kShown + "0x00000 0x0 43 c((null)):(null) [ident] third\n"},
      {{{"MESSAGE", "fourth"}, {"SYSLOG_IDENTIFIER", "ident"}},
       kShown + "0x00000 0x0 0 ident((null)):(null) [ident] fourth\n"},
      {{{"MESSAGE", "nothing else"}}, kNothing + "nothing else\n"},
      {{{"MESSAGE", "odd numbers"}, {"_SOURCE_REALTIME_TIMESTAMP", "soon"}, {"TID", "-1"},
        {"_PID", "99999999999"}, {"SYSLOG_PID", "7 "}, {"VELL_ACTIVITY_ID", "0xFFffFFffFFffFFff"}},
       kShown + "0x174876e7ff 0xffffffffffffffff 0 (null)((null)):(null) [(null)] odd numbers\n"},
      {{{"_SOURCE_REALTIME_TIMESTAMP", "36028797018963968"}, {"MESSAGE", ""}}, kNothing + "\n"},
      {{{"MESSAGE", "odd paths"}, {"_EXE", "linkd"}, {"VELL_SENDER_IMAGE_PATH", "/lib/"}},
       kShown + "0x00000 0x0 0 linkd():(null) [(null)] odd paths\n"},
      {{{"MESSAGE", "empty"}, {"_EXE", ""}, {"VELL_SUBSYSTEM", ""}, {"VELL_CATEGORY", ""}},
       kShown + "0x00000 0x0 0 (): [] empty\n"},
      {{{"MESSAGE", "a\nb\n\n50%d %s \0 c"s}}, kNothing + "a\nb\n\n50%d %s \0 c\n"s},
      {{{"MESSAGE", longText + "end"}}, kNothing + longText + "end\n"},
      {{{"MESSAGE", "ä\x80 \xE2\x82 \xED\xA0\x80 \xF0\x9F\x93"}, {"_COMM", "p\xFF"},
        {"VELL_SENDER_IMAGE_PATH", "/\xFE/i\xC0\xAF"}, {"VELL_SUBSYSTEM", "\xC3"},
        {"VELL_CATEGORY", "\xF5"}},
       kShown + "0x00000 0x0 0 p\uFFFD(i\uFFFD\uFFFD):\uFFFD [\uFFFD] "
                "ä\uFFFD \uFFFD \uFFFD\uFFFD\uFFFD \uFFFD\n"},
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
  EXPECT_EQ(device.run(), (Export{0, lines}));
}

TEST(ExportLines, ShowLocalTimeAsItWasAtTheEntry) {
  const std::string summerTime = "TZ=CET-1CEST,M3.5.0,M10.5.0/3";
  const struct {
    std::string zone;
    long seconds;
    std::string shown;
  } cases[] = {{"TZ=OLD-1NEW,J60/1:07:09,J300", 1'614'556'028, "2021-03-01 00:47:08 +0000"},
               {summerTime, 1'616'893'199, "2021-03-28 01:59:59 +0000"},
               {summerTime, 1'616'893'200, "2021-03-28 03:00:00 +0000"},
               {"TZ=WEST9:30", 1'620'100'000, "2021-05-03 18:16:40 +0000"},
               {"TZ=EAST-5:45", 1'620'133'641, "2021-05-04 18:52:21 +0000"},
               {summerTime, 1'635'641'999, "2021-10-31 02:59:59 +0000"},
               {summerTime, 1'635'642'000, "2021-10-31 02:00:00 +0000"}};
  DeviceJournal device;
  StoredEntries stored;
  for (const auto& each : cases) {
    stored.push_back({LogTime(std::chrono::seconds(each.seconds)), {{"MESSAGE", "m"}}});
  }
  device.store("system.journal", stored);
  for (const auto& [zone, seconds, shown] : cases) {
    EXPECT_EQ(countOf(shown, device.run({"-p"}, zone).content), 1) << zone << " " << shown;
  }
}

TEST(ExportOrder, IsTheOldestFirstAcrossFilesWithoutCopies) {
  DeviceJournal device;
  const auto store = [&](const fs::path& name, const StoredEntries& stored) {
    fs::create_directories((device.journals() / name).parent_path());
    device.store(name, stored);
  };
  const StoredEntries user = {message(2, "c"), message(2, "d"), message(5, "f")};
  store("system@1.journal", {message(0, "a"), message(1, "b"), message(6, "g")});
  store("system@2.journal", {message(7, "h")});
  store("system.journal", {message(3, "e")});
  store("user-1000.journal", user);
  store("../system.journal", {message(10, "i")});
  store("../../../../run/log/journal/system.journal", {message(11, "j")});
  // Copied entry by entry, from a program that died, and by somebody.
  store("user-1000@flushed.journal", user);
  fs::copy_file(device.journals() / "user-1000.journal", device.journals() / "user@copy.journal~");
  fs::copy_file(device.journals() / "system.journal", device.journals() / "system@copy.journal");
  // Of another namespace, and no journal at all.
  store(device.journals().string() + ".other/system.journal", {message(0, "other")});
  fs::create_directories(device.journals() / "folder.journal");
  EXPECT_EQ(messagesOf(device.run().content), "a b c d e f g h i j ");
}

TEST(ExportOrder, IsOnePeriodAfterTheOtherWhenTheClockWasSetBack) {
  // The clock is set back twice, the second time to before everything. Each time the system starts
  // another file.
  DeviceJournal device;
  device.store("system.journal",
               {message(10, "a"), lastOfFile(20, "b"), message(15, "c"), lastOfFile(25, "e"),
                message(5, "f"), message(6, "g"), message(30, "h")});
  fs::copy_file(device.journals() / "system.journal", device.journals() / "system@copy.journal~");
  // Of another chain, and so by its times.
  device.store("user-1000.journal", {message(24, "d"), message(31, "i")});
  EXPECT_EQ(messagesOf(device.run().content), "a b c d e f g h i ");
}

TEST(ExportOrder, HasAllOfFilesThatSeemToComeBeforeEachOther) {
  DeviceJournal device;
  device.store("system@1.journal", {message(10, "a"), message(5, "b")});
  device.store("system@2.journal", {message(8, "c"), message(6, "d")});
  EXPECT_EQ(messagesOf(device.run().content), "a b c d ");
}

}  // namespace
