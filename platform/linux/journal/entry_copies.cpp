#include "platform/linux/journal/entry_copies.h"

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
  }
  // In its own sequence an entry goes by its number, and a program may well log the same twice at
  // one time; entries of different sequences go by boot, times and the hash of their content.
  const std::string sequence(partOf(stamp.cursor, 's'));
  const auto known = sequences.find(partsOf(stamp.cursor, "bmtx"));
  if (known != sequences.end() && known->second != sequence) {
    return true;
  }
  sequences.emplace(partsOf(stamp.cursor, "bmtx"), sequence);
  return !places.insert(partsOf(stamp.cursor, "si")).second;
}
