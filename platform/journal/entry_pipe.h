#pragma once

#include "platform/journal/entry_batch.h"

#include <condition_variable>
#include <deque>
#include <mutex>
#include <vector>

/// Carries batches from a thread that reads to the thread that delivers, so much at a time that the
/// one can be ahead of the other, and the emptied ones back.
class EntryPipe {
 public:
  /// Hands on `batch`, unless it is empty, and leaves an empty one in its place; waits for room.
  /// False, and the entries are gone, when the pipe was closed. By the reading thread.
  bool push(EntryBatch& batch);

  /// Says that nothing more will come. By the reading thread.
  void finish();

  /// Swaps `batch` for the next one; waits for it. False when nothing more will come or the pipe
  /// was closed. By the delivering thread.
  bool pop(EntryBatch& batch);

  /// Says that nothing more is wanted, and ends every wait. From any thread.
  void close();

 private:
  [[nodiscard]] bool hasRoomFor(const EntryBatch& batch) const;

  std::mutex mutex;
  std::condition_variable changed;
  std::deque<EntryBatch> filled;    ///< Guarded by `mutex`.
  std::size_t filledBytes = 0;      ///< In all of these. Guarded by `mutex`.
  std::vector<EntryBatch> emptied;  ///< Guarded by `mutex`.
  bool finished = false;            ///< Guarded by `mutex`.
  bool closed = false;              ///< Guarded by `mutex`.
};
