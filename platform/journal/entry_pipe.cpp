#include "platform/journal/entry_pipe.h"

#include <utility>

namespace {

constexpr std::size_t kMostFilled = 24;
constexpr std::size_t kMostBytes = 6UL * 1024 * 1024;

}  // namespace

bool EntryPipe::push(EntryBatch& batch) {
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

/// Whether what is under way stays within bounds; one batch can go, however long its messages are.
bool EntryPipe::hasRoomFor(const EntryBatch& batch) const {
  return filled.empty() ||
         (filled.size() < kMostFilled && filledBytes + batch.byteCount() <= kMostBytes);
}

void EntryPipe::finish() {
  const std::lock_guard lock(mutex);
  finished = true;
  changed.notify_all();
}

bool EntryPipe::pop(EntryBatch& batch) {
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

void EntryPipe::close() {
  const std::lock_guard lock(mutex);
  closed = true;
  changed.notify_all();
}
