#pragma once

#include "platform/posix/file_descriptor.h"
#include "simulator/journal_entry.h"

#include <sys/types.h>

#include <filesystem>
#include <memory>
#include <vector>

namespace simulator {

/// Places of the journal below the device's root.
inline constexpr const char* kJournalFile =
    "var/log/journal/7d0c5f0e9a3b4c58b1f2a6e4d3c2b1a0/system.journal";
inline constexpr const char* kJournalSocket = "run/systemd/journal/socket";

/// The journal of a simulated device: a real journal file, written by systemd-journal-remote(8),
/// and the socket at which the device's programs log, see
/// https://systemd.io/JOURNAL_NATIVE_PROTOCOL. A process has one, on its one thread.
class Journal {
 public:
  /// Stores `entries`, then listens below `root`. Once it returns, what it was given can be read.
  /// Complains and gives nothing when something of that is not possible.
  static std::unique_ptr<Journal> create(const std::filesystem::path& root,
                                         const std::vector<JournalEntry>& entries);

  Journal(const Journal&) = delete;
  Journal& operator=(const Journal&) = delete;

  /// Ends the storing.
  ~Journal();

  /// Stores what is logged. Returns, with an exit status, only when that is no longer possible.
  int run();

 private:
  Journal(FileDescriptor listening, pid_t process, FileDescriptor input)
      : socket(std::move(listening)), storing(process), pipe(std::move(input)) {}

  bool storeNext();

  FileDescriptor socket;
  pid_t storing;
  FileDescriptor pipe;  ///< The input of the process that stores.
};

}  // namespace simulator
