#pragma once

#include <filesystem>

namespace simulator {

/// Where the journal is below the device's root.
inline constexpr const char* kJournalFile =
    "var/log/journal/7d0c5f0e9a3b4c58b1f2a6e4d3c2b1a0/system.journal";

/// Is the journal of the device at `root`: a real journal file, written by
/// systemd-journal-remote(8), which has entries of the last hour and gets what the device's
/// programs log. Says "ready" on standard output once both can be used. Returns an exit status when
/// that is not possible, or not any more. For a process with one thread.
int serveJournal(const std::filesystem::path& root);

}  // namespace simulator
