#include "platform/journal/journal_reading.h"

#include "platform/journal/entry_decoder.h"

#include <algorithm>
#include <functional>
#include <limits>
#include <tuple>
#include <utility>

namespace {

/// How many entries are looked at before the reading comes back without a full batch.
constexpr std::size_t kStepsAtOnce = 4096;

}  // namespace

bool JournalReading::Turn::operator>(const Turn& other) const {
  return std::tie(reached, number) > std::tie(other.reached, other.number);
}

JournalReading::JournalReading(std::vector<JournalFile> own, JournalFileQueue& others,
                               const std::optional<LogFilter>& filter, LogTime from)
    : selection(filter), start(from), files(others) {
  for (auto& file : own) {
    const bool grows = file.grows;
    auto& scan = add(std::move(file));
    // The end of a file that does not change can wait to be found until its turn comes.
    if (grows) {
      scan.start(selection);
    }
    waitForTurn(scan);
  }
}

bool JournalReading::read(EntryBatch& batch) {
  for (std::size_t steps = 0; steps < kStepsAtOnce && !batch.isFull(); ++steps) {
    if (current == nullptr && !takeTurn()) {
      return false;
    }
    advance(readEntry(batch));
  }
  return true;
}

/// Puts the current file's entry into `batch`, if it can be read and is wanted, and returns whether
/// that is so.
bool JournalReading::readEntry(EntryBatch& batch) {
  if (!current->read(batch)) {
    return false;
  }
  const bool wanted = isWanted(batch);
  if (!wanted) {
    batch.dropLast();
  }
  return wanted;
}

bool JournalReading::isWanted(const EntryBatch& batch) const {
  const auto last = batch.size() - 1;
  const auto sourceTime = batch.valueOf(last, JournalField::SourceTime);
  return entryTime(sourceTime, batch.stampOf(last).realtime) >= start &&
         (selection.isEverything() || selection.selects(batch.valuesOf(last)));
}

/// Goes to the current file's next entry, and lets another file have its turn if that is older.
void JournalReading::advance(bool selected) {
  current->advance(selected);
  const Turn next{current->reached(), current->fileNumber()};
  if (!current->isOpen() || files.firstRealtime() <= next.reached ||
      (!turns.empty() && next > turns.front())) {
    waitForTurn(*std::exchange(current, nullptr));
  }
}

/// Gives the turn to the file whose next entry is the oldest. False when no file has one left.
bool JournalReading::takeTurn() {
  while (current == nullptr) {
    while (takeFile()) {
    }
    if (turns.empty()) {
      return false;
    }
    std::pop_heap(turns.begin(), turns.end(), std::greater<>());
    auto& next = scans.at(turns.back().number);
    turns.pop_back();
    if (next.isStarted()) {
      current = &next;
    } else {
      next.start(selection);
      waitForTurn(next);
    }
  }
  return true;
}

/// Takes a file that nobody reads, when it may have an entry that is older than any other here.
bool JournalReading::takeFile() {
  constexpr Turn kEnd{std::numeric_limits<std::uint64_t>::max(),
                      std::numeric_limits<std::size_t>::max()};
  const auto& limit = turns.empty() ? kEnd : turns.front();
  auto file = files.takeBefore(limit.reached, limit.number);
  if (file) {
    waitForTurn(add(std::move(*file)));
  }
  return file.has_value();
}

JournalFileScan& JournalReading::add(JournalFile file) {
  const auto number = file.number;
  return scans.try_emplace(number, std::move(file), start).first->second;
}

/// Has the scan wait, or go when it has come to its end.
void JournalReading::waitForTurn(JournalFileScan& scan) {
  if (scan.isOpen()) {
    turns.push_back({scan.reached(), scan.fileNumber()});
    std::push_heap(turns.begin(), turns.end(), std::greater<>());
  } else {
    complete = complete && !scan.isDamaged();
    scans.erase(scan.fileNumber());
  }
}
