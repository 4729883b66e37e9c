#include "platform/journal/journal_file_queue.h"

#include <algorithm>
#include <limits>
#include <tuple>
#include <utility>

JournalFileQueue::JournalFileQueue(std::vector<JournalFile> files, LogTime from) {
  const auto earliest = journalTime(from);
  for (auto& file : files) {
    file.stored.first = std::max(file.stored.first, earliest);
    if (file.stored.first > file.stored.last) {
      continue;
    }
    if (file.grows) {
      growing.push_back(std::move(file));
    } else {
      waiting.push_back(std::move(file));
    }
  }
}

std::vector<std::vector<JournalFile>> JournalFileQueue::takeFirst(std::size_t readers) {
  const std::lock_guard lock(mutex);
  std::vector<std::vector<JournalFile>> taken(readers);
  for (std::size_t at = 0; at < growing.size(); ++at) {
    taken[at % readers].push_back(std::move(growing[at]));
  }
  growing.clear();
  for (auto& files : taken) {
    if (auto file = take()) {
      files.push_back(std::move(*file));
    }
  }
  return taken;
}

std::optional<JournalFile> JournalFileQueue::takeBefore(std::uint64_t realtime,
                                                        std::size_t number) {
  const std::lock_guard lock(mutex);
  const bool mayBeBefore =
      !waiting.empty() &&
      std::tie(waiting.front().stored.first, waiting.front().number) <= std::tie(realtime, number);
  return mayBeBefore ? take() : std::nullopt;
}

/// Takes the file in front, if there is one.
std::optional<JournalFile> JournalFileQueue::take() {
  std::optional<JournalFile> file;
  if (!waiting.empty()) {
    file = std::move(waiting.front());
    waiting.pop_front();
  }
  first =
      waiting.empty() ? std::numeric_limits<std::uint64_t>::max() : waiting.front().stored.first;
  return file;
}
