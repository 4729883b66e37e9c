#pragma once

#include "platform/journal/entry_batch.h"

#include <cstdint>
#include <string>
#include <unordered_map>
#include <unordered_set>

/// Recognises copies: the system copies entries from file to file, for instance when the disk
/// becomes writable.
class EntryCopies {
 public:
  /// Whether an entry is one that was asked about before. Entries come in the order of their times;
  /// one without a cursor is none. Most are alone with their time, which costs next to nothing.
  bool isCopy(const EntryBatch::Stamp& stamp);

 private:
  bool isKnown(const std::string& cursor);

  // All of them of entries of one time, and kept for the entries that were no copies.
  std::uint64_t realtime = 0;
  std::string onlyOne;                     ///< The cursor of the first, until there is a second.
  std::unordered_set<std::string> places;  ///< The sequence, and the number in it.
  std::unordered_map<std::string, std::string> sequences;  ///< By boot, times and content.
};
