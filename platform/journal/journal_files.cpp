#include "platform/journal/journal_files.h"

#include "platform/device/sysroot.h"
#include "platform/journal/lost_pages.h"
#include "platform/process_end.h"

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <systemd/sd-id128.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <set>
#include <string_view>
#include <system_error>
#include <utility>

namespace {

/// The contents of one folder, sorted. Empty when it cannot be read, or is none.
struct Folder {
  FileStatus status;
  std::vector<std::filesystem::path> contents;

  explicit Folder(const std::filesystem::path& path) : status{path} {
    std::error_code failure;
    std::filesystem::directory_iterator entry(path, failure);
    for (; !failure && entry != std::filesystem::directory_iterator(); entry.increment(failure)) {
      contents.push_back(entry->path());
    }
    std::sort(contents.begin(), contents.end());
    endIfScarce(failure.value());
    if (failure && failure != std::errc::no_such_file_or_directory &&
        failure != std::errc::not_a_directory) {
      status.note(failure.message());
    }
  }
};

/// Whether `name` is that of a machine whose journals are to be read: on the machine itself, its
/// own.
bool isJournalFolder(const std::string& name) {
  sd_id128_t folder{};
  sd_id128_t machine{};
  if (sd_id128_from_string(name.c_str(), &folder) < 0) {
    return false;
  }
  return !isLocalMachine() ||
         (checked(sd_id128_get_machine(&machine)) >= 0 && sd_id128_equal(folder, machine) != 0);
}

/// A tilde marks a file that was not closed in good order.
bool isJournalFile(std::string_view name) {
  return name.ends_with(".journal") || name.ends_with(".journal~");
}

/// The name of a file that was rotated, and is no longer written to, has an "@" in it.
bool isLiveFile(std::string_view name) {
  return name.find('@') == std::string_view::npos;
}

/// When the entries of a file were stored, by its header.
TimeSpan spanOf(sd_journal* journal, bool isLive) {
  std::uint64_t first = 0;
  std::uint64_t last = 0;
  const int found = sd_journal_get_cutoff_realtime_usec(journal, &first, &last);
  if (found == 0 && (sd_journal_seek_head(journal) < 0 || sd_journal_next(journal) <= 0)) {
    return {};
  }
  const auto endOfTime = std::numeric_limits<std::uint64_t>::max();
  // Entries may be of any time where the clock was set back, or the header is damaged.
  return found <= 0 || last < first ? TimeSpan{0, endOfTime}
                                    : TimeSpan{first, isLive ? endOfTime : last};
}

/// The place of the entry before or behind which a seek has gone.
std::optional<JournalPlace> placeAfter(sd_journal* journal, int (*step)(sd_journal*)) {
  return step(journal) > 0 ? JournalPlace::fromCursor(cursorOf(journal)) : std::nullopt;
}

/// How many files may be held open: half of what the process may, which leaves it the rest.
std::size_t mostHeldOpen() {
  struct rlimit limit {};
  getrlimit(RLIMIT_NOFILE, &limit);
  return std::max<std::size_t>(limit.rlim_cur / 2, 1);
}

class Finder {
 public:
  Finder(std::uint64_t earliest, std::size_t most) : from(earliest), atMost(most) {}

  /// Opens the files that are not known yet. Returns whether there may be more.
  bool findNewFiles() {
    const auto before = known.size();
    for (const auto* base : {"var/log/journal", "run/log/journal"}) {
      const Folder folder(sysroot() / base);
      findFilesOf(folder);
      for (const auto& path : folder.contents) {
        if (isJournalFolder(path.filename())) {
          findFilesOf(Folder(path));
        }
      }
    }
    return known.size() > before && files.found.size() < atMost;
  }

  JournalFiles files;

 private:
  void findFilesOf(const Folder& folder) {
    noteStatus(folder.status);
    for (const auto& path : folder.contents) {
      if (isJournalFile(path.filename().native()) && files.found.size() < atMost) {
        findFile(path);
      }
    }
  }

