#include "platform/journal/journal_place.h"

#include "platform/portable/handle.h"
#include "platform/process_end.h"

#include <algorithm>
#include <charconv>
#include <cstdlib>

namespace {

/// Reads the number behind "KEY=" in a cursor. False when there is none.
bool readNumber(std::string_view cursor, char key, std::uint64_t& number) {
  constexpr int kHexadecimal = 16;
  const auto part = cursorPart(cursor, key);
  const auto digits = part.substr(std::min<std::size_t>(part.size(), 2));
  const auto* const end = digits.data() + digits.size();
  return std::from_chars(digits.data(), end, number, kHexadecimal).ec == std::errc();
}

}  // namespace

std::string cursorOf(sd_journal* journal) {
  char* text = nullptr;
  if (checked(sd_journal_get_cursor(journal, &text)) < 0) {
    return {};
  }
  const HandlePtr<char, std::free> owner(text);
  return text;
}

std::string_view cursorPart(std::string_view cursor, char key) {
  while (!cursor.empty()) {
    const auto part = cursor.substr(0, cursor.find(';'));
    if (part.starts_with(key)) {
      return part;
    }
    cursor.remove_prefix(std::min(part.size() + 1, cursor.size()));
  }
  return {};
}

std::optional<JournalPlace> JournalPlace::fromCursor(std::string_view cursor) {
  JournalPlace place;
  place.sequence = cursorPart(cursor, 's');
  place.boot = cursorPart(cursor, 'b');
  const bool whole =
      readNumber(cursor, 'i', place.number) && readNumber(cursor, 'm', place.monotonic);
  return whole ? std::optional(place) : std::nullopt;
}

bool isStoredBefore(const JournalPlace& left, const JournalPlace& right) {
  if (left.sequence == right.sequence) {
    return left.number < right.number;
  }
  return left.boot == right.boot && left.monotonic < right.monotonic;
}
