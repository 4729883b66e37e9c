#include "platform/journal/entry_copies.h"

#include <algorithm>
#include <string_view>
#include <utility>

namespace {

/// One part of a cursor, with the `key` and the "=" that it starts with.
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

bool EntryCopies::isCopy(const EntryBatch::Stamp& stamp) {
  if (stamp.cursor.empty()) {
    return false;
  }
  if (std::exchange(realtime, stamp.realtime) != stamp.realtime) {
    places.clear();
    sequences.clear();
    onlyOne = stamp.cursor;
    return false;
  }
  if (!onlyOne.empty()) {
    isKnown(std::exchange(onlyOne, {}));
  }
  return isKnown(stamp.cursor);
}

/// Whether an entry is known already; if not, it is from now on. In its own sequence an entry goes
/// by its number, and a program may well log the same twice at one time; entries of different
/// sequences go by boot, times and the hash of their content.
bool EntryCopies::isKnown(const std::string& cursor) {
  const std::string sequence(partOf(cursor, 's'));
  const auto known = sequences.emplace(partsOf(cursor, "bmtx"), sequence).first;
  return known->second != sequence || !places.insert(partsOf(cursor, "si")).second;
}
