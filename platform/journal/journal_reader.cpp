#include "platform/journal/journal_reader.h"

#include "platform/journal/entry_decoder.h"
#include "platform/journal/journal_files.h"

#include <algorithm>
#include <utility>

JournalReader::JournalReader(const std::optional<LogFilter>& filter, LogTime from)
    : selection(filter), start(from) {
  auto files = findJournalFiles(journalTime(from));
  complete = !files.damaged;
  for (auto& found : files.found) {
    auto& iterator =
        sources.emplace_back(JournalFileIterator(std::move(found), journalTime(from))).iterator;
    // The end of a live file is fixed now. Any other file is opened when its turn comes.
    if (iterator.journalFile().isLive) {
      iterator.start(selection);
    }
  }
  for (std::size_t file = 0; file < sources.size(); ++file) {
    for (std::size_t other = 0; other < sources.size(); ++other) {
      sources[file].openPredecessors += precedes(other, file) ? 1 : 0;
    }
    waitForTurn(file);
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
  if (!sources[*current].iterator.read(batch)) {
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
  auto& iterator = sources[*current].iterator;
  return iterator.journalFile().overlap.holds(iterator.realtime()) &&
         duplicates.isDuplicate(iterator.realtime(), iterator.cursor());
}

/// Steps to the current file's next entry. Ends the file's turn if another file has an older one.
void JournalReader::advance(bool selected) {
  auto& iterator = sources[*current].iterator;
  iterator.advance(selected);
  if (iterator.isClosed() || (!turns.empty() && turnOf(*current) > turns.top())) {
    waitForTurn(*std::exchange(current, std::nullopt));
  }
}

/// Gives the turn to the file whose next entry is the oldest. False when no file has one.
bool JournalReader::takeTurn() {
  while (!current && (!turns.empty() || releaseOne())) {
    if (turns.empty()) {
      continue;
    }
    const auto file = turns.top().file;
    turns.pop();
    if (sources[file].iterator.isWaiting()) {
      // Its first entry may turn out to be newer than it was taken for.
      sources[file].iterator.start(selection);
      waitForTurn(file);
    } else {
      current = file;
    }
  }
  return current.has_value();
}

JournalReader::Turn JournalReader::turnOf(std::size_t file) const {
  return {sources[file].iterator.reached(), file};
}

/// Has a file wait for its turn, unless it has to wait for others first or has no entry left.
void JournalReader::waitForTurn(std::size_t file) {
  if (sources[file].openPredecessors > 0) {
    return;
  }
  if (sources[file].iterator.isClosed()) {
    end(file);
  } else {
    turns.push(turnOf(file));
  }
}

/// Lets the files go on that had to wait for the closed `file`.
void JournalReader::end(std::size_t file) {
  complete = complete && !sources[file].iterator.isDamaged();
  for (std::size_t other = 0; other < sources.size(); ++other) {
    auto& waitsFor = sources[other].openPredecessors;
    if (waitsFor > 0 && precedes(file, other) && --waitsFor == 0) {
      waitForTurn(other);
    }
  }
}

/// Lets one file go on where files wait for each other, which damaged or forged ones may do. False
/// when none waits.
bool JournalReader::releaseOne() {
  const auto blocked = std::find_if(sources.begin(), sources.end(), [](const Source& source) {
    return source.openPredecessors > 0;
  });
  if (blocked == sources.end()) {
    return false;
  }
  blocked->openPredecessors = 0;
  waitForTurn(static_cast<std::size_t>(blocked - sources.begin()));
  return true;
}

/// Whether all of `left` was stored before `right`.
bool JournalReader::precedes(std::size_t left, std::size_t right) const {
  const auto& last = sources[left].iterator.journalFile().last;
  const auto& first = sources[right].iterator.journalFile().first;
  return left != right && last && first && isStoredBefore(*last, *first);
}
