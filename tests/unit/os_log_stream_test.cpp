#include "logdump/os_log_stream.h"

#include "tests/in_process/log_device.h"

#include <gtest/gtest.h>

#include <string>
#include <tuple>
#include <vector>

namespace {

using in_process::LogDevice;
using in_process::logDevice;

const std::string kPath = "/exports/out.txt";
const std::string kStarted = "Getting oslog stream: history = 3600.000000";
const std::string kLine =
    "1969-12-31 09:59:59 +0000 0xffffffffffffffff 0x2b -7 linkd(r.so):vell [calls] one\n";

const struct : TimeZone {
  [[nodiscard]] std::chrono::seconds offsetAt(std::chrono::sys_seconds) const override {
    return std::chrono::hours(-14);
  }
} kWest;

/// Exports two messages, and between them an entry that is none, as `prepare` has them come.
bool exportTwoMessages(void (*prepare)(LogDevice&)) {
  logDevice = {};
  logDevice.files[kPath] = "from before";
  for (const auto type : {kLogEntryMessage, 0U, kLogEntryMessage}) {
    logDevice.entries.push_back({type, LogTime(std::chrono::microseconds(-1)), &kWest, ~0UL, 0x2b,
                                 -7, "linkd", "r.so", "/lib/r.so", "vell", "calls", "one"});
  }
  prepare(logDevice);
  return OsLogStream::putOsLogStreamToFile(kPath, {}, {}, 3600);
}

}  // namespace

TEST(OsLogStream, WritesEachMessageUntilSomethingFailsAndSaysWhat) {
  const std::string failed = "Failed to write file: " + kPath + ": ",
                    full = "No space left on device";
  // What is amiss, the result, what the system log is told, and what is in the file.
  const std::tuple<void (*)(LogDevice&), bool, std::vector<std::string>, std::string> cases[] = {
      // clang-format off
      {[](LogDevice&) {}, true, {kStarted}, kLine + kLine},
      {[](LogDevice& d) { d.groupsCanBeMade = false; }, false, {"Failed to get group"}, ""},
      {[](LogDevice& d) { d.endReason = 4'000'000'000; },
       true, {kStarted, "Invalid oslog stream: reason = 4000000000"}, kLine + kLine},
      {[](LogDevice& d) { d.hang = std::make_shared<in_process::Hang>(); },
       false, {kStarted, "Timeout on getting oslog stream"}, kLine},
      {[](LogDevice& d) { d.appendsUntilFull = 1, d.endReason.reset(); },
       false, {kStarted, failed + full}, kLine},
      {[](LogDevice& d) { d.closeError = std::errc::io_error; },
       false, {kStarted, failed + "Input/output error"}, kLine + kLine},
      // clang-format on
  };
  for (const auto& [prepare, result, messages, content] : cases) {
    SCOPED_TRACE(testing::PrintToString(messages));
    EXPECT_EQ(exportTwoMessages(prepare), result);
    EXPECT_EQ(logDevice.invalidated, messages.back().starts_with("Timeout"));
    if (logDevice.hang) {
      EXPECT_EQ(logDevice.filesClosed, 0);  // It is under a write.
      logDevice.hang->released.set_value();
      logDevice.delivering.join();
    }
    // What comes late finds everything that it needs, and the file closed.
    logDevice.appendsUntilFull = 1;
    if (logDevice.entryHandler) {
      logDevice.entryHandler(logDevice.entries.front());
      logDevice.endHandler(kLogReaderAtEnd, logDevice.now);
    }
    EXPECT_EQ(logDevice.messages, messages);
    EXPECT_EQ(logDevice.files[kPath], content);
  }
  EXPECT_EQ(logDevice.flags, 21U);
  EXPECT_EQ(logDevice.filter, std::nullopt);
  EXPECT_EQ(logDevice.from, logDevice.now - std::chrono::hours(1));
  EXPECT_EQ(logDevice.longestWait, std::chrono::seconds(180));
}
