#include "platform/journal/journal_place.h"

#include "platform/portable/handle.h"

#include <algorithm>
#include <charconv>
#include <cstdlib>

namespace {

/// What stands behind "KEY=" in a cursor.
std::string_view valueOf(std::string_view cursor, char key) {
  const auto part = cursorPart(cursor, key);
  return part.substr(std::min<std::size_t>(part.size(), 2));
}

bool readNumber(std::string_view digits, std::uint64_t& number) {
  constexpr int kHexadecimal = 16;
  const auto* const end = digits.data() + digits.size();
  return std::from_chars(digits.data(), end, number, kHexadecimal).ec == std::errc();
}

bool readId(std::string_view digits, sd_id128_t& id) {
  return sd_id128_from_string(std::string(digits).c_str(), &id) >= 0;
}

}  // namespace

std::string cursorOf(sd_journal* journal) {
  char* text = nullptr;
  if (sd_journal_get_cursor(journal, &text) < 0) {
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
  const bool whole = readId(valueOf(cursor, 's'), place.sequence) &&
                     readNumber(valueOf(cursor, 'i'), place.number) &&
                     readId(valueOf(cursor, 'b'), place.boot) &&
                     readNumber(valueOf(cursor, 'm'), place.monotonic);
  return whole ? std::optional(place) : std::nullopt;
}

bool isStoredBefore(const JournalPlace& left, const JournalPlace& right) {
  if (sd_id128_equal(left.sequence, right.sequence) != 0) {
    return left.number < right.number;
  }
  return sd_id128_equal(left.boot, right.boot) != 0 && left.monotonic < right.monotonic;
}
