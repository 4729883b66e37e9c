#pragma once

#include "platform/log_store.h"

#include <chrono>
#include <list>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

/// The system log, the files, the clock and the work groups behind the in-process platform: the
/// tests' own side of them.
namespace in_process {

/// A zone with one offset.
class FixedZone : public TimeZone {
 public:
  explicit FixedZone(std::chrono::seconds ahead) : offset(ahead) {}
  [[nodiscard]] std::chrono::seconds offsetAt(std::chrono::sys_seconds /*time*/) const override {
    return offset;
  }

 private:
  std::chrono::seconds offset;
};

/// What a test sets before it exports, and reads after it has.
struct LogDevice {
  // The store.
  std::optional<std::string> storeError;  ///< Why it cannot be opened.
  bool storeGivesNothing = false;         ///< Neither a source nor an error.

  // The reader.
  std::list<LogEntry> entries;                 ///< What it delivers, unfiltered.
  std::optional<unsigned long> endReason = 5;  ///< Without one it does not end.
  std::optional<unsigned> flags;               ///< As the export set them.
  std::optional<LogFilter> filter;             ///< As the export set it.
  std::optional<LogTime> from;                 ///< As the export activated it.
  bool invalidated = false;                    ///< By the export.
  LogReader::EntryHandler entryHandler;        ///< For entries that come late.
  LogReader::InvalidationHandler invalidationHandler;

  // Files.
  std::map<std::string, std::string> files;  ///< Content by path.
  bool filesCanBeOpened = true;
  std::optional<std::size_t> appendsUntilFull;  ///< After these, the disk is full.

  // Groups.
  bool groupsCanBeMade = true;
  bool timeRunsOut = false;                             ///< At once, when a wait has a limit.
  std::optional<std::chrono::nanoseconds> longestWait;  ///< The limit of the last such wait.

  LogTime now{std::chrono::seconds(1'620'133'641)};  ///< 2021-05-04 13:07:21 UTC.
  std::vector<std::string> messages;                 ///< In the system log.
};

/// The log device there is.
LogDevice& logDevice();

/// Puts a new one in its place.
LogDevice& startLogDevice();

}  // namespace in_process
