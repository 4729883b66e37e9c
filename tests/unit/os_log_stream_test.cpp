#include "logdump/os_log_stream.h"

#include "tests/in_process/log_device.h"

#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace {

using in_process::LogDevice;
using in_process::startLogDevice;

const std::string kPath = "/exports/out.txt";
const std::string kStarted = "Getting oslog stream: history = 3600.000000";

constexpr char kOddBytes[] = "50 %d%s\n\0\tnaïve";
constexpr std::string_view kOddMessage(kOddBytes, sizeof kOddBytes - 1);

bool exportAll() {
  return OsLogStream::putOsLogStreamToFile(kPath, {}, {}, 3600);
}

/// An entry of the message "one" with everything in it, logged at 13:07:21 GMT.
LogEntry fullEntry(const TimeZone& zone) {
  return {.type = kLogEntryMessage,
          .time = LogTime(std::chrono::microseconds(1'620'133'641'999'999)),
          .timeZone = &zone,
          .threadIdentifier = 0x1a2b,
          .activityIdentifier = 0,
          .processIdentifier = 42,
          .process = "Linkward",
          .sender = "libradio.so",
          .senderImagePath = "/usr/lib/libradio.so",
          .subsystem = "org.vell.link",
          .category = "calls",
          .composedMessage = "one"};
}

struct LineCase {
  const char* what;
  std::function<void(LogEntry&)> change;
  std::string line;
};

TEST(OsLogStream, WritesOneLineForEachMessage) {
  using std::chrono::hours;
  const in_process::FixedZone gmt{hours(0)};
  const in_process::FixedZone east{hours(2)};
  const in_process::FixedZone west{-hours(14)};
  const std::string rest = " 0x01a2b 0x0 42 Linkward(libradio.so):org.vell.link [calls] one\n";
  const LineCase cases[] = {
      {"whole", [](LogEntry&) {}, "2021-05-04 13:07:21 +0000" + rest},
      {"east", [&](LogEntry& e) { e.timeZone = &east; }, "2021-05-04 15:07:21 +0000" + rest},
      {"west", [&](LogEntry& e) { e.timeZone = &west; }, "2021-05-03 23:07:21 +0000" + rest},
      {"before 1970", [](LogEntry& e) { e.time = LogTime(std::chrono::microseconds(-1)); },
       "1969-12-31 23:59:59 +0000" + rest},
      {"large numbers",
       [](LogEntry& e) {
         e.threadIdentifier = e.activityIdentifier = ~std::uint64_t{0};
         e.processIdentifier = -7;
       },
       "2021-05-04 13:07:21 +0000 0xffffffffffffffff 0xffffffffffffffff -7 "
       "Linkward(libradio.so):org.vell.link [calls] one\n"},
      {"no texts",
       [](LogEntry& e) {
         e.process = e.sender = e.subsystem = e.category = e.composedMessage = std::nullopt;
         e.threadIdentifier = 0;
       },
       "2021-05-04 13:07:21 +0000 0x00000 0x0 42 (null)((null)):(null) [(null)] (null)\n"},
      {"empty texts",
       [](LogEntry& e) {
         e.process = e.sender = e.subsystem = e.category = e.composedMessage = "";
       },
       "2021-05-04 13:07:21 +0000 0x01a2b 0x0 42 (): [] \n"},
      {"odd message", [](LogEntry& e) { e.composedMessage = kOddMessage; },
       "2021-05-04 13:07:21 +0000 0x01a2b 0x0 42 Linkward(libradio.so):org.vell.link [calls] " +
           std::string(kOddMessage) + "\n"},
      {"another type", [](LogEntry& e) { e.type = 0; }, ""},
  };
  auto& device = startLogDevice();
  std::string lines;
  for (const auto& each : cases) {
    device.entries.push_back(fullEntry(gmt));
    each.change(device.entries.back());
    lines += each.line;
  }
  EXPECT_TRUE(exportAll());
  EXPECT_EQ(device.files[kPath], lines);
  EXPECT_EQ(device.messages, std::vector{kStarted});
}

TEST(OsLogStream, SetsUpTheReader) {
  using enum LogComparison::Kind;
  auto& device = startLogDevice();
  device.files[kPath] = "from before";
  EXPECT_TRUE(OsLogStream::putOsLogStreamToFile(kPath, {"b", "a"}, {"/lib"}, 3600));
  EXPECT_EQ(device.flags, 21U);
  EXPECT_EQ(device.filter, (LogFilter{
                               {ProcessEquals, "b"},
                               {ProcessEquals, "a"},
                               {SenderImagePathContains, "/lib"},
                           }));
  EXPECT_EQ(device.from, device.now - std::chrono::hours(1));
  EXPECT_EQ(device.longestWait, std::chrono::seconds(180));
  EXPECT_FALSE(device.invalidated);
  EXPECT_EQ(device.files[kPath], "");

  auto& second = startLogDevice();
  EXPECT_TRUE(exportAll());
  EXPECT_EQ(second.filter, std::nullopt);
}

struct FailureCase {
  const char* what;
  std::function<void(LogDevice&)> prepare;
  bool result;
  std::vector<std::string> messages;
  std::optional<std::string> content;  ///< Of the file; none when it is not touched.
};

TEST(OsLogStream, TellsTheSystemLogWhatFailed) {
  const in_process::FixedZone gmt{std::chrono::seconds(0)};
  const std::string line =
      "2021-05-04 13:07:21 +0000 0x01a2b 0x0 42 Linkward(libradio.so):org.vell.link [calls] one\n";
  const FailureCase cases[] = {
      {"store",
       [](LogDevice& d) { d.storeError = "No such file or directory"; },
       false,
       {"Could not open: No such file or directory", "Failed to prepare oslog stream"},
       std::nullopt},
      {"source",
       [](LogDevice& d) { d.storeGivesNothing = true; },
       false,
       {"Failed to prepare oslog stream"},
       std::nullopt},
      {"file",
       [](LogDevice& d) { d.filesCanBeOpened = false; },
       false,
       {"Failed to create file: " + kPath},
       ""},
      {"group",
       [](LogDevice& d) { d.groupsCanBeMade = false; },
       false,
       {"Failed to get group"},
       ""},
      {"reader",
       [](LogDevice& d) { d.endReason = 4'000'000'000; },
       true,
       {kStarted, "Invalid oslog stream: reason = 4000000000"},
       line + line},
      {"time",
       [](LogDevice& d) { d.endReason.reset(), d.timeRunsOut = true; },
       false,
       {kStarted, "Timeout on getting oslog stream"},
       line + line},
      {"disk",
       [](LogDevice& d) { d.appendsUntilFull = 1; },
       false,
       {kStarted, "Failed to write file: " + kPath + ": No space left on device"},
       line},
      {"disk and reader",
       [](LogDevice& d) { d.appendsUntilFull = 0, d.endReason.reset(); },
       false,
       {kStarted, "Failed to write file: " + kPath + ": No space left on device"},
       ""},
  };
  for (const auto& each : cases) {
    SCOPED_TRACE(each.what);
    auto& device = startLogDevice();
    device.entries = {fullEntry(gmt), fullEntry(gmt)};
    each.prepare(device);
    EXPECT_EQ(exportAll(), each.result);
    EXPECT_EQ(device.messages, each.messages);
    EXPECT_EQ(device.files.contains(kPath), each.content.has_value());
    EXPECT_EQ(device.files[kPath], each.content.value_or(""));
    EXPECT_EQ(device.invalidated, device.timeRunsOut);
    // What comes late finds everything that it needs, and the file closed.
    device.appendsUntilFull.reset();
    if (device.entryHandler) {
      device.entryHandler(fullEntry(gmt));
      device.invalidationHandler(kLogReaderAtEnd, device.now);
    }
    EXPECT_EQ(device.files[kPath], each.content.value_or(""));
    EXPECT_EQ(device.messages, each.messages);
  }
}

}  // namespace
