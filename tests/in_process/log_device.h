#pragma once

#include "platform/log_store.h"

#include <chrono>
#include <future>
#include <list>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <system_error>
#include <thread>
#include <vector>

class LogSource {};

/// The system log, the files, the clock and the work groups behind the in-process platform: the
/// tests' own side of them.
namespace in_process {

/// A write that does not return before the test says so.
struct Hang {
  std::promise<void> begun, released;
};

/// What a test sets before it exports, and reads after it has.
struct LogDevice {
  // The reader.
  std::list<LogEntry> entries;                 ///< What it delivers, unfiltered, when activated.
  std::optional<unsigned long> endReason = 5;  ///< Without one it does not end.
  unsigned flags = 0;                          ///< As the export set them.
  std::optional<LogFilter> filter;             ///< As the export set it.
  std::optional<LogTime> from;                 ///< As the export activated it.
  bool invalidated = false;                    ///< By the export.
  LogReader::EntryHandler entryHandler;        ///< For entries that come late.
  LogReader::InvalidationHandler endHandler;

  std::map<std::string, std::string> files;  ///< Content by path.
  std::size_t appendsUntilFull = 1000;       ///< After these, the disk is full.
  std::errc closeError{};                    ///< What a file is closed with.
  std::shared_ptr<Hang> hang;                ///< Of the first write, on a thread of its own.
  std::thread delivering;                    ///< That thread.
  int filesClosed = 0;

  bool groupsCanBeMade = true;
  std::chrono::nanoseconds longestWait{};  ///< The limit of the last wait that had one.

  LogTime now{std::chrono::seconds(1'620'133'641)};  ///< 2021-05-04 13:07:21 UTC.
  std::vector<std::string> messages;                 ///< In the system log.
};

/// The log device there is.
inline LogDevice logDevice;

}  // namespace in_process
