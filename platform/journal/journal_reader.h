#pragma once

#include "platform/clock.h"
#include "platform/journal/duplicate_filter.h"
#include "platform/journal/entry_batch.h"
#include "platform/journal/journal_file_iterator.h"
#include "platform/journal/log_selection.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <queue>
#include <tuple>
#include <utility>
#include <vector>

/// Reads the selected entries of the device's journal files, from a point in time to what is stored
/// when the reader is made, and merges them in the order of being stored, without duplicates. On
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
  /// A file, and what it has to wait for.
  struct Source {
    explicit Source(JournalFileIterator waiting) : iterator(std::move(waiting)) {}

    JournalFileIterator iterator;
    std::size_t openPredecessors = 0;  ///< Files that were stored before it and are not closed.
  };

  /// A file waits for its turn, which comes when its next entry is the oldest.
  struct Turn {
    std::uint64_t reached = 0;
    std::size_t file = 0;  ///< Its place in `sources`.
    bool operator>(const Turn& other) const {
      return std::tie(reached, file) > std::tie(other.reached, other.file);
    }
  };

  bool readEntry(EntryBatch& batch);
  [[nodiscard]] bool isSelected(const EntryBatch& batch) const;
  bool isDuplicate();
  void advance(bool selected);
  bool takeTurn();
  [[nodiscard]] Turn turnOf(std::size_t file) const;
  void waitForTurn(std::size_t file);
  void end(std::size_t file);
  bool releaseOne();
  [[nodiscard]] bool precedes(std::size_t left, std::size_t right) const;

  LogSelection selection;
  LogTime start;
  std::vector<Source> sources;  ///< One for each file, in the order of the files.
  /// The next turn on top. Without files that are closed, are current or have open predecessors.
  std::priority_queue<Turn, std::vector<Turn>, std::greater<>> turns;
  std::optional<std::size_t> current;  ///< The file whose turn it is.
  DuplicateFilter duplicates;
  bool complete;
};
