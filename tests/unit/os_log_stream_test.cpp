#include "logdump/os_log_stream.h"

#include "tests/in_process/log_device.h"

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <vector>

namespace {

using in_process::LogDevice;
using in_process::logDevice;
using std::chrono::hours;

const std::string kPath = "/exports/out.txt";
const std::string kStarted = "Getting oslog stream: history = 3600.000000";
const std::string kLine =
    "2021-05-03 23:07:21 +0000 0x01a2b 0x0 42 Linkward(libradio.so):org.vell.link [calls] one\n";

const struct : TimeZone {
  [[nodiscard]] std::chrono::seconds offsetAt(std::chrono::sys_seconds) const override {
    return -hours(14);
  }
} kWest;

bool exportAll() {
  return OsLogStream::putOsLogStreamToFile(kPath, {}, {}, 3600);
}

// clang-format off

/// An entry of the message "one" with everything in it, logged at 13:07:21 GMT.
LogEntry fullEntry() {
  return {kLogEntryMessage, LogTime(std::chrono::microseconds(1'620'133'641'999'999)), &kWest,
          0x1a2b, 0, 42, "Linkward", "libradio.so", "/usr/lib/libradio.so", "org.vell.link",
          "calls", "one"};
}

TEST(OsLogStream, SetsUpTheReaderAndWritesOneLineForEachMessage) {
  const std::pair<std::function<void(LogEntry&)>, std::string> cases[] = {
      {[](LogEntry&) {}, kLine},
      {[](LogEntry& e) { e.time = LogTime(std::chrono::microseconds(-1)); },
       "1969-12-31 09:59:59" + kLine.substr(19)},
      {[](LogEntry& e) { e.processIdentifier = -7,
                         e.threadIdentifier = e.activityIdentifier = ~0UL; },
       "2021-05-03 23:07:21 +0000 0xffffffffffffffff 0xffffffffffffffff -7 " + kLine.substr(41)},
      {[](LogEntry& e) { e.type = 0; }, ""},
  };
  logDevice = {};
  logDevice.files[kPath] = "from before";
  std::string lines;
  for (const auto& [change, line] : cases) {
    change(logDevice.entries.emplace_back(fullEntry()));
    lines += line;
  }
  EXPECT_TRUE(exportAll());
  EXPECT_EQ(logDevice.files[kPath], lines);
  EXPECT_EQ(logDevice.messages, std::vector{kStarted});
  EXPECT_EQ(logDevice.flags, 21U);
  EXPECT_EQ(logDevice.filter, std::nullopt);
  EXPECT_EQ(logDevice.from, logDevice.now - hours(1));
  EXPECT_EQ(logDevice.longestWait, std::chrono::seconds(180));
}

TEST(OsLogStream, TellsTheSystemLogWhatFailed) {
  const std::string full = "Failed to write file: " + kPath + ": No space left on device";
  const struct {
    std::function<void(LogDevice&)> prepare;
    bool result;
    std::vector<std::string> messages;
    std::string content;
  } cases[] = {
      {[](LogDevice& d) { d.source = nullptr; }, false, {"Failed to prepare oslog stream"}, ""},
      {[](LogDevice& d) { d.groupsCanBeMade = false; }, false, {"Failed to get group"}, ""},
      {[](LogDevice& d) { d.endReason = 4'000'000'000; }, true,
       {kStarted, "Invalid oslog stream: reason = 4000000000"}, kLine + kLine},
      {[](LogDevice& d) { d.endReason.reset(); }, false,
       {kStarted, "Timeout on getting oslog stream"}, kLine + kLine},
      {[](LogDevice& d) { d.appendsUntilFull = 1; }, false, {kStarted, full}, kLine},
      {[](LogDevice& d) { d.appendsUntilFull = 0, d.endReason.reset(); },
       false, {kStarted, full}, ""},
  };
  for (const auto& [prepare, result, messages, content] : cases) {
    SCOPED_TRACE(testing::PrintToString(messages));
    logDevice = {};
    logDevice.entries = {fullEntry(), fullEntry()};
    prepare(logDevice);
    EXPECT_EQ(exportAll(), result);
    EXPECT_EQ(logDevice.invalidated, messages.back().starts_with("Timeout"));
    // What comes late finds everything that it needs, and the file closed.
    logDevice.appendsUntilFull = 1;
    if (logDevice.entryHandler) {
      logDevice.entryHandler(fullEntry());
      logDevice.endHandler(kLogReaderAtEnd, logDevice.now);
    }
    EXPECT_EQ(logDevice.messages, messages);
    EXPECT_EQ(logDevice.files[kPath], content);
  }
}

// clang-format on

}  // namespace
