#include "platform/journal/journal_reader.h"

#include "platform/journal/entry_decoder.h"
#include "platform/journal/journal_files.h"

#include <sys/resource.h>

#include <algorithm>
#include <utility>

namespace {

/// Raises the soft limit of open files, which is kept low for programs that use select(2), as far
/// as it can be.
void raiseFileLimit() {
  struct rlimit limit {};
  getrlimit(RLIMIT_NOFILE, &limit);
  limit.rlim_cur = limit.rlim_max;
  setrlimit(RLIMIT_NOFILE, &limit);
}

}  // namespace

JournalReader::JournalReader(const std::optional<LogFilter>& filter, LogTime from)
    : selection(filter), start(from) {
  // A time of 0 stands for none.
  const auto earliest =
      static_cast<std::uint64_t>(std::max<LogTime::rep>(from.time_since_epoch().count(), 1));
  raiseFileLimit();
  auto found = findJournalFiles(earliest);
  missedFiles = std::move(found.missed);
  for (auto& journalFile : found.found) {
    auto& file = files.emplace_back(std::move(journalFile), earliest);
    // The end of a live file is fixed now. Any other file is opened when its turn comes.
    if (file.journalFile().isLive) {
      file.start(selection);
    }
    turns.add(file.journalFile().first, file.journalFile().last, file.reached());
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
  if (!current->read(batch)) {
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
  return current->journalFile().overlap.holds(current->realtime()) &&
         duplicates.isDuplicate(current->realtime(), current->cursor());
}

/// Steps to the current file's next entry. Ends the file's turn if another file has an older one.
void JournalReader::advance(bool selected) {
  current->advance(selected);
  // A file that closes here is ranked by how far it came, too: others may have to wait for it.
  if (!turns.reach(current->reached()) || current->isClosed()) {
    current = nullptr;
  }
}

/// Gives the turn to the file whose next entry is the oldest. False when no file has one.
bool JournalReader::takeTurn() {
  while (const auto next = turns.next()) {
    auto& file = files[*next];
    if (file.isClosed()) {
      if (!file.status().isWhole()) {
        missedFiles.insert(file.status());
      }
      turns.end();
    } else if (file.isWaiting()) {
      // Its first entry may turn out to be newer than it was taken for.
      file.start(selection);
      turns.reach(file.reached());
    } else {
      current = &file;
      return true;
    }
  }
  return false;
}
