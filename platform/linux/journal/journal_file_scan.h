#pragma once

#include "platform/clock.h"
#include "platform/linux/journal/entry_batch.h"
#include "platform/linux/journal/journal_files.h"
#include "platform/linux/journal/log_selection.h"

#include <cstdint>
#include <string>

/// Walks through the entries of one journal file, from a point in time up to what is stored when
/// the walk is started, in the order in which they were stored. With the help of the file's index
/// it passes over entries that are not selected, but not over all of them. On one thread.
class JournalFileScan {
 public:
  /// A walk that is not started.
  JournalFileScan(JournalFile file, LogTime from);

  /// Whether there may be entries to come. When there are none, the file is closed.
  [[nodiscard]] bool isOpen() const { return journal != nullptr; }

  [[nodiscard]] bool isStarted() const { return started; }

  /// Fixes the end and goes to the first entry.
  void start(const LogSelection& selection);

  /// Whether something in the file could not be read, and is missing.
  [[nodiscard]] bool isDamaged() const { return damaged; }

  /// When the entry at which the walk is was stored, in microseconds; of a walk that is not started
  /// no later than its first entry. It never goes back, but in a file whose machine's clock did.
  [[nodiscard]] std::uint64_t realtime() const { return currentRealtime; }

  /// The cursor of that entry, see sd_journal_get_cursor(3); empty when there is none to be had.
  [[nodiscard]] std::string cursor() const;

  /// Puts the entry into `batch`, under `stamp`. False, with nothing put there, when it cannot be
  /// read.
  bool read(EntryBatch::Stamp stamp, EntryBatch& batch);

  /// Goes to the next entry.
  void advance();

 private:
  bool isTailReadable();
  bool useIndex(const LogSelection& selection);
  bool isIndexWorthwhile(std::size_t matches, const LogSelection& selection);
  bool findEnd();
  bool seekStart();
  void close(bool complete);

  JournalPtr journal;
  std::uint64_t earliest = 0;  ///< Where to start.
  std::uint64_t currentRealtime = 0;
  std::uint64_t endRealtime = 0;
  std::string endCursor;
  bool started = false;
  bool atEnd = false;  ///< Whether the walk is at the last entry.
  bool damaged = false;
};
