#pragma once

#include "platform/clock.h"
#include "platform/journal/duplicate_filter.h"
#include "platform/journal/entry_batch.h"
#include "platform/journal/journal_file_iterator.h"
#include "platform/journal/log_selection.h"
#include "platform/journal/turns.h"

#include <optional>
#include <set>
#include <vector>

/// Reads the selected entries of the device's journal files, from a point in time to what is stored
/// when the reader is made, and merges them in the order of being stored, without duplicates. On
/// one thread, which reads no other journal.
class JournalReader {
 public:
  /// Finds the files. Without a filter every entry is selected. Raises the process's soft limit of
  /// open files to the hard limit.
  JournalReader(const std::optional<LogFilter>& filter, LogTime from);

  /// Appends entries to `batch` until it is full. Returns with fewer, or none, after looking at
  /// some thousands, so that the caller hears of a stop. False when no entry is left.
  bool read(EntryBatch& batch);

  /// Files and folders of which entries are or may be missing, when no entry is left.
  [[nodiscard]] const std::set<FileStatus>& missed() const { return missedFiles; }

 private:
  bool readEntry(EntryBatch& batch);
  [[nodiscard]] bool isSelected(const EntryBatch& batch) const;
  bool isDuplicate();
  void advance(bool selected);
  bool takeTurn();

  LogSelection selection;
  LogTime start;
  std::vector<JournalFileIterator> files;  ///< By when they start; numbered so in `turns`.
  Turns turns;
  JournalFileIterator* current = nullptr;  ///< The file whose turn it is, if any.
  DuplicateFilter duplicates;
  std::set<FileStatus> missedFiles;
};
