#pragma once

#include "platform/journal/journal_fields.h"
#include "platform/journal/machine_time_zone.h"
#include "platform/log_entry.h"

#include <array>
#include <string>

/// When an entry was logged: its field `SourceTime` if that holds a time, else `realtime`, when it
/// was stored. Both in microseconds.
LogTime entryTime(std::optional<std::string_view> sourceTime, std::uint64_t realtime);

/// Makes log entries from journal entries. Used on one thread.
class EntryDecoder {
 public:
  /// Decodes an entry that was stored at `realtime`, in microseconds. Its texts point into
  /// `values`, or into the decoder where they had to be made valid UTF-8: valid until the next
  /// call. A number that cannot be read counts as absent.
  LogEntry decode(const JournalValues& values, std::uint64_t realtime);

 private:
  MachineTimeZone timeZone;
  std::array<std::string, 5> repaired;  ///< The texts of one entry that were made valid.
};
