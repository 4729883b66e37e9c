#include "platform/linux/journal/journal_reading.h"

#include "platform/linux/journal/entry_decoder.h"

#include <algorithm>
#include <functional>
#include <tuple>
#include <utility>

namespace {

/// How many entries are looked at before the reading comes back without a full batch.
constexpr std::size_t kStepsAtOnce = 4096;

/// One part of a cursor: what stands behind `key` and "=".
std::string_view partOf(std::string_view cursor, char key) {
  while (!cursor.empty()) {
    const auto part = cursor.substr(0, cursor.find(';'));
    if (part.starts_with(key)) {
      return part;
    }
    cursor.remove_prefix(std::min(part.size() + 1, cursor.size()));
  }
  return {};
}

/// Whether two entries of different files are one and the same: the system copies entries from file
/// to file, for instance when the disk becomes writable. Entries of one sequence go by their number
/// in it, others by boot, times and the hash of their content.
bool isSameEntry(const EntryBatch::Stamp& left, const EntryBatch::Stamp& right) {
  const auto equal = [&](char key) {
    return partOf(left.cursor, key) == partOf(right.cursor, key);
  };
  if (left.file == right.file || left.cursor.empty() || right.cursor.empty()) {
    return false;
  }
  return equal('s') ? equal('i') : equal('b') && equal('m') && equal('t') && equal('x');
}

/// Whether the last entry is one that another file has given already.
bool isLastACopy(const EntryBatch& batch) {
  const auto& last = batch.stampOf(batch.size() - 1);
  for (auto at = batch.size() - 1; at-- > 0 && batch.stampOf(at).realtime == last.realtime;) {
    if (isSameEntry(batch.stampOf(at), last)) {
      return true;
    }
  }
  return false;
}

}  // namespace

bool JournalReading::Turn::operator>(const Turn& other) const {
  return std::tie(realtime, file) > std::tie(other.realtime, other.file);
}

JournalReading::JournalReading(const std::optional<LogFilter>& filter, LogTime from)
    : selection(filter), start(from) {
  auto opened = openJournalFiles();
  allOpened = !opened.damaged;
  for (auto& file : opened.opened) {
    const bool grows = file.grows;
    files.emplace_back(std::move(file), from);
    // The end of a file that does not change can wait to be found until its turn comes.
    if (grows && files.back().isOpen()) {
      files.back().start(selection);
    }
    waitForTurn(files.size() - 1);
  }
}

bool JournalReading::read(EntryBatch& batch) {
  std::uint64_t realtime = 0;
  // Entries of a time that several files have stay in one batch, where copies are found.
  for (std::size_t steps = 0;
       (steps < kStepsAtOnce && !batch.isFull()) || (sharedTime == realtime && isNextAt(realtime));
       ++steps) {
    if (!current && !takeTurn()) {
      return false;
    }
    realtime = files[*current].realtime();
    readEntry(batch);
    advance();
  }
  return true;
}

bool JournalReading::isComplete() const {
  return allOpened && std::none_of(files.begin(), files.end(),
                                   [](const JournalFileScan& file) { return file.isDamaged(); });
}

/// Puts the current file's entry into `batch`, if it can be read and is wanted.
void JournalReading::readEntry(EntryBatch& batch) {
  auto& file = files[*current];
  EntryBatch::Stamp stamp{file.realtime(), *current, {}};
  if (!turns.empty() && turns.front().realtime == stamp.realtime) {
    sharedTime = stamp.realtime;
  }
  const bool mayBeACopy = sharedTime == stamp.realtime;
  if (mayBeACopy) {
    stamp.cursor = file.cursor();
  }
  if (file.read(std::move(stamp), batch) &&
      (!isWanted(batch) || (mayBeACopy && isLastACopy(batch)))) {
    batch.dropLast();
  }
}

bool JournalReading::isWanted(const EntryBatch& batch) const {
  const auto last = batch.size() - 1;
  const auto sourceTime = batch.valueOf(last, JournalField::SourceTime);
  return entryTime(sourceTime, batch.stampOf(last).realtime) >= start &&
         (selection.isEverything() || selection.selects(batch.valuesOf(last)));
}

/// Goes to the current file's next entry, and lets another file have its turn if that is older.
void JournalReading::advance() {
  auto& file = files[*current];
  file.advance();
  if (!file.isOpen() || (!turns.empty() && Turn{file.realtime(), *current} > turns.front())) {
    waitForTurn(*std::exchange(current, std::nullopt));
  }
}

void JournalReading::waitForTurn(std::size_t file) {
  if (files[file].isOpen()) {
    turns.push_back({files[file].realtime(), file});
    std::push_heap(turns.begin(), turns.end(), std::greater<>());
  }
}

/// Gives the turn to the file whose next entry is the oldest. False when no file has one left.
bool JournalReading::takeTurn() {
  while (!current && !turns.empty()) {
    std::pop_heap(turns.begin(), turns.end(), std::greater<>());
    const auto next = turns.back().file;
    turns.pop_back();
    if (files[next].isStarted()) {
      current = next;
    } else {
      files[next].start(selection);
      waitForTurn(next);
    }
  }
  return current.has_value();
}

/// Whether the next entry was stored at `realtime`.
bool JournalReading::isNextAt(std::uint64_t realtime) const {
  return current ? files[*current].realtime() == realtime
                 : !turns.empty() && turns.front().realtime == realtime;
}
