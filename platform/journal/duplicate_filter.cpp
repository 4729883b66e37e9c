#include "platform/journal/duplicate_filter.h"

#include <algorithm>
#include <string_view>
#include <utility>

namespace {

/// The part "KEY=value" of a cursor, which looks like "s=5f2a...;i=1c3;b=...". Empty without one.
std::string_view partOf(std::string_view cursor, char key) {
  while (!cursor.empty()) {
    const auto part = cursor.substr(0, cursor.find(';'));
    if (part.starts_with(key)) {
      return part;
    }
    cursor.remove_prefix(std::min(part.size() + 1, cursor.size()));
  }
  return {};
}

std::string partsOf(std::string_view cursor, std::string_view keys) {
  std::string parts;
  for (const auto key : keys) {
    parts += partOf(cursor, key);
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
  const std::string sequence(partOf(cursor, 's'));
  const auto known = sequences.emplace(partsOf(cursor, "bmtx"), sequence).first;
  return known->second != sequence || !places.insert(partsOf(cursor, "si")).second;
}
