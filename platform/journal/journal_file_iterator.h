#pragma once

#include "platform/journal/entry_batch.h"
#include "platform/journal/journal_files.h"
#include "platform/journal/journal_index.h"
#include "platform/journal/log_selection.h"

#include <cstdint>
#include <string>

/// Walks through one journal file, from a point in time to the end that `start` fixes, in the order
/// in which the entries were stored. Passes over entries that are not selected where the index
/// helps with that; the caller still has to check each entry. On one thread.
class JournalFileIterator {
 public:
  /// Waits in front of `journalFile`. `from`: the earliest time to start at, in microseconds.
  JournalFileIterator(JournalFile journalFile, std::uint64_t from);

  /// The file, as it was given.
  [[nodiscard]] const JournalFile& journalFile() const { return file; }

  [[nodiscard]] bool isWaiting() const { return state == State::Waiting; }
  [[nodiscard]] bool isClosed() const { return state == State::Closed; }

  /// Fixes the end and goes to the first entry. Closes when there is none. To be called once.
  void start(const LogSelection& selection);

  /// Says why entries are or may be missing, if they are.
  [[nodiscard]] const FileStatus& status() const { return file.status; }

  /// Latest storage time seen so far, in microseconds; never falls, although the clock may have
  /// been set back. While waiting: a lower bound.
  [[nodiscard]] std::uint64_t reached() const { return latest; }

  /// Appends the current entry to `batch`. False, with nothing appended, when it cannot be read.
  bool read(EntryBatch& batch);

  /// When the current entry was stored, in microseconds.
  [[nodiscard]] std::uint64_t realtime() const { return current; }

  /// The cursor of the current entry, see sd_journal_get_cursor(3); empty when that fails. Slow.
  [[nodiscard]] std::string cursor() const { return cursorOf(journal.get()); }

  /// Goes to the next entry, and closes at the end. `selected`: whether the current entry was.
  void advance(bool selected);

 private:
  enum class State {
    Waiting,  ///< Not started.
    Walking,  ///< At an entry that more may follow.
    AtEnd,    ///< At the last entry.
    Closed,   ///< Past the last entry; the file is closed.
  };

  /// The last entry of the walk.
  struct End {
    std::uint64_t realtime = 0;
    std::string cursor;  ///< Empty when the end is not known in advance.
  };

  /// What the index says about a selection.
  enum class Answer { NoneSelected, Walk, Damaged };

  bool open();
  bool fixEnd();
  Answer askIndex(const LogSelection& selection);
  bool isEndOfIndex();
  bool isEndOfFile();
  bool goToFirst();
  bool goToNext();
  int readItems(EntryBatch& batch);
  void goOnWithoutIndex(std::uint64_t left);
  void close(const char* cause);
  void note(const char* cause);
  bool lostPage();

  JournalFile file;
  JournalPtr journal;
  std::uint64_t earliest;
  State state = State::Waiting;
  std::uint64_t current = 0;
  std::uint64_t latest;
  End end;
  JournalIndex index;
};
