#include "platform/linux/journal/entry_pipe.h"

#include <utility>

namespace {

constexpr std::size_t kMostFilled = 24;

}  // namespace

bool EntryPipe::push(EntryBatch& batch) {
  std::unique_lock lock(mutex);
  changed.wait(lock, [this] { return closed || filled.size() < kMostFilled; });
  if (closed) {
    return false;
  }
  if (batch.isEmpty()) {
    return true;
  }
  filled.push_back(std::move(batch));
  batch = EntryBatch();
  if (!emptied.empty()) {
    batch = std::move(emptied.back());
    emptied.pop_back();
  }
  changed.notify_all();
  return true;
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
  changed.notify_all();
  return true;
}

void EntryPipe::close() {
  const std::lock_guard lock(mutex);
  closed = true;
  changed.notify_all();
}
