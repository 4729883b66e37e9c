#include "platform/journal/turns.h"

#include <algorithm>
#include <limits>

void Turns::add(std::optional<JournalPlace> first, std::optional<JournalPlace> last,
                std::uint64_t reached) {
  File added{files.size(), std::move(first), std::move(last), reached};
  for (auto& file : files) {
    added.openPredecessors += precedes(file, added) ? 1 : 0;
    file.openPredecessors += precedes(added, file) ? 1 : 0;
  }
  files.push_back(std::move(added));
}

std::optional<std::size_t> Turns::next() {
  if (files.empty()) {
    return std::nullopt;
  }
  current = 0;
  following = {true, std::numeric_limits<std::uint64_t>::max()};
  for (std::size_t at = 1; at < files.size(); ++at) {
    if (rankOf(files[at]) < rankOf(files[current])) {
      following = rankOf(files[std::exchange(current, at)]);
    } else {
      following = std::min(following, rankOf(files[at]));
    }
  }
  return files[current].number;
}

bool Turns::reach(std::uint64_t time) {
  files[current].reached = time;
  return rankOf(files[current]) <= following;
}

void Turns::end() {
  const auto ended = files.begin() + static_cast<std::ptrdiff_t>(current);
  for (auto& file : files) {
    file.openPredecessors -= precedes(*ended, file) ? 1 : 0;
  }
  files.erase(ended);
}

/// Whether all of `left` was stored before `right`.
bool Turns::precedes(const File& left, const File& right) {
  return left.last && right.first && isStoredBefore(*left.last, *right.first);
}
