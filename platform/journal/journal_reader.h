#pragma once

#include "platform/clock.h"
#include "platform/journal/duplicate_filter.h"
#include "platform/journal/entry_batch.h"
#include "platform/journal/journal_file_iterator.h"
#include "platform/journal/log_selection.h"
#include "platform/journal/lost_pages.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <utility>
#include <vector>

/// Reads the selected entries of the device's journal files, from a point in time to what is stored
/// when the reader is made, and merges them in the order of being stored, without duplicates. On
/// one thread, which reads no other journal.
class JournalReader {
 public:
  /// Finds the files. Without a filter every entry is selected.
  JournalReader(const std::optional<LogFilter>& filter, LogTime from);

  /// Appends entries to `batch` until it is full. Returns with fewer, or none, after looking at
  /// some thousands, so that the caller hears of a stop. False when no entry is left.
  bool read(EntryBatch& batch);

  /// Whether nothing is missing from what was read.
  [[nodiscard]] bool isComplete() const { return complete && lostPages() == 0; }

 private:
  /// A file that has entries left, and how many such files were stored before it.
  struct Source {
    JournalFileIterator iterator;
    std::size_t openPredecessors = 0;
  };

  /// Files take turns in the order of these: whether the file has to wait for others, and the
  /// latest time that it has come to. Files that wait for each other, as damaged or forged ones may
  /// do, come last.
  using Turn = std::pair<bool, std::uint64_t>;

  bool readEntry(EntryBatch& batch);
  [[nodiscard]] bool isSelected(const EntryBatch& batch) const;
  bool isDuplicate();
  void advance(bool selected);
  bool takeTurn();
  void end(std::vector<Source>::iterator file);
  static Turn turnOf(const Source& file);
  static bool precedes(const Source& left, const Source& right);

  LogSelection selection;
  LogTime start;
  std::vector<Source> sources;  ///< By when they start.
  Source* current = nullptr;    ///< The file whose turn it is, if any.
  Turn nextTurn;                ///< The first one of the other files.
  DuplicateFilter duplicates;
  bool complete;
};
