#pragma once

#include "platform/clock.h"
#include "platform/journal/journal_files.h"

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <mutex>
#include <optional>
#include <vector>

/// Journal files that wait for a thread to read them, in the order of their first entries:
/// whichever comes to a file first takes it. From any thread.
class JournalFileQueue {
 public:
  /// Lets those of `files` wait that have entries from a point in time on. They are in the order of
  /// their first entries.
  JournalFileQueue(std::vector<JournalFile> files, LogTime from);

  /// Takes what each of some readers starts with: the files that grow are shared out, so that all
  /// of them are opened at once, and each reader gets one of the others, so that those which begin
  /// at one time are read at the same time.
  std::vector<std::vector<JournalFile>> takeFirst(std::size_t readers);

  /// Takes the file in front if its first entry may come before one of the file `number` that is
  /// stored at `realtime`.
  std::optional<JournalFile> takeBefore(std::uint64_t realtime, std::size_t number);

  /// Of the files that wait, none has its first entry before this, in microseconds.
  [[nodiscard]] std::uint64_t firstRealtime() const { return first; }

 private:
  std::optional<JournalFile> take();

  std::mutex mutex;
  std::vector<JournalFile> growing;  ///< Guarded by `mutex`.
  std::deque<JournalFile> waiting;   ///< Guarded by `mutex`.
  std::atomic<std::uint64_t> first = 0;
};
