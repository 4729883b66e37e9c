#include "platform/journal/journal_reader.h"

#include "platform/journal/entry_decoder.h"
#include "platform/journal/journal_files.h"

#include <algorithm>
#include <limits>

JournalReader::JournalReader(const std::optional<LogFilter>& filter, LogTime from)
    : selection(filter), start(from) {
  // A time of 0 stands for none.
  const auto earliest =
      static_cast<std::uint64_t>(std::max<LogTime::rep>(from.time_since_epoch().count(), 1));
  auto files = findJournalFiles(earliest);
  complete = !files.damaged;
  for (auto& found : files.found) {
    sources.push_back({JournalFileIterator(std::move(found), earliest)});
    auto& iterator = sources.back().iterator;
    // The end of a live file is fixed now. Any other file is opened when its turn comes.
    if (iterator.journalFile().isLive) {
      iterator.start(selection);
    }
  }
  for (auto& file : sources) {
    file.openPredecessors = static_cast<std::size_t>(
        std::count_if(sources.begin(), sources.end(),
                      [&](const Source& other) { return precedes(other, file); }));
  }
}

bool JournalReader::read(EntryBatch& batch) {
  constexpr std::size_t kMostSteps = 4096;
  for (std::size_t steps = 0; steps < kMostSteps && !batch.isFull(); ++steps) {
    if (current == nullptr && !takeTurn()) {
      return false;
    }
    advance(readEntry(batch));
  }
  return true;
}

/// Appends the current entry to `batch` if it can be read, is selected and no duplicate. Returns
/// whether it is selected.
bool JournalReader::readEntry(EntryBatch& batch) {
  if (!current->iterator.read(batch)) {
    return false;
  }
  const bool selected = isSelected(batch);
  if (!selected || isDuplicate()) {
    batch.dropLast();
  }
  return selected;
}

/// Whether the last entry of `batch` is selected.
bool JournalReader::isSelected(const EntryBatch& batch) const {
  const auto last = batch.size() - 1;
  const auto sourceTime = batch.valueOf(last, JournalField::SourceTime);
  return entryTime(sourceTime, batch.realtimeOf(last)) >= start &&
         (selection.isEverything() || selection.selects(batch.valuesOf(last)));
}

/// Whether the current entry was read before, from another file.
bool JournalReader::isDuplicate() {
  auto& iterator = current->iterator;
  return iterator.journalFile().overlap.holds(iterator.realtime()) &&
         duplicates.isDuplicate(iterator.realtime(), iterator.cursor());
}

/// Steps to the current file's next entry. Ends the file's turn if another file has an older one.
void JournalReader::advance(bool selected) {
  current->iterator.advance(selected);
  if (current->iterator.isClosed() || turnOf(*current) > nextTurn) {
    current = nullptr;
  }
}

/// Gives the turn to the file whose next entry is the oldest. False when no file has one.
bool JournalReader::takeTurn() {
  while (current == nullptr && !sources.empty()) {
    const auto first = std::min_element(
        sources.begin(), sources.end(),
        [](const Source& left, const Source& right) { return turnOf(left) < turnOf(right); });
    if (first->iterator.isClosed()) {
      end(first);
    } else if (first->iterator.isWaiting()) {
      // Its first entry may turn out to be newer than it was taken for.
      first->iterator.start(selection);
    } else {
      current = &*first;
    }
  }
  nextTurn = {true, std::numeric_limits<std::uint64_t>::max()};
  for (const auto& source : sources) {
    nextTurn = &source == current ? nextTurn : std::min(nextTurn, turnOf(source));
  }
  return current != nullptr;
}

/// Lets the files go on that had to wait for the closed `file`.
void JournalReader::end(std::vector<Source>::iterator file) {
  complete = complete && !file->iterator.isDamaged();
  for (auto& other : sources) {
    other.openPredecessors -= precedes(*file, other) ? 1 : 0;
  }
  sources.erase(file);
}

JournalReader::Turn JournalReader::turnOf(const Source& file) {
  return {file.openPredecessors > 0, file.iterator.reached()};
}

/// Whether all of `left` was stored before `right`.
bool JournalReader::precedes(const Source& left, const Source& right) {
  const auto& last = left.iterator.journalFile().last;
  const auto& first = right.iterator.journalFile().first;
  return &left != &right && last && first && isStoredBefore(*last, *first);
}
