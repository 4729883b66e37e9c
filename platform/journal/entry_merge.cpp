#include "platform/journal/entry_merge.h"

#include <algorithm>
#include <tuple>

EntryMerge::EntryMerge(std::span<EntryPipe> pipes) {
  for (auto& pipe : pipes) {
    sources.push_back({&pipe, {}, 0});
  }
}

bool EntryMerge::next() {
  bool found = goToOldest();
  while (found && copies.isCopy(stamp())) {
    found = goToOldest();
  }
  return found;
}

bool EntryMerge::goToOldest() {
  if (current != nullptr) {
    ++current->at;
  }
  std::erase_if(sources, [](Source& source) {
    if (source.at < source.batch.size()) {
      return false;
    }
    source.at = 0;
    return !source.pipe->pop(source.batch);
  });
  const auto oldest =
      std::min_element(sources.begin(), sources.end(), [](const Source& left, const Source& right) {
        const auto& first = left.batch.stampOf(left.at);
        const auto& second = right.batch.stampOf(right.at);
        return std::tie(first.reached, first.file) < std::tie(second.reached, second.file);
      });
  current = oldest != sources.end() ? &*oldest : nullptr;
  return current != nullptr;
}

JournalValues EntryMerge::values() const {
  return current->batch.valuesOf(current->at);
}
