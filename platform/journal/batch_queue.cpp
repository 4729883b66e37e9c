#include "platform/journal/batch_queue.h"

#include <utility>

namespace {

constexpr std::size_t kMostBatches = 24;
constexpr std::size_t kMostBytes = 6UL * 1024 * 1024;

}  // namespace

bool BatchQueue::push(EntryBatch& batch) {
  std::unique_lock lock(mutex);
  changed.wait(lock, [&] { return closed || hasRoomFor(batch); });
  if (closed) {
    return false;
  }
  if (batch.isEmpty()) {
    return true;
  }
  filledBytes += batch.byteCount();
  filled.push_back(std::move(batch));
  batch = EntryBatch();
  if (!emptied.empty()) {
    batch = std::move(emptied.back());
    emptied.pop_back();
  }
  changed.notify_all();
  return true;
}

/// Bounds the queue in batches and in bytes. One batch always has room, however large it is.
bool BatchQueue::hasRoomFor(const EntryBatch& batch) const {
  return filled.empty() ||
         (filled.size() < kMostBatches && filledBytes + batch.byteCount() <= kMostBytes);
}

void BatchQueue::finish() {
  const std::lock_guard lock(mutex);
  finished = true;
  changed.notify_all();
}

bool BatchQueue::pop(EntryBatch& batch) {
  std::unique_lock lock(mutex);
  batch.clear();
  emptied.push_back(std::move(batch));
  changed.wait(lock, [this] { return closed || finished || !filled.empty(); });
  if (closed || filled.empty()) {
    return false;
  }
  batch = std::move(filled.front());
  filled.pop_front();
  filledBytes -= batch.byteCount();
  changed.notify_all();
  return true;
}

void BatchQueue::close() {
  const std::lock_guard lock(mutex);
  closed = true;
  changed.notify_all();
}
