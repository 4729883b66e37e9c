#include "platform/journal/journal_reader.h"

#include "platform/journal/entry_decoder.h"
#include "platform/journal/journal_files.h"

#include <utility>

JournalReader::JournalReader(const std::optional<LogFilter>& filter, LogTime from)
    : selection(filter), start(from) {
  auto files = findJournalFiles(journalTime(from));
  complete = !files.damaged;
  iterators.reserve(files.found.size());
  for (auto& file : files.found) {
    const bool isLive = file.isLive;
    auto& iterator = iterators.emplace_back(std::move(file), journalTime(from));
    // The end of a live file is fixed now. Any other file is opened when its turn comes.
    if (isLive) {
      iterator.start(selection);
    }
    waitForTurn(iterators.size() - 1);
  }
}

bool JournalReader::read(EntryBatch& batch) {
  constexpr std::size_t kMostSteps = 4096;
  for (std::size_t steps = 0; steps < kMostSteps && !batch.isFull(); ++steps) {
    if (!current && !takeTurn()) {
      return false;
    }
    advance(readEntry(batch));
  }
  return true;
}

/// Appends the current entry to `batch` if it can be read, is selected and no duplicate. Returns
/// whether it is selected.
bool JournalReader::readEntry(EntryBatch& batch) {
  if (!iterators[*current].read(batch)) {
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
  auto& iterator = iterators[*current];
  return iterator.isInOverlap() && duplicates.isDuplicate(iterator.realtime(), iterator.cursor());
}

/// Steps to the current file's next entry. Ends the file's turn if another file has an older one.
void JournalReader::advance(bool selected) {
  auto& iterator = iterators[*current];
  iterator.advance(selected);
  if (iterator.isClosed() || (!turns.empty() && Turn{iterator.reached(), *current} > turns.top())) {
    waitForTurn(*std::exchange(current, std::nullopt));
  }
}

/// Gives the turn to the file whose next entry is the oldest. False when no file has one.
bool JournalReader::takeTurn() {
  while (!current && !turns.empty()) {
    const auto file = turns.top().file;
    turns.pop();
    if (iterators[file].isWaiting()) {
      // Its first entry may turn out to be newer than it was taken for.
      iterators[file].start(selection);
      waitForTurn(file);
    } else {
      current = file;
    }
  }
  return current.has_value();
}

/// Has a file wait for its turn, unless it has no entry left.
void JournalReader::waitForTurn(std::size_t file) {
  const auto& iterator = iterators[file];
  if (iterator.isClosed()) {
    complete = complete && !iterator.isDamaged();
  } else {
    turns.push({iterator.reached(), file});
  }
}
