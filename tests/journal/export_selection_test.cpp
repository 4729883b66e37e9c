// Which entries an export selects, and in which order it gives them.

#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <ctime>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

constexpr std::uint64_t kMinute = 60'000'000;

/// An entry behind which the system starts another file.
StoredEntry lastOfFile(std::uint64_t realtime, const std::string& text) {
  constexpr int kMany = 260;
  Fields fields;
  for (int field = 0; field < kMany; ++field) {
    fields.emplace_back("FIELD" + std::to_string(field), "x");
  }
  return message(realtime, text, fields);
}

// clang-format off

TEST(ExportSelection, GoesByProcessNameAndImagePath) {
  const std::pair<std::string, Fields> stored[] = {
      {"exe", {{"_EXE", "/usr/bin/Linkward"}, {"_COMM", "other"}}},
      {"comm", {{"_COMM", "Linkward"}, {"SYSLOG_IDENTIFIER", "other"}}},
      {"ident", {{"SYSLOG_IDENTIFIER", "Linkward"}}},
      {"case", {{"_EXE", "/usr/bin/linkward"}}},
      {"hidden", {{"_EXE", "/usr/bin/other"}, {"_COMM", "Linkward"}}},
      {"image", {{"VELL_SENDER_IMAGE_PATH", "/opt/HALDENBASEBAND/x"}}},
      {"own", {{"_EXE", "/opt/h\u00e1ldenbaseband/tool"}}},
      {"apart", {{"VELL_SENDER_IMAGE_PATH", "/opt/Ha\u0301ldenBaseband"}, {"_EXE", "/bin/x"}}},
      {"told", {{"VELL_SENDER_IMAGE_PATH", "/lib/y"}, {"_EXE", "/opt/HaldenBaseband/tool"}}},
      {"helper", {{"_EXE", "/usr/libexec/vell-helper"}}},
      {"street", {{"_EXE", "/opt/STRASSE/d"}}},
      {"greek", {{"_EXE", "/opt/\u1FB3/d"}}},
      {"none", {}}};
  const std::pair<std::vector<std::string>, std::string> cases[] = {
      {{}, "exe comm ident image own apart helper "},
      {{"-p"}, "exe comm ident case hidden image own apart told helper street greek none "},
      {{"-p", "linkward", "-p", "vell-helper"}, "case helper "},
      {{"-i", "H\u00c0LDEN"}, "image own apart "},
      {{"-i", "/opt/halden", "-p", "other"}, "hidden image own apart "},
      {{"-i", "stra\u00dfe"}, "street "},
      {{"-i", "\u0391\u0345/"}, "greek "},
      {{"-i", "/b", "-p", "tool"}, "exe case hidden own told "},
      {{"-p", "", "no such"}, ""}};
  // clang-format on
  DeviceJournal device;
  std::vector<StoredEntry> made;
  for (const auto& [text, fields] : stored) {
    made.push_back(message(kTime + made.size(), text, fields));
  }
  device.store("system.journal", made);
  for (const auto& [words, messages] : cases) {
    const auto result = device.run(words);
    EXPECT_EQ(messagesOf(result.content), messages);
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.messages, std::vector{kStarted});
  }
}

TEST(ExportSelection, GivesTheOldestFirstAcrossFiles) {
  DeviceJournal device;
  const auto runtime = device.root() / "run/log/journal";
  fs::create_directories(runtime);
  device.store("system@1.journal",
               {message(kTime, "a"), message(kTime + 1, "b"), message(kTime + 6, "g")});
  device.store("system@2.journal", {message(kTime + 7, "h")});
  device.store("system.journal", {message(kTime + 3, "d"), message(kTime + 4, "e")});
  device.store("user-1000.journal", {message(kTime + 2, "c"), message(kTime + 5, "f")});
  device.store("../system.journal", {message(kTime + 10, "i")});
  device.store(runtime / "system.journal", {message(kTime + 11, "j")});
  // Copied from file to file, and once left over by a program that died.
  fs::copy_file(device.journals() / "user-1000.journal",
                device.journals() / "user-1000@copy.journal~");
  // Of another namespace, and no journal at all.
  fs::create_directories(device.journals().string() + ".other");
  device.store(device.journals().string() + ".other/system.journal", {message(kTime, "other")});
  fs::create_directories(device.journals() / "folder.journal");
  EXPECT_EQ(messagesOf(device.run().content), "a b c d e f g h i j ");
}

