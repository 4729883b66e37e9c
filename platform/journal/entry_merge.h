#pragma once

#include "platform/journal/entry_copies.h"
#include "platform/journal/entry_pipe.h"

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

/// Merges the entries from several pipes, in each of which the oldest comes first, and leaves out
/// those that are copies of others. On the delivering thread.
class EntryMerge {
 public:
  /// `pipes` must last longer.
  explicit EntryMerge(std::span<EntryPipe> pipes);

  /// Goes to the next entry; waits for it. False when there is none.
  bool next();

  /// When the entry was stored, in microseconds.
  [[nodiscard]] std::uint64_t realtime() const { return stamp().realtime; }

  /// Its values; good until the next call of `next`.
  [[nodiscard]] JournalValues values() const;

 private:
  /// What has come through one pipe and is not passed on yet.
  struct Source {
    EntryPipe* pipe = nullptr;
    EntryBatch batch;
    std::size_t at = 0;
  };

  bool goToOldest();
  [[nodiscard]] const EntryBatch::Stamp& stamp() const {
    return current->batch.stampOf(current->at);
  }

  std::vector<Source> sources;  ///< Those that have, or may get, an entry.
  Source* current = nullptr;
  EntryCopies copies;
};