  void findFile(const std::filesystem::path& path) {
    FileDescriptor file(open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
    struct stat status {};
    if (file ? fstat(file.get(), &status) != 0 : errno != ENOENT) {
      noteStatus({path, whyNotOpened(errno, file)});
    } else if (S_ISREG(status.st_mode) && known.insert({status.st_dev, status.st_ino}).second) {
      noteFile({path}, path.filename().native(), std::move(file), status.st_size > 0);
      makeRoom();
    }
  }

  void noteFile(FileStatus status, std::string_view name, FileDescriptor opened, bool hasContent) {
    const auto journal = openJournal(opened.duplicate());
    // An empty file is one that is just being made.
    if (!journal && hasContent) {
      status.note(whyNotOpened(errno, opened));
    }
    if (!journal) {
      noteStatus(status);
      return;
    }
    JournalFile file;
    file.status = std::move(status);
    file.file = std::move(opened);
    file.isLive = isLiveFile(name);
    file.wasClosed = !name.ends_with('~');
    file.stored = spanOf(journal.get(), file.isLive);
    if (file.stored.last >= from) {
      sd_journal_seek_head(journal.get());
      file.first = placeAfter(journal.get(), sd_journal_next);
      if (!file.isLive) {
        sd_journal_seek_tail(journal.get());
        file.last = placeAfter(journal.get(), sd_journal_previous);
      }
      if (hasLostPage()) {
        file.status.note(kLostPage);
      }
      files.found.push_back(std::move(file));
    }
  }

  /// Gives up the file that ends first when there are more than may be held open.
  void makeRoom() {
    if (files.found.size() > mostOpen) {
      const auto oldest = std::min_element(files.found.begin(), files.found.end(),
                                           [](const JournalFile& left, const JournalFile& right) {
                                             return left.stored.last < right.stored.last;
                                           });
      oldest->status.note(whyNotOpened(EMFILE, oldest->file));
      noteStatus(oldest->status);
      files.found.erase(oldest);
    }
  }

  void noteStatus(const FileStatus& status) {
    if (!status.isWhole()) {
      files.missed.insert(status);
    }
  }

  std::uint64_t from;
  std::size_t atMost;
  std::size_t mostOpen = mostHeldOpen();
  std::set<std::pair<dev_t, ino_t>> known;  ///< The regular files that were opened.
};

/// Notes for each file the span that it shares with others. `files`: by when they start.
void findOverlaps(std::vector<JournalFile>& files) {
  for (auto file = files.begin(); file != files.end(); ++file) {
    for (auto later = file + 1; later != files.end() && later->stored.first <= file->stored.last;
         ++later) {
      for (auto* overlap : {&file->overlap, &later->overlap}) {
        overlap->first = std::min(overlap->first, later->stored.first);
        overlap->last = std::max(overlap->last, std::min(file->stored.last, later->stored.last));
      }
    }
  }
}

}  // namespace

JournalFiles findJournalFiles(std::uint64_t from, std::size_t atMost) {
  Finder finder(from, atMost);
  while (finder.findNewFiles()) {
  }
  auto& found = finder.files.found;
  std::stable_sort(found.begin(), found.end(),
                   [](const JournalFile& left, const JournalFile& right) {
                     return left.stored.first < right.stored.first;
                   });
  findOverlaps(found);
  return std::move(finder.files);
}

JournalPtr openJournal(FileDescriptor file) {
  if (!file) {
    return nullptr;
  }
  surviveLostPages();
  sd_journal* opened = nullptr;
  int number = file.get();
  const int result = checked(sd_journal_open_files_fd(&opened, &number, 1, 0));
  if (result < 0) {
    errno = -result;
    return nullptr;
  }
  file.release();
  sd_journal_set_data_threshold(opened, 0);
  return JournalPtr(opened);
}

bool hasJournalFile(sd_journal* journal) {
  std::uint64_t bytes = 0;
  const bool has = sd_journal_get_usage(journal, &bytes) >= 0 && bytes > 0;
  if (!has && errno == ENOMEM) {
    endIfScarce(errno);  // For want of memory, it drops a file as if that were damaged.
  }
  return has;
}

std::string whyNotOpened(int error, const FileDescriptor& file) {
  if (error == EMFILE || error == ENFILE) {
    return "given up for want of file descriptors";
  }
  if (error == EIDRM) {
    return "removed before its turn";
  }
  if (error != EBADMSG && error != ENODATA) {
    return std::strerror(error);
  }
  const std::string signature = "LPKSHHRH";
  std::string start(signature.size(), '\0');
  const auto length = pread(file.get(), start.data(), start.size(), 0);
  return length > 0 && start == signature ? "damaged at its head" : "not a journal";
}
