#pragma once

#include <array>
#include <cstddef>
#include <optional>
#include <string_view>

/// The fields of a journal entry that a log entry is made from, see systemd.journal-fields(7).
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

/// Their names in the journal, in the order of `JournalField`.
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

/// Something for each of the fields.
template <typename Value>
using PerJournalField = std::array<Value, kJournalFieldNames.size()>;

/// The field of that name; empty for one that no log entry is made from.
std::optional<JournalField> findJournalField(std::string_view name);

/// The values of one entry's fields, as stored: bytes of any kind, kept by someone else.
using JournalValues = PerJournalField<std::optional<std::string_view>>;

/// The last component of a path: what follows its last slash.
std::string_view lastComponent(std::string_view path);

/// The name of the process that logged an entry.
std::optional<std::string_view> processOf(const JournalValues& values);

/// The path of the image that issued an entry.
std::optional<std::string_view> senderImagePathOf(const JournalValues& values);
