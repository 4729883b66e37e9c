#include "platform/journal/duplicate_filter.h"

#include "platform/journal/journal_place.h"

#include <string_view>
#include <utility>

namespace {

std::string partsOf(std::string_view cursor, std::string_view keys) {
  std::string parts;
  for (const auto key : keys) {
    parts += cursorPart(cursor, key);
    parts += ';';
  }
  return parts;
}

}  // namespace

bool DuplicateFilter::isDuplicate(std::uint64_t time, std::string cursor) {
  if (cursor.empty()) {
    return false;
  }
  if (std::exchange(realtime, time) != time) {
    places.clear();
    sequences.clear();
    first = std::move(cursor);
    return false;
  }
  if (!first.empty()) {
    isKnown(std::exchange(first, {}));
  }
  return isKnown(cursor);
}

/// Whether an equal entry is known. Makes this one known if not.
///
/// Entries of one sequence are equal when their numbers are: a program may log the same text twice
/// at one time. Entries of different sequences are equal when boot, times and content hash are.
bool DuplicateFilter::isKnown(const std::string& cursor) {
  const std::string sequence(cursorPart(cursor, 's'));
  const auto known = sequences.emplace(partsOf(cursor, "bmtx"), sequence).first;
  return known->second != sequence || !places.insert(partsOf(cursor, "si")).second;
}
