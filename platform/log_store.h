#pragma once

#include "platform/log_entry.h"
#include "platform/log_filter.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>

/// Flags of a reader. The reader that ships reads in this one way.
inline constexpr unsigned kLogReaderStoredOnly = 1U << 0U;     ///< Ends where the log ended.
inline constexpr unsigned kLogReaderOldestFirst = 1U << 2U;    ///< In the order of being stored.
inline constexpr unsigned kLogReaderWholeMessages = 1U << 4U;  ///< Texts are never cut off.

/// Why a reader ended.
inline constexpr unsigned long kLogReaderReadError = 1;    ///< The log could not be read on.
inline constexpr unsigned long kLogReaderUnsupported = 2;  ///< The flags are not ones it can do.
inline constexpr unsigned long kLogReaderAtEnd = 5;        ///< Everything was delivered.

/// Why a store could not be opened, in words for people.
struct LogStoreError {
  std::string description;
};

/// A log that can be read; opaque, made by `LogStore::prepare`.
class LogSource;

/// The device's own store of log entries.
class LogStore {
 public:
  /// Called with a source, or with an error and no source.
  using Completion = std::function<void(std::shared_ptr<const LogSource> source,
                                        const std::optional<LogStoreError>& error)>;

  /// A handle to the store. Nothing is opened yet, so this cannot fail.
  static LogStore openLocal() { return {}; }

  /// Opens the store for reading and calls `completion` once, on the calling thread, before it
  /// returns. A store with no log at all, or with none that can be read, is an error; of several
  /// logs, those that cannot be read are passed over.
  void prepare(const Completion& completion) const;
};

/// Delivers the entries of a source to a handler, on a thread of its own.
///
/// Made, set up, activated and destroyed on one thread; `invalidate` may be called from any. The
/// handlers run on the reader's thread, one call at a time, and are released with it.
class LogReader {
 public:
  using EntryHandler = std::function<void(const LogEntry& entry)>;
  /// `position` is the time of the last entry that was delivered, the start when there was none.
  using InvalidationHandler = std::function<void(unsigned long reason, LogTime position)>;

  /// A reader over `source`, which must not be null.
  explicit LogReader(std::shared_ptr<const LogSource> source);
  LogReader(const LogReader&) = delete;
  LogReader& operator=(const LogReader&) = delete;
  /// Invalidates the reader. Does not wait for a handler that is running after `invalidate`.
  ~LogReader();

  /// The `kLogReader...` flags, or'd.
  void setFlags(unsigned flags);

  /// Only entries that pass `filter`, of at least one comparison, are delivered. When it is not
  /// called, every entry is.
  void setFilter(LogFilter filter);

  void setEntryHandler(EntryHandler handler);

  /// Called once when the reader has ended by itself, after the last entry.
  void setInvalidationHandler(InvalidationHandler handler);

  /// Starts delivering the entries that are stored when the reading starts, which is presently, and
  /// whose time is not before `from`; returns at once. To be called once. They come in the order of
  /// being stored, which an entry's own time need not follow. What is logged after that is not
  /// delivered. When there is no thread to be had, the invalidation handler is called at once, on
  /// the calling thread.
  void activate(LogTime from);

  /// Stops the reader. No handler is called any more, but one call that has begun, or is about to,
  /// may still run to its end.
  void invalidate();

 private:
  class Session;

  std::shared_ptr<Session> session;
};
