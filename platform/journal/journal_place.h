#pragma once

#include <systemd/sd-journal.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

/// The cursor of the entry that `journal` is at, see sd_journal_get_cursor(3). Empty when that
/// fails. Slow.
std::string cursorOf(sd_journal* journal);

/// The part "KEY=value" of a cursor, which looks like "s=5f2a...;i=1c3;b=...". Empty without one.
std::string_view cursorPart(std::string_view cursor, char key);

/// Where an entry stands in the order of being stored, by counters that no setting of the clock
/// affects. Damaged or forged files may hold any.
struct JournalPlace {
  std::string sequence;  ///< Numbers the entries of the files that were rotated one to the next.
  std::uint64_t number = 0;     ///< In `sequence`.
  std::string boot;             ///< The system start during which the entry was made.
  std::uint64_t monotonic = 0;  ///< Since then, in microseconds.

  /// The place that a cursor tells; nullopt when it tells none.
  static std::optional<JournalPlace> fromCursor(std::string_view cursor);
};

/// Whether `left` was stored before `right` for certain. Of entries of different sequences and
/// boots that cannot be told.
bool isStoredBefore(const JournalPlace& left, const JournalPlace& right);
