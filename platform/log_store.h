#pragma once

#include "platform/log_entry.h"
#include "platform/log_filter.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>

/// Flags of a reader. The reader that ships supports only all of them together.
inline constexpr unsigned kLogReaderStoredOnly = 1U << 0U;     ///< Ends where the log ended.
inline constexpr unsigned kLogReaderOldestFirst = 1U << 2U;    ///< In the order of being stored.
inline constexpr unsigned kLogReaderWholeMessages = 1U << 4U;  ///< Texts are never cut off.

/// Why a reader ended.
inline constexpr unsigned long kLogReaderReadError = 1;    ///< The log could not be read on.
inline constexpr unsigned long kLogReaderUnsupported = 2;  ///< The flags are not ones it can do.
inline constexpr unsigned long kLogReaderAtEnd = 5;        ///< Everything was delivered.

/// Why a store could not be opened, in words for the user.
struct LogStoreError {
  std::string description;
};

/// Stands for the device's log, which can be read. Opaque; made by `LogStore::prepare`.
class LogSource;

/// The device's own store of log entries.
class LogStore {
 public:
  /// Called with a source, or with an error and no source.
  using Completion = std::function<void(std::shared_ptr<const LogSource> source,
                                        const std::optional<LogStoreError>& error)>;

  /// A handle to the store. Nothing is opened yet, so this cannot fail.
  static LogStore openLocal() { return {}; }

  /// Opens the store for reading. Calls `completion` once, on the calling thread, before it
  /// returns. A store without a log that can be read is an error. Logs that cannot be read are
  /// passed over when there are others.
  void prepare(const Completion& completion) const;
};

/// Delivers the entries of the device's log to a handler, on a thread of its own.
///
/// One thread makes, sets up, activates and destroys it; any may call `invalidate`. The handlers
/// run on the reader's thread, one call at a time; a reader that was activated releases them there.
class LogReader {
 public:
  using EntryHandler = std::function<void(const LogEntry& entry)>;
  /// `position` is the time of the last entry that was delivered, the start when there was none.
  using InvalidationHandler = std::function<void(unsigned long reason, LogTime position)>;

  /// `source` must not be null.
  explicit LogReader(std::shared_ptr<const LogSource> source);
  LogReader(const LogReader&) = delete;
  LogReader& operator=(const LogReader&) = delete;
  /// Invalidates the reader, and does not wait for its thread.
  ~LogReader();

  /// The `kLogReader...` flags, or'd.
  void setFlags(unsigned flags);

  /// Delivers only entries that pass `filter`, which has at least one comparison. Without a filter
  /// every entry is delivered.
  void setFilter(LogFilter filter);

  void setEntryHandler(EntryHandler handler);

  /// `handler` is called once, after the last entry, when the reader ends by itself.
  void setInvalidationHandler(InvalidationHandler handler);

  /// Starts delivering and returns at once. To be called once. Delivers the entries whose time is
  /// not before `from` and that are stored when the reading starts, which is presently; none that
  /// is logged later. They come in the order of being stored, also when the clock was set back, as
  /// far as the log tells that order; their own times may differ from it.
  void activate(LogTime from);

  /// Stops the reader. No handler is called any more, except that one call which has begun, or is
  /// about to, may still run to its end.
  void invalidate();

 private:
  class Session;

  std::shared_ptr<Session> session;
};
