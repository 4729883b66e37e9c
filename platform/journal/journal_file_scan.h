#pragma once

#include "platform/clock.h"
#include "platform/journal/entry_batch.h"
#include "platform/journal/journal_files.h"
#include "platform/journal/log_selection.h"
#include "platform/journal/way_choice.h"

#include <cstdint>
#include <string>
#include <vector>

/// Walks through the entries of one journal file, from a point in time up to what is stored when
/// the walk is started, in the order in which they were stored. With the help of the file's index
/// it passes over entries that are not selected, but not over all of them. On one thread.
class JournalFileScan {
 public:
  /// A walk that is not started, through a file that has entries from then on.
  JournalFileScan(JournalFile found, LogTime from);

  [[nodiscard]] std::size_t fileNumber() const { return number; }

  /// Whether there may be entries to come. When there are none, the file is closed.
  [[nodiscard]] bool isOpen() const { return open; }

  [[nodiscard]] bool isStarted() const { return started; }

  /// Fixes the end and goes to the first entry.
  void start(const LogSelection& selection);

  /// Whether something in the file could not be read, and is missing.
  [[nodiscard]] bool isDamaged() const { return damaged; }

  /// When the entry at which the walk is was stored, in microseconds, or an earlier one if that was
  /// later, as the machine's clock may have been set back; of a walk that is not started no later
  /// than its first entry.
  [[nodiscard]] std::uint64_t reached() const { return latestRealtime; }

  /// Puts the entry into `batch`. False, with nothing put there, when it cannot be read.
  bool read(EntryBatch& batch);

  /// Goes to the next entry. `selected` tells whether the one it leaves was.
  void advance(bool selected);

 private:
  bool reopen();
  bool findEnd();
  bool findEndOfFile();
  bool findMatches(const LogSelection& selection);
  bool seek(std::uint64_t realtime);
  void chooseWay(bool selected);
  bool isEndOfIndex();
  bool goToNext();
  void goOnWithoutIndex(std::uint64_t left);
  void close(bool complete);

  FileDescriptor file;
  JournalPtr journal;
  std::size_t number;
  bool grows;  ///< Whether entries may still be added.
  TimeSpan shared;
  std::uint64_t earliest;  ///< Where to start.
  std::uint64_t currentRealtime;
  std::uint64_t latestRealtime;
  /// That of the end, where it is known: in a file that grows, and when the index is used.
  std::uint64_t endRealtime = 0;
  std::string endCursor;
  std::vector<std::string> matches;  ///< What the index can be asked for; none when it cannot be.
  bool trusted;                      ///< Whether the index can be expected to be complete.
  WayChoice way{0};
  bool indexed = false;  ///< Whether steps go by the index, or else to every entry.
  bool open = true;
  bool started = false;
  bool atEnd = false;  ///< Whether the walk is at the last entry.
  bool damaged = false;
};
