#pragma once

#include "platform/clock.h"
#include "platform/portable/handle.h"
#include "platform/posix/file_descriptor.h"

#include <systemd/sd-journal.h>

#include <cstddef>
#include <cstdint>
#include <limits>
#include <vector>

/// Owns an open journal. It is opened, used and closed on one thread, see sd-journal(3).
using JournalPtr = HandlePtr<sd_journal, sd_journal_close>;

/// A point in time as the journal has it, in microseconds; it takes 0 for none.
std::uint64_t journalTime(LogTime time);

/// From when to when, in microseconds, both included; no time at all when `last` is before `first`.
struct TimeSpan {
  std::uint64_t first = std::numeric_limits<std::uint64_t>::max();
  std::uint64_t last = 0;

  [[nodiscard]] bool holds(std::uint64_t time) const { return first <= time && time <= last; }
};

/// One journal file, held open so that it cannot go away.
struct JournalFile {
  FileDescriptor file;
  bool grows = false;      ///< Whether entries may still be added to it.
  bool wasClosed = false;  ///< Whether it was closed in good order, as far as its name tells.
  TimeSpan stored;         ///< When its entries were stored; has no end in a file that grows.
  TimeSpan shared;         ///< Outside of this, no other file has entries of the same time.
  std::size_t number = 0;  ///< Its place among the files.
};

/// The device's journal files, in the order of their first entries.
///
/// The library can open them all as one, but then every step asks every file, and nothing is given
/// back before the end: reading file after file makes a step cost the same however many there are.
struct JournalFiles {
  std::vector<JournalFile> found;
  int error = 0;         ///< Why the first that could not be opened could not (errno); else 0.
  bool damaged = false;  ///< Whether one is missing that is there and may be read.
};

/// Finds the files below the sysroot, or the local machine's own, as sd_journal_open(3) does: those
/// of namespaces are not among them. Files that are rotated meanwhile are found under their new
/// names. Stops once `atMost` are found. The process may have as many files open afterwards as its
/// hard limit allows. From any thread.
JournalFiles findJournalFiles(std::size_t atMost = std::numeric_limits<std::size_t>::max());

/// Opens the journal in `file`; null, and errno is set, when that fails; null, and errno is as it
/// was, when there is no `file`. Pages of the file that are
/// lost while it is open do not end the process, see `surviveLostPages`.
JournalPtr openJournal(FileDescriptor file);

/// Whether the library still has the file of `journal`, which takes up room on the disk: one that
/// it finds damaged it drops, and then goes on as if it had come to its end.
bool hasJournalFile(sd_journal* journal);
