#pragma once

#include "platform/linux/journal/journal_files.h"

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
  /// Lets `files` wait, which are in that order.
  explicit JournalFileQueue(std::vector<JournalFile> files);

  /// Takes a file that grows. They do not wait like the others, so that all of them are soon
  /// opened.
  std::optional<JournalFile> takeGrowing();

  /// Takes the first of the others if an entry of it may come before one that was stored at
  /// `realtime` in the file `number`.
  std::optional<JournalFile> takeBefore(std::uint64_t realtime, std::size_t number);

  /// No entry of these others was stored before this, in microseconds.
  [[nodiscard]] std::uint64_t firstRealtime() const { return first; }

 private:
  void noteFirst();

  std::mutex mutex;
  std::deque<JournalFile> growing;  ///< Guarded by `mutex`.
  std::deque<JournalFile> closed;   ///< Guarded by `mutex`.
  std::atomic<std::uint64_t> first;
};
