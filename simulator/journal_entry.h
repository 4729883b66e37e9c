#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace simulator {

/// One entry of the journal: when it was stored, and its fields, see systemd.journal-fields(7).
struct JournalEntry {
  std::chrono::sys_time<std::chrono::microseconds> time;
  std::vector<std::pair<std::string, std::string>> fields;
};

/// `entry` in the export format of the journal, see https://systemd.io/JOURNAL_EXPORT_FORMATS.
std::string toExportFormat(const JournalEntry& entry);

/// The fields of one datagram of the journal's native protocol, without those that a program cannot
/// set itself. Empty when it is malformed.
std::optional<JournalEntry> fromNativeProtocol(std::string_view datagram);

/// What a device has logged in the hour up to `now`: its daemons, their libraries, its kernel.
std::vector<JournalEntry> lastHourOfDevice(std::chrono::sys_time<std::chrono::microseconds> now);

}  // namespace simulator
