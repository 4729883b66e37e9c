#pragma once

#include "platform/journal/file_status.h"
#include "platform/journal/journal_place.h"
#include "platform/portable/handle.h"
#include "platform/posix/file_descriptor.h"

#include <systemd/sd-journal.h>

#include <cstddef>
#include <cstdint>
#include <limits>
#include <optional>
#include <set>
#include <string>
#include <vector>

/// Owns an open journal, which one thread opens, uses and closes, see sd-journal(3).
using JournalPtr = HandlePtr<sd_journal, sd_journal_close>;

/// From when to when, in microseconds, both included. Empty when `last` is before `first`.
struct TimeSpan {
  std::uint64_t first = std::numeric_limits<std::uint64_t>::max();
  std::uint64_t last = 0;

  [[nodiscard]] bool holds(std::uint64_t time) const { return first <= time && time <= last; }
};

/// One journal file. Held open, so that it is still found when it is renamed. The library opens no
/// file that is removed.
struct JournalFile {
  FileStatus status;
  FileDescriptor file;
  bool isLive = false;     ///< Whether entries may still be added to it.
  bool wasClosed = false;  ///< Whether it was closed in good order, by its name.
  TimeSpan stored;         ///< When its entries were stored. Without end in a live file.
  TimeSpan overlap;        ///< Outside of it, no other file has entries of the same time.
  std::optional<JournalPlace> first;  ///< Of its first entry, if that can be read.
  std::optional<JournalPlace> last;   ///< Of its last entry. None in a live file.
};

/// The device's journal files, by the times of their first entries.
///
/// The library can open them all as one journal. Each step then asks every file, and no memory is
/// given back before the end. Reading one file after the other makes a step cost the same however
/// many files there are.
struct JournalFiles {
  std::vector<JournalFile> found;
  std::set<FileStatus> missed;  ///< Files and folders that exist and are not read.
};

/// Finds the journal files below the sysroot, or the local machine's, as sd_journal_open(3) does:
/// those of namespaces are not among them. A file that is rotated meanwhile is found under its new
/// name. Leaves out files that end before `from`, in microseconds. Stops after `atMost` files.
///
/// When there are more files than half of what the process may have open, the files that end first
/// are given up, which counts as damage.
JournalFiles findJournalFiles(std::uint64_t from,
                              std::size_t atMost = std::numeric_limits<std::size_t>::max());

/// Opens the journal in `file`. Null when that fails; errno is then set, but not for want of a
/// `file`. Survives lost pages of the file, see `surviveLostPages`. Used on the thread that closes
/// the journal.
JournalPtr openJournal(FileDescriptor file);

/// Why a journal file, open as `file` unless that failed, could not be opened, by errno.
std::string whyNotOpened(int error, const FileDescriptor& file);

/// The cause for a file that somebody cut short meanwhile.
inline constexpr const char* kLostPage = "lost a page";

/// Whether the library still has the file of `journal`. It drops a file that it finds damaged, and
/// goes on as if that had ended. False for null.
bool hasJournalFile(sd_journal* journal);
