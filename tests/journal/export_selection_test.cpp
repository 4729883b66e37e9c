// Which entries an export selects, and in which order it gives them.

#include "tests/journal/device_journal.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <ctime>
#include <string>
#include <vector>

namespace {

using Fields = std::vector<std::pair<std::string, std::string>>;

constexpr std::uint64_t kTime = 1'620'133'641'000'000;

/// The messages in the content of an export, which here are single words, one after the other.
std::string messagesOf(const std::string& content) {
  std::string messages;
  for (std::size_t end = content.find('\n'); end != std::string::npos;
       end = content.find('\n', end + 1)) {
    const auto start = content.rfind(' ', end) + 1;
    messages += content.substr(start, end - start) + " ";
  }
  return messages;
}

StoredEntry message(std::uint64_t realtime, const std::string& text, Fields fields = {}) {
  fields.emplace_back("MESSAGE", text);
  return {realtime, std::move(fields)};
}

TEST(ExportSelection, GoesByProcessNameAndImagePath) {
  DeviceJournal device;
  device.store(
      "system.journal",
      {message(kTime + 0, "exe", {{"_EXE", "/usr/bin/Linkward"}, {"_COMM", "other"}}),
       message(kTime + 1, "comm", {{"_COMM", "Linkward"}, {"SYSLOG_IDENTIFIER", "other"}}),
       message(kTime + 2, "ident", {{"SYSLOG_IDENTIFIER", "Linkward"}}),
       message(kTime + 3, "case", {{"_EXE", "/usr/bin/linkward"}}),
       message(kTime + 4, "hidden", {{"_EXE", "/usr/bin/other"}, {"_COMM", "Linkward"}}),
       message(kTime + 5, "image", {{"VELL_SENDER_IMAGE_PATH", "/opt/HALDENBASEBAND/x"}}),
       message(kTime + 6, "own", {{"_EXE", "/opt/h\u00e1ldenbaseband/tool"}}),
       message(kTime + 7, "apart",
               {{"VELL_SENDER_IMAGE_PATH", "/opt/Ha\u0301ldenBaseband"}, {"_EXE", "/bin/x"}}),
       message(kTime + 8, "told",
               {{"VELL_SENDER_IMAGE_PATH", "/lib/y"}, {"_EXE", "/opt/HaldenBaseband/tool"}}),
       message(kTime + 9, "helper", {{"_EXE", "/usr/libexec/vell-helper"}}),
       message(kTime + 10, "street", {{"_EXE", "/opt/STRASSE/d"}}),
       message(kTime + 11, "greek", {{"_EXE", "/opt/\u1FB3/d"}}), message(kTime + 12, "none", {})});
  const struct {
    std::vector<std::string> words;
    std::string messages;
  } cases[] = {
      {{}, "exe comm ident image own apart helper "},
      {{"-p"}, "exe comm ident case hidden image own apart told helper street greek none "},
      {{"-p", "Linkward"}, "exe comm ident "},
      {{"-p", "linkward", "-p", "vell-helper"}, "case helper "},
      {{"-i", "HaldenBaseband"}, "image own apart "},
      {{"-i", "H\u00c0LDEN"}, "image own apart "},
      {{"-i", "/opt/halden", "-p", "other"}, "hidden image own apart "},
      {{"-i", "stra\u00dfe"}, "street "},
      {{"-i", "\u0391\u0345/"}, "greek "},
      {{"-i", "/b", "-p", "tool"}, "exe case hidden own told "},
      {{"-i", "no such"}, ""},
      {{"-p", "", "no such"}, ""},
  };
  for (const auto& each : cases) {
    const auto result = device.run(each.words);
    EXPECT_EQ(messagesOf(result.content), each.messages);
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.messages, std::vector{kStarted});
  }
}

TEST(ExportSelection, GivesTheOldestFirstAcrossFiles) {
  DeviceJournal device;
  std::filesystem::create_directories(device.root() / "run/log/journal");
  device.store("system@1.journal",
               {message(kTime, "a"), message(kTime + 1, "b"), message(kTime + 6, "g")});
  device.store("system.journal",
               {message(kTime + 3, "d"), message(kTime + 4, "e"), message(kTime + 9, "i")});
  device.store("user-1000.journal",
               {message(kTime + 2, "c"), message(kTime + 5, "f"), message(kTime + 8, "h")});
  device.store("../system.journal", {message(kTime + 10, "j")});
  device.store("../../../../run/log/journal/system.journal", {message(kTime + 11, "k")});
  // Copied from file to file, and once left over by a program that died.
  std::filesystem::copy_file(device.journals() / "user-1000.journal",
                             device.journals() / "user-1000@copy.journal~");
  // Of another namespace, and no journal at all.
  std::filesystem::create_directories(device.journals().string() + ".other");
  device.store(device.journals().string() + ".other/system.journal", {message(kTime, "other")});
  std::filesystem::create_directories(device.journals() / "folder.journal");
  EXPECT_EQ(messagesOf(device.run().content), "a b c d e f g h i j k ");
}

TEST(ExportSelection, KeepsDifferentEntriesOfOneTime) {
  DeviceJournal device;
  constexpr int kEach = 400;
  for (const auto* name : {"system", "user-1000"}) {
    std::vector<StoredEntry> entries;
    entries.reserve(kEach);
    for (int at = 0; at < kEach; ++at) {
      entries.push_back(message(kTime, name + std::to_string(at)));
    }
    device.store(std::string(name) + ".journal", entries);
    // Entry by entry, and as a file below, with the numbers that the entries have.
    device.store(std::string(name) + "@flushed.journal", entries);
  }
  std::filesystem::copy_file(device.journals() / "system.journal",
                             device.journals() / "system@copy.journal~");
  const auto content = device.run().content;
  EXPECT_EQ(std::count(content.begin(), content.end(), '\n'), 2 * kEach);
  for (int at = 0; at < kEach; ++at) {
    EXPECT_NE(content.find("] system" + std::to_string(at) + "\n"), std::string::npos) << at;
  }
}

TEST(ExportSelection, SaysWhenThereAreTooManyFilesToOpen) {
  DeviceJournal device;
  device.store("system.journal", {message(kTime, "one")});
  for (int copy = 0; copy < 40; ++copy) {
    std::filesystem::copy_file(
        device.journals() / "system.journal",
        device.journals() / ("system@" + std::to_string(copy) + ".journal~"));
  }
  const auto result = device.run({"-p"}, "ulimit -n 32;");
  EXPECT_EQ(messagesOf(result.content), "one ");
  EXPECT_EQ(result.messages, (std::vector{kStarted, kIncomplete}));
}

TEST(ExportSelection, StartsAtTheHistory) {
  const auto now = static_cast<std::uint64_t>(std::time(nullptr)) * 1'000'000;
  constexpr std::uint64_t kMinute = 60'000'000;
  DeviceJournal device;
  device.store("system.journal",
               {message(now - 90 * kMinute, "early"),
                message(now - 50 * kMinute, "held-up",
                        {{"_SOURCE_REALTIME_TIMESTAMP", std::to_string(now - 70 * kMinute)}}),
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
