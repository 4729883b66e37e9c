#pragma once

#include <array>
#include <cstddef>
#include <optional>
#include <string_view>

/// The journal fields that a log entry is made from, see systemd.journal-fields(7).
enum class JournalField : unsigned char {
  Message,
  SourceTime,
  ThreadId,
  ProcessId,
  SyslogProcessId,
  ActivityId,
  Executable,
  CommandName,
  SyslogIdentifier,
  SenderImagePath,
  Subsystem,
  Unit,
  Category,
};

/// The names of the fields, in the order of `JournalField`.
inline constexpr std::array<std::string_view, 13> kJournalFieldNames = {
    "MESSAGE",
    "_SOURCE_REALTIME_TIMESTAMP",
    "TID",
    "_PID",
    "SYSLOG_PID",
    "VELL_ACTIVITY_ID",
    "_EXE",
    "_COMM",
    "SYSLOG_IDENTIFIER",
    "VELL_SENDER_IMAGE_PATH",
    "VELL_SUBSYSTEM",
    "_SYSTEMD_UNIT",
    "VELL_CATEGORY"};

constexpr std::size_t indexOf(JournalField field) {
  return static_cast<std::size_t>(field);
}

/// One value for each field.
template <typename Value>
using PerJournalField = std::array<Value, kJournalFieldNames.size()>;

/// The field of that name; nullopt for one that no log entry is made from.
std::optional<JournalField> findJournalField(std::string_view name);

/// The field values of one entry: any bytes, owned by the `EntryBatch` or whoever else made this.
using JournalValues = PerJournalField<std::optional<std::string_view>>;

/// The part of `path` behind its last slash; all of it without one.
std::string_view lastComponent(std::string_view path);

/// The name of the process that logged an entry; nullopt when no field tells.
std::optional<std::string_view> processOf(const JournalValues& values);

/// The path of the image that issued an entry; nullopt when no field tells.
std::optional<std::string_view> senderImagePathOf(const JournalValues& values);
