#include "platform/linux/journal/journal_file_queue.h"

#include <limits>
#include <tuple>
#include <utility>

namespace {

JournalFile takeFirst(std::deque<JournalFile>& files) {
  auto file = std::move(files.front());
  files.pop_front();
  return file;
}

}  // namespace

JournalFileQueue::JournalFileQueue(std::vector<JournalFile> files) {
  for (auto& file : files) {
    (file.grows ? growing : closed).push_back(std::move(file));
  }
  noteFirst();
}

std::optional<JournalFile> JournalFileQueue::takeGrowing() {
  const std::lock_guard lock(mutex);
  return growing.empty() ? std::nullopt : std::optional(takeFirst(growing));
}

std::optional<JournalFile> JournalFileQueue::takeBefore(std::uint64_t realtime,
                                                        std::size_t number) {
  const std::lock_guard lock(mutex);
  if (closed.empty() ||
      std::tie(realtime, number) < std::tie(closed.front().stored.first, closed.front().number)) {
    return std::nullopt;
  }
  auto file = takeFirst(closed);
  noteFirst();
  return file;
}

void JournalFileQueue::noteFirst() {
  first = closed.empty() ? std::numeric_limits<std::uint64_t>::max() : closed.front().stored.first;
}
