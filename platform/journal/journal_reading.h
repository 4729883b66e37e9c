#pragma once

#include "platform/journal/entry_batch.h"
#include "platform/journal/journal_file_queue.h"
#include "platform/journal/journal_file_scan.h"
#include "platform/journal/log_selection.h"

#include <cstddef>
#include <cstdint>
#include <map>
#include <vector>

/// Reads the selected entries of some journal files from a point in time up to what is stored when
/// the reading is made, oldest first across all these files. On one thread.
class JournalReading {
 public:
  /// A reading of the files `own`, in which are all that grow, and of those of `others`, which must
  /// last longer, that it comes to before other readings do.
  JournalReading(std::vector<JournalFile> own, JournalFileQueue& others,
                 const std::optional<LogFilter>& filter, LogTime from);

  /// Adds entries to `batch`, none at times: until it is full, or it is time to look around, or all
  /// are read. Returns false in the last case.
  bool read(EntryBatch& batch);

  /// Whether nothing was found that could not be read.
  [[nodiscard]] bool isComplete() const { return complete; }

 private:
  /// A file waits for its turn, which comes when its next entry is the oldest.
  struct Turn {
    std::uint64_t reached;
    std::size_t number;  ///< Of the file.
    bool operator>(const Turn& other) const;
  };

  bool readEntry(EntryBatch& batch);
  [[nodiscard]] bool isWanted(const EntryBatch& batch) const;
  void advance(bool selected);
  bool takeTurn();
  bool takeFile();
  JournalFileScan& add(JournalFile file);
  void waitForTurn(JournalFileScan& scan);

  LogSelection selection;
  LogTime start;
  JournalFileQueue& files;
  std::map<std::size_t, JournalFileScan> scans;  ///< Those with entries to come, by file number.
  std::vector<Turn> turns;                       ///< A heap, the next turn in front.
  JournalFileScan* current = nullptr;            ///< The scan whose turn it is.
  bool complete = true;
};
