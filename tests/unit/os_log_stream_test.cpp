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
    "2021-05-04 13:07:21 +0000 0x01a2b 0x0 42 Linkward(libradio.so):org.vell.link [calls] one\n";
const std::string kOddMessage("50 %d%s\n\0\tnaïve", 16);

/// A zone with one offset.
struct FixedZone : TimeZone {
  explicit FixedZone(hours ahead) : offset(ahead) {}
  [[nodiscard]] std::chrono::seconds offsetAt(std::chrono::sys_seconds) const override {
    return offset;
  }

  const hours offset;
};

const FixedZone kGmt{hours(0)};
const FixedZone kEast{hours(2)};
const FixedZone kWest{-hours(14)};

bool exportAll() {
  return OsLogStream::putOsLogStreamToFile(kPath, {}, {}, 3600);
}

// clang-format off

/// An entry of the message "one" with everything in it, logged at 13:07:21 GMT.
LogEntry fullEntry() {
  return {kLogEntryMessage, LogTime(std::chrono::microseconds(1'620'133'641'999'999)), &kGmt, 0x1a2b, 0,
          42, "Linkward", "libradio.so", "/usr/lib/libradio.so", "org.vell.link", "calls", "one"};
}

TEST(OsLogStream, SetsUpTheReaderAndWritesOneLineForEachMessage) {
  const std::string rest = kLine.substr(19);
  using Change = std::function<void(LogEntry&)>;
  const auto texts = [](std::optional<std::string_view> text) -> Change {
    return [=](LogEntry& e) { e.process = e.sender = e.subsystem = e.category = e.composedMessage = text; };
  };
  const std::pair<Change, std::string> cases[] = {
      {[](LogEntry&) {}, kLine},
      {[](LogEntry& e) { e.timeZone = &kEast; }, "2021-05-04 15:07:21" + rest},
      {[](LogEntry& e) { e.timeZone = &kWest; }, "2021-05-03 23:07:21" + rest},
      {[](LogEntry& e) { e.time = LogTime(std::chrono::microseconds(-1)); }, "1969-12-31 23:59:59" + rest},
      {[](LogEntry& e) { e.processIdentifier = -7, e.threadIdentifier = e.activityIdentifier = ~0UL; },
       "2021-05-04 13:07:21 +0000 0xffffffffffffffff 0xffffffffffffffff -7 " + kLine.substr(41)},
      {[](LogEntry& e) { e.threadIdentifier = 0; }, kLine.substr(0, 26) + "0x00000" + kLine.substr(33)},
      {texts(std::nullopt), kLine.substr(0, 41) + "(null)((null)):(null) [(null)] (null)\n"},
      {texts(""), kLine.substr(0, 41) + "(): [] \n"},
      {[](LogEntry& e) { e.composedMessage = kOddMessage; }, kLine.substr(0, 85) + kOddMessage + "\n"},
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
  const std::string noFile = "no file";
  const struct {
    std::function<void(LogDevice&)> prepare;
    bool result;
    std::vector<std::string> messages;
    std::string content;
  } cases[] = {
      {[](LogDevice& d) { d.source = nullptr, d.storeError = {"No such file or directory"}; }, false,
       {"Could not open: No such file or directory", "Failed to prepare oslog stream"}, noFile},
      {[](LogDevice& d) { d.source = nullptr; }, false, {"Failed to prepare oslog stream"}, noFile},
      {[](LogDevice& d) { d.filesCanBeOpened = false; }, false, {"Failed to create file: " + kPath}, ""},
      {[](LogDevice& d) { d.groupsCanBeMade = false; }, false, {"Failed to get group"}, ""},
      {[](LogDevice& d) { d.endReason = 4'000'000'000; }, true,
       {kStarted, "Invalid oslog stream: reason = 4000000000"}, kLine + kLine},
      {[](LogDevice& d) { d.endReason.reset(); }, false,
       {kStarted, "Timeout on getting oslog stream"}, kLine + kLine},
      {[](LogDevice& d) { d.appendsUntilFull = 1; }, false, {kStarted, full}, kLine},
      {[](LogDevice& d) { d.appendsUntilFull = 0, d.endReason.reset(); }, false, {kStarted, full}, ""},
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
    EXPECT_EQ(logDevice.files.contains(kPath) ? logDevice.files[kPath] : noFile, content);
  }
}

// clang-format on

}  // namespace
