#include "logdump/os_log_handler.h"

#include "tests/in_process/log_device.h"
#include "tests/unit/console.h"

#include <gtest/gtest.h>

#include <list>
#include <string>
#include <vector>

namespace {

using in_process::logDevice;

/// What the handler gives on a new device when it has left its group.
bool exportWith(const std::list<std::string>& words) {
  logDevice = {};
  const auto group = WorkGroup::create();
  const bool result = makeOsLogHandler()(group, words);
  group.wait();
  return result;
}

TEST(OsLogHandler, SortsItsWordsIntoTheSelection) {
  // The words, and the process names and image paths that they select.
  const std::pair<std::list<std::string>, std::string> cases[] = {
      {{},
       "p Linkward, p LinkwardMobileHelper, p LinkwardRootHelper, p vell-helper, p Airgroved, "
       "p Tessfield, p voltkeeperd, i HaldenBaseband, "},
      {{"-p", "A", "B", "-i", "C", "D"}, "p A, p B, i C, i D, "},
      {{"-p", "A", "-i", "C", "-p", "B"}, "p A, p B, i C, "},
      {{"foo", "-p", "A", "B", "-x", "C", "-i", "D"}, "p A, p B, i D, "},
      {{"-pA", "B", "-i", "D", "-ip", "E", "-", "F"}, "i D, "},
      {{"-p", "", "-P", "A"}, "p , "},
      {{"-p"}, ""},
      {{"foo", "bar"}, ""}};
  for (auto [words, selection] : cases) {
    SCOPED_TRACE(testing::PrintToString(words));
    words.insert(words.begin(), {"60", "out.txt"});
    const Console console;
    EXPECT_TRUE(exportWith(words));
    std::string selected;
    for (const auto& [kind, text] : logDevice.filter.value_or(LogFilter())) {
      selected += (kind == LogComparison::Kind::ProcessEquals ? "p " : "i ") + text + ", ";
    }
    EXPECT_EQ(selected, selection);
    EXPECT_EQ(logDevice.files, (std::map<std::string, std::string>{{"out.txt", ""}}));
    EXPECT_EQ(console.output() + console.errors(), "");
  }
}

TEST(OsLogHandler, ReadsTheHistoryAsFarAsItIsANumber) {
  // clang-format off
  const std::pair<const char*, int> cases[] = {
      {"60", 60}, {" \t+12abc", 12}, {"abc", 0}, {"", 0}, {"0x10", 0}, {"-60", -60},
      {"3600.9", 3600}, {"99999999999", 2147483647}, {"-99999999999", -2147483648}};
  // clang-format on
  for (const auto& [word, seconds] : cases) {
    SCOPED_TRACE(word);
    EXPECT_TRUE(exportWith({word, "out.txt", "-p"}));
    EXPECT_EQ(logDevice.from, logDevice.now - std::chrono::seconds(seconds));
    EXPECT_EQ(
        logDevice.messages,
        std::vector{"Getting oslog stream: history = " + std::to_string(seconds) + ".000000"});
  }
}

TEST(OsLogHandler, NeedsAHistoryAndAPath) {
  const Console console;
  EXPECT_FALSE(exportWith({}));
  EXPECT_FALSE(exportWith({"60"}));
  EXPECT_EQ(console.output(), "os log collection: Failed\nos log collection: Failed\n");
  EXPECT_TRUE(logDevice.files.empty() && logDevice.messages.empty());
}

}  // namespace
