#pragma once

#include <cstdint>
#include <string>
#include <unordered_map>
#include <unordered_set>

/// Recognises duplicates: the system copies entries from file to file, for instance from memory to
/// the disk once that is writable. On one thread.
class DuplicateFilter {
 public:
  /// Whether an equal entry was seen before. `realtime`: when it was stored. `cursor`: as
  /// sd_journal_get_cursor(3) returns it; an entry without one (empty) is no duplicate. Call in
  /// time order: only entries of the latest `realtime` are remembered. The first of them costs next
  /// to nothing.
  bool isDuplicate(std::uint64_t realtime, std::string cursor);

 private:
  bool isKnown(const std::string& cursor);

  // All of them of the time `realtime`.
  std::uint64_t realtime = 0;
  std::string first;                       ///< The first entry's cursor, until there is a second.
  std::unordered_set<std::string> places;  ///< Sequence and number, of each entry that was new.
  /// Of each entry that was new: the sequence, by boot, times and content.
  std::unordered_map<std::string, std::string> sequences;
};
