#pragma once

#include "platform/journal/entry_batch.h"

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <mutex>
#include <vector>

/// A bounded queue of batches from the reading thread to the delivering thread. Emptied batches go
/// back through it, so that their memory is used again.
class BatchQueue {
 public:
  /// Appends `batch`, unless it is empty, and leaves an empty one in its place. Waits for room.
  /// False, with the entries dropped, when the queue is closed. By the reading thread.
  bool push(EntryBatch& batch);

  /// Says that no more batches will come. By the reading thread.
  void finish();

  /// Replaces `batch` by the next one. Waits for it. False when no more will come or the queue is
  /// closed. By the delivering thread.
  bool pop(EntryBatch& batch);

  /// Drops what is queued and ends every wait. From any thread.
  void close();

 private:
  [[nodiscard]] bool hasRoomFor(const EntryBatch& batch) const;

  std::mutex mutex;
  std::condition_variable changed;
  std::deque<EntryBatch> filled;    ///< Guarded by `mutex`.
  std::size_t filledBytes = 0;      ///< Of all batches in `filled`. Guarded by `mutex`.
  std::vector<EntryBatch> emptied;  ///< Guarded by `mutex`.
  bool finished = false;            ///< Guarded by `mutex`.
  bool closed = false;              ///< Guarded by `mutex`.
};
