#include "platform/linux/journal/journal_files.h"

#include "platform/linux/file_descriptor.h"
#include "platform/linux/sysroot.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <systemd/sd-id128.h>

#include <cerrno>
#include <filesystem>
#include <set>
#include <string_view>
#include <system_error>
#include <utility>

namespace {

/// The path of one folder and what lies in it; nothing when it cannot be read.
struct Folder {
  std::vector<std::filesystem::path> contents;
  int error = 0;

  explicit Folder(const std::filesystem::path& path) {
    std::error_code failure;
    std::filesystem::directory_iterator entry(path, failure);
    for (; !failure && entry != std::filesystem::directory_iterator(); entry.increment(failure)) {
      contents.push_back(entry->path());
    }
    error = failure == std::errc::no_such_file_or_directory || failure == std::errc::not_a_directory
                ? 0
                : failure.value();
  }
};

/// Whether a folder of that name holds journals that are to be read.
bool isJournalFolder(const std::string& name) {
  sd_id128_t folder{};
  sd_id128_t machine{};
  if (sd_id128_from_string(name.c_str(), &folder) < 0) {
    return false;
  }
  return !isLocalMachine() ||
         (sd_id128_get_machine(&machine) >= 0 && sd_id128_equal(folder, machine) != 0);
}

/// Journal files have this ending, and a tilde after it when they were not closed in good order.
bool isJournalFile(std::string_view name) {
  return name.ends_with(".journal") || name.ends_with(".journal~");
}

/// A file that is rotated is written to no more, and its name tells when and where that was.
bool isLiveFile(std::string_view name) {
  return name.find('@') == std::string_view::npos;
}

class Opener {
 public:
  explicit Opener(std::size_t most) : atMost(most) {}

  /// Opens what is there and not open yet. Returns whether that was anything.
  bool openNewFiles() {
    const auto before = known.size();
    for (const auto* base : {"var/log/journal", "run/log/journal"}) {
      const Folder folder(sysroot() / base);
      noteUnopened(folder.error);
      openFilesOf(folder);
      for (const auto& path : folder.contents) {
        if (isJournalFolder(path.filename())) {
          const Folder machine(path);
          noteUnopened(machine.error);
          openFilesOf(machine);
        }
      }
    }
    return known.size() > before && files.opened.size() < atMost;
  }

  JournalFiles files;

 private:
  void openFilesOf(const Folder& folder) {
    for (const auto& path : folder.contents) {
      if (isJournalFile(path.filename().native()) && files.opened.size() < atMost) {
        openFile(path);
      }
    }
  }

  void openFile(const std::filesystem::path& path) {
    FileDescriptor file(open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    struct stat status {};
    if (!file || fstat(file.get(), &status) != 0) {
      noteUnopened(errno);
      return;
    }
    if (S_ISREG(status.st_mode) && known.insert({status.st_dev, status.st_ino}).second) {
      // An empty file is one that is just being made.
      files.damaged = (!openJournal(path, file) && status.st_size > 0) || files.damaged;
    }
  }

  bool openJournal(const std::filesystem::path& path, FileDescriptor& file) {
    sd_journal* opened = nullptr;
    int number = file.get();
    const int result = sd_journal_open_files_fd(&opened, &number, 1, 0);
    if (result < 0) {
      note(-result);
      return false;
    }
    file.release();
    sd_journal_set_data_threshold(opened, 0);
    files.opened.push_back({JournalPtr(opened), isLiveFile(path.filename().native())});
    return true;
  }

  /// What is gone was rotated away, and what is forbidden is not the user's to read; for any other
  /// reason something is missing.
  void noteUnopened(int error) {
    note(error == ENOENT ? 0 : error);
    files.damaged =
        files.damaged || (error != 0 && error != ENOENT && error != EACCES && error != EPERM);
  }

  void note(int error) {
    if (files.error == 0) {
      files.error = error;
    }
  }

  std::size_t atMost;
  std::set<std::pair<dev_t, ino_t>> known;
};

}  // namespace

JournalFiles openJournalFiles(std::size_t atMost) {
  Opener opener(atMost);
  while (opener.openNewFiles()) {
  }
  return std::move(opener.files);
}

bool hasJournalFile(sd_journal* journal) {
  std::uint64_t bytes = 0;
  return sd_journal_get_usage(journal, &bytes) >= 0 && bytes > 0;
}
