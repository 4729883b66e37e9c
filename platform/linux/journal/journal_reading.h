#pragma once

#include "platform/linux/journal/entry_batch.h"
#include "platform/linux/journal/journal_file_scan.h"
#include "platform/linux/journal/log_selection.h"

#include <cstdint>
#include <optional>
#include <vector>

/// Reads the selected entries of some journal files from a point in time up to what is stored when
/// the reading is made, oldest first across all the files. On one thread.
class JournalReading {
 public:
  /// A reading of `files`, which are in the order of their first entries.
  JournalReading(std::vector<JournalFile> files, const std::optional<LogFilter>& filter,
                 LogTime from);

  /// Adds entries to `batch`, none at times: until it is full, or it is time to look around, or all
  /// are read. Returns false in the last case.
  bool read(EntryBatch& batch);

  /// Whether nothing was found that could not be read.
  [[nodiscard]] bool isComplete() const;

 private:
  /// A file waits for its turn, which comes when its next entry is the oldest.
  struct Turn {
    std::uint64_t realtime;
    std::size_t scan;
    bool operator>(const Turn& other) const;
  };

  bool readEntry(EntryBatch& batch);
  [[nodiscard]] bool isWanted(const EntryBatch& batch) const;
  void advance(bool selected);
  bool takeTurn();
  void waitForTurn(std::size_t scan);

  LogSelection selection;
  LogTime start;
  std::vector<JournalFileScan> scans;
  std::vector<Turn> turns;             ///< A heap, the next turn in front.
  std::optional<std::size_t> current;  ///< The scan whose turn it is.
};
