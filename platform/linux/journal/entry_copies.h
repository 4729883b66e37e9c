#pragma once

#include "platform/linux/journal/entry_batch.h"

#include <cstdint>
#include <string>
#include <unordered_map>
#include <unordered_set>

/// Recognises copies: the system copies entries from file to file, for instance when the disk
/// becomes writable.
class EntryCopies {
 public:
  /// Whether an entry is one that was asked about before. Entries come in the order of their times;
  /// one without a cursor is none.
  bool isCopy(const EntryBatch::Stamp& stamp);

 private:
  // All of them of entries of one time, and kept for the entries that were no copies.
  std::uint64_t realtime = 0;
  std::unordered_set<std::string> places;                  ///< The sequence, and the number in it.
  std::unordered_map<std::string, std::string> sequences;  ///< By boot, times and content.
};
