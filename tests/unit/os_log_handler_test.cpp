#include "logdump/os_log_handler.h"

#include "tests/in_process/log_device.h"
#include "tests/unit/console.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using in_process::startLogDevice;
using Words = std::list<std::string>;

struct WordCase {
  const char* what;
  Words words;
  std::vector<std::string> processes;
  std::vector<std::string> imagePaths;
};

LogFilter filterOf(const WordCase& expected) {
  LogFilter filter;
  for (const auto& name : expected.processes) {
    filter.push_back({LogComparison::Kind::ProcessEquals, name});
  }
  for (const auto& text : expected.imagePaths) {
    filter.push_back({LogComparison::Kind::SenderImagePathContains, text});
  }
  return filter;
}

TEST(OsLogHandler, SortsItsWordsIntoTheSelection) {
  const WordCase cases[] = {
      {"nothing: the default",
       {},
       {"Linkward", "LinkwardMobileHelper", "LinkwardRootHelper", "vell-helper", "Airgroved",
        "Tessfield", "voltkeeperd"},
       {"HaldenBaseband"}},
      {"both", {"-p", "A", "B", "-i", "C", "D"}, {"A", "B"}, {"C", "D"}},
      {"an option twice", {"-p", "A", "-i", "C", "-p", "B"}, {"A", "B"}, {"C"}},
      {"words before an option", {"foo", "-p", "A", "B", "-x", "C", "-i", "D"}, {"A", "B"}, {"D"}},
      {"a word stuck to an option", {"-pA", "B", "-i", "D", "-ip", "E", "-", "F"}, {}, {"D"}},
      {"an empty word", {"-p", "", "-P", "A"}, {""}, {}},
      {"an option alone", {"-p"}, {}, {}},
      {"no option", {"foo", "bar"}, {}, {}},
  };
  for (const auto& each : cases) {
    SCOPED_TRACE(each.what);
    auto& device = startLogDevice();
    auto words = each.words;
    words.insert(words.begin(), {"60", "out.txt"});
    const Console console;
    EXPECT_TRUE(makeOsLogHandler()(WorkGroup(), words));
    EXPECT_EQ(device.filter.value_or(LogFilter()), filterOf(each));
    EXPECT_EQ(device.files, (std::map<std::string, std::string>{{"out.txt", ""}}));
    EXPECT_EQ(console.output() + console.errors(), "");
  }
}

TEST(OsLogHandler, ReadsTheHistoryAsFarAsItIsANumber) {
  const std::pair<const char*, int> cases[] = {{"60", 60},
                                               {" \t+12abc", 12},
                                               {"abc", 0},
                                               {"", 0},
                                               {"0x10", 0},
                                               {"-60", -60},
                                               {"3600.9", 3600},
                                               {"99999999999", 2147483647},
                                               {"-99999999999", -2147483648}};
  for (const auto& [word, seconds] : cases) {
    SCOPED_TRACE(word);
    auto& device = startLogDevice();
    EXPECT_TRUE(makeOsLogHandler()(WorkGroup(), {word, "out.txt", "-p"}));
    EXPECT_EQ(device.from, device.now - std::chrono::seconds(seconds));
    EXPECT_EQ(
        device.messages,
        std::vector{"Getting oslog stream: history = " + std::to_string(seconds) + ".000000"});
  }
}

TEST(OsLogHandler, NeedsAHistoryAndAPath) {
  for (const auto& words : {Words{}, Words{"60"}}) {
    auto& device = startLogDevice();
    const Console console;
    EXPECT_FALSE(makeOsLogHandler()(WorkGroup(), words));
    EXPECT_EQ(console.output(), "os log collection: Failed\n");
    EXPECT_TRUE(device.files.empty());
    EXPECT_TRUE(device.messages.empty());
  }
}

TEST(OsLogHandler, GivesTheExportsResultAndLeavesItsGroup) {
  auto& device = startLogDevice();
  const auto group = WorkGroup::create();
  EXPECT_TRUE(makeOsLogHandler()(group, {"60", "out.txt"}));
  group.wait();
  device.storeError = "gone";
  EXPECT_FALSE(makeOsLogHandler()(group, {"60", "out.txt"}));
  group.wait();
}

}  // namespace
