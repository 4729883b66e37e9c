#pragma once

#include "platform/journal/journal_fields.h"
#include "platform/journal/machine_time_zone.h"
#include "platform/log_entry.h"

#include <array>
#include <string>

/// When an entry was logged: what its field `SourceTime` says, else when it was stored (both in
/// microseconds).
LogTime entryTime(std::optional<std::string_view> sourceTime, std::uint64_t realtime);

/// Makes log entries from journal entries. Used on one thread.
class EntryDecoder {
 public:
  /// The entry's texts lie in `values`, or in the decoder where they had to be made valid UTF-8;
  /// it is good until the next call. Numbers that cannot be read count as absent.
  LogEntry decode(const JournalValues& values, std::uint64_t realtime);

 private:
  MachineTimeZone timeZone;
  std::array<std::string, 5> repaired;  ///< One for each text of an entry.
};
