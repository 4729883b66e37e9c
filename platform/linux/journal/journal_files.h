#pragma once

#include <systemd/sd-journal.h>

#include <cstdint>
#include <limits>
#include <memory>
#include <vector>

struct JournalCloser {
  void operator()(sd_journal* journal) const { sd_journal_close(journal); }
};

/// Owns an open journal. It is opened, used and closed on one thread, see sd_journal_open(3).
using JournalPtr = std::unique_ptr<sd_journal, JournalCloser>;

/// One journal file.
struct JournalFile {
  JournalPtr journal;
  bool grows = false;  ///< Whether entries may still be added to it.
};

/// The device's journal files, each open on its own.
///
/// The library can open them all as one, but then every step asks every file, and nothing is given
/// back before the end: reading file after file makes a step cost the same however many there are.
struct JournalFiles {
  std::vector<JournalFile> opened;
  int error = 0;         ///< Why the first that could not be opened could not (errno); else 0.
  bool damaged = false;  ///< Whether one is missing that is there and may be read.
};

/// Opens the files below the sysroot, or the local machine's own, as sd_journal_open(3) finds them:
/// those of namespaces are not among them. Files that are rotated meanwhile are found under their
/// new names. Stops once `atMost` are open.
JournalFiles openJournalFiles(std::size_t atMost = std::numeric_limits<std::size_t>::max());

/// Whether the library still has the file of `journal`: one that it finds damaged it drops, and
/// then goes on as if it had come to its end.
bool hasJournalFile(sd_journal* journal);
