#include "platform/linux/journal/journal_reading.h"

#include "platform/linux/journal/entry_decoder.h"

#include <algorithm>
#include <functional>
#include <tuple>
#include <utility>

namespace {

/// How many entries are looked at before the reading comes back without a full batch.
constexpr std::size_t kStepsAtOnce = 4096;

}  // namespace

bool JournalReading::Turn::operator>(const Turn& other) const {
  return std::tie(realtime, scan) > std::tie(other.realtime, other.scan);
}

JournalReading::JournalReading(std::vector<JournalFile> files,
                               const std::optional<LogFilter>& filter, LogTime from)
    : selection(filter), start(from) {
  for (auto& file : files) {
    const bool grows = file.grows;
    scans.emplace_back(std::move(file), from);
    // The end of a file that does not change can wait to be found until its turn comes.
    if (grows && scans.back().isOpen()) {
      scans.back().start(selection);
    }
    waitForTurn(scans.size() - 1);
  }
}

bool JournalReading::read(EntryBatch& batch) {
  for (std::size_t steps = 0; steps < kStepsAtOnce && !batch.isFull(); ++steps) {
    if (!current && !takeTurn()) {
      return false;
    }
    advance(readEntry(batch));
  }
  return true;
}

bool JournalReading::isComplete() const {
  return std::none_of(scans.begin(), scans.end(),
                      [](const JournalFileScan& scan) { return scan.isDamaged(); });
}

/// Puts the current file's entry into `batch`, if it can be read and is wanted, and returns whether
/// that is so.
bool JournalReading::readEntry(EntryBatch& batch) {
  if (!scans[*current].read(batch)) {
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
  auto& scan = scans[*current];
  scan.advance(selected);
  if (!scan.isOpen() || (!turns.empty() && Turn{scan.realtime(), *current} > turns.front())) {
    waitForTurn(*std::exchange(current, std::nullopt));
  }
}

void JournalReading::waitForTurn(std::size_t scan) {
  if (scans[scan].isOpen()) {
    turns.push_back({scans[scan].realtime(), scan});
    std::push_heap(turns.begin(), turns.end(), std::greater<>());
  }
}

/// Gives the turn to the file whose next entry is the oldest. False when no file has one left.
bool JournalReading::takeTurn() {
  while (!current && !turns.empty()) {
    std::pop_heap(turns.begin(), turns.end(), std::greater<>());
    const auto next = turns.back().scan;
    turns.pop_back();
    if (scans[next].isStarted()) {
      current = next;
    } else {
      scans[next].start(selection);
      waitForTurn(next);
    }
  }
  return current.has_value();
}
