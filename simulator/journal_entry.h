#pragma once

#include "platform/posix/file_descriptor.h"

#include <chrono>
#include <filesystem>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace simulator {

using JournalTime = std::chrono::sys_time<std::chrono::microseconds>;

/// The time by the clock of the machine.
JournalTime presentTime();

/// One entry of the journal: when it was stored, and its fields, see systemd.journal-fields(7).
struct JournalEntry {
  JournalTime time;
  std::vector<std::pair<std::string, std::string>> fields;
};

/// `entry` in the export format of the journal, see https://systemd.io/JOURNAL_EXPORT_FORMATS.
std::string toExportFormat(const JournalEntry& entry);

/// Makes the journal's socket at `path`, however deep that lies, and the folders above it. None,
/// after a complaint, when it cannot be.
FileDescriptor listenForEntries(const std::filesystem::path& path);

/// Takes what one datagram of the journal's native protocol holds off such a socket, with `flags`
/// as of recvmsg(2), see https://systemd.io/JOURNAL_NATIVE_PROTOCOL. Leaves out the fields that a
/// program cannot set itself, and adds what the journal knows of the sender. An entry that is
/// malformed has no fields. Empty, and errno is set, when the socket gives none.
std::optional<JournalEntry> receiveEntry(int socket, int flags);

}  // namespace simulator