TEST(ExportSelection, GivesOnePeriodAfterTheOtherWhenTheClockWasSetBack) {
  // The clock is set back twice, the second time to before everything. Each time the system starts
  // another file.
  DeviceJournal device;
  device.store("system.journal",
               {message(kTime + 10, "a"), lastOfFile(kTime + 20, "b"), message(kTime + 15, "c"),
                lastOfFile(kTime + 25, "e"), message(kTime + 5, "f"), message(kTime + 6, "g"),
                message(kTime + 30, "h")});
  fs::copy_file(device.journals() / "system.journal", device.journals() / "system@copy.journal~");
  // Of another chain, and so by its times.
  device.store("user-1000.journal", {message(kTime + 24, "d"), message(kTime + 31, "i")});
  EXPECT_EQ(messagesOf(device.run().content), "a b c d e f g h i ");
}

TEST(ExportSelection, GivesAllOfFilesThatSeemToComeBeforeEachOther) {
  DeviceJournal device;
  device.store("system@1.journal", {message(kTime + 10, "a"), message(kTime + 5, "b")});
  device.store("system@2.journal", {message(kTime + 8, "c"), message(kTime + 6, "d")});
  EXPECT_EQ(messagesOf(device.run().content), "a b c d ");
}

TEST(ExportSelection, KeepsDifferentEntriesOfOneTime) {
  DeviceJournal device;
  constexpr std::size_t kEach = 400;
  for (const std::string name : {"system", "user-1000"}) {
    std::vector<StoredEntry> made;
    while (made.size() < kEach) {
      made.push_back(message(kTime, name + std::to_string(made.size())));
    }
    device.store(name + ".journal", made);
    // Entry by entry, and as a file below, with the numbers that the entries have.
    device.store(name + "@flushed.journal", made);
  }
  fs::copy_file(device.journals() / "system.journal", device.journals() / "system@copy.journal~");
  const auto messages = messagesOf(device.run().content);
  EXPECT_EQ(std::count(messages.begin(), messages.end(), ' '), 2 * kEach);
  for (std::size_t at = 0; at < kEach; ++at) {
    EXPECT_EQ(countOf("system" + std::to_string(at) + " ", messages), 1);
  }
}

TEST(ExportSelection, GivesUpTheOldestOfMoreFilesThanCanBeOpen) {
  const auto now = static_cast<std::uint64_t>(std::time(nullptr)) * 1'000'000;
  DeviceJournal device;
  std::vector<StoredEntry> made;
  std::string all;
  for (std::uint64_t hour = 16; hour > 0; --hour) {
    made.push_back(lastOfFile(now - hour * 60 * kMinute, std::to_string(hour)));
    all += std::to_string(hour) + " ";
  }
  device.store("system.journal", made);
  const auto raised = device.run({"-p"}, "ulimit -Sn 20;");
  EXPECT_EQ(messagesOf(raised.content), all);
  EXPECT_EQ(raised.messages, std::vector{kStarted});
  const auto limited = device.run({"-p"}, "ulimit -n 24;");
  const auto newest = messagesOf(limited.content);
  EXPECT_TRUE(all.ends_with(" " + newest) && newest.ends_with(" 2 1 ")) << newest;
  EXPECT_EQ(limited.messages, (std::vector{kStarted, kIncomplete}));
  // Files that end before the history are not kept open.
  const auto recent = device.run({"-p"}, "ulimit -n 24;", "12600");
  EXPECT_EQ(messagesOf(recent.content), "3 2 1 ");
  EXPECT_EQ(recent.messages.size(), 1);
}

TEST(ExportSelection, StartsAtTheHistory) {
  const auto now = static_cast<std::uint64_t>(std::time(nullptr)) * 1'000'000;
  DeviceJournal device;
  const auto source = std::to_string(now - 70 * kMinute);
  device.store("system.journal",
               {message(now - 90 * kMinute, "early"),
                message(now - 50 * kMinute, "held-up", {{"_SOURCE_REALTIME_TIMESTAMP", source}}),
                message(now - 40 * kMinute, "late"), message(now - 30 * kMinute, "later")});
  const std::pair<std::string, std::string> cases[] = {
      {"3600", "late later "}, {"2100s", "later "}, {"60", ""}, {"soon", ""}, {"-3600", ""}};
  for (const auto& [history, messages] : cases) {
    const auto result = device.run({"-p"}, "", history);
    EXPECT_EQ(messagesOf(result.content), messages) << history;
    EXPECT_EQ(result.status, 0);
  }
}

}  // namespace
