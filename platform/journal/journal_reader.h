#pragma once

#include "platform/clock.h"
#include "platform/journal/duplicate_filter.h"
#include "platform/journal/entry_batch.h"
#include "platform/journal/journal_file_iterator.h"
#include "platform/journal/log_selection.h"

#include <compare>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <queue>
#include <vector>

/// Reads the selected entries of the device's journal files, from a point in time to what is stored
/// when the reader is made, and merges them: oldest first across all files, without duplicates. On
/// one thread.
class JournalReader {
 public:
  /// Finds the files. Without a filter every entry is selected.
  JournalReader(const std::optional<LogFilter>& filter, LogTime from);

  /// Appends entries to `batch` until it is full. Returns with fewer, or none, after looking at
  /// some thousands, so that the caller hears of a stop. False when no entry is left.
  bool read(EntryBatch& batch);

  /// Whether nothing is missing from what was read.
  [[nodiscard]] bool isComplete() const { return complete; }

 private:
  /// A file waits for its turn, which comes when its next entry is the oldest.
  struct Turn {
    std::uint64_t reached = 0;
    std::size_t file = 0;  ///< Its place in `iterators`.
    friend auto operator<=>(const Turn&, const Turn&) = default;
  };

  bool readEntry(EntryBatch& batch);
  [[nodiscard]] bool isSelected(const EntryBatch& batch) const;
  bool isDuplicate();
  void advance(bool selected);
  bool takeTurn();
  void waitForTurn(std::size_t file);

  LogSelection selection;
  LogTime start;
  std::vector<JournalFileIterator> iterators;  ///< One for each file, in the order of the files.
  std::priority_queue<Turn, std::vector<Turn>, std::greater<>> turns;  ///< The next turn on top.
  std::optional<std::size_t> current;  ///< The file whose turn it is; it is not in `turns`.
  DuplicateFilter duplicates;
  bool complete;
};
