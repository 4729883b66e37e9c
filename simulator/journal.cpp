#include "simulator/journal.h"

#include "simulator/child_process.h"
#include "simulator/complaint.h"
#include "simulator/journal_socket.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <string>
#include <string_view>
#include <system_error>
#include <utility>

namespace simulator {

namespace {

/// A process that stores what is written to the pipe.
struct StoringProcess {
  pid_t process = -1;
  FileDescriptor pipe = FileDescriptor();
};

StoringProcess startStoring(const std::filesystem::path& file) {
  int ends[2] = {-1, -1};
  if (pipe2(ends, O_CLOEXEC) != 0) {
    complain(std::string("cannot make a pipe: ") + std::strerror(errno));
    return {};
  }
  const FileDescriptor readable(ends[0]);
  StoringProcess started{-1, FileDescriptor(ends[1])};
  started.process = startChild({VELL_JOURNAL_REMOTE, "-o", file.string(), "-"}, {}, readable.get(),
                               STDERR_FILENO);
  return started;
}

bool writeAll(int file, std::string_view bytes) {
  while (!bytes.empty()) {
    const auto written = write(file, bytes.data(), bytes.size());
    if (written < 0 && errno != EINTR) {
      return false;
    }
    bytes.remove_prefix(static_cast<std::size_t>(std::max<ssize_t>(written, 0)));
  }
  return true;
}

/// Stores `entries` and waits until they are there.
bool storeAll(const std::filesystem::path& file, const std::vector<JournalEntry>& entries) {
  auto storing = startStoring(file);
  if (storing.process < 0) {
    return false;
  }
  bool written = true;
  for (const auto& entry : entries) {
    written = written && writeAll(storing.pipe.get(), toExportFormat(entry));
  }
  storing.pipe = FileDescriptor();
  return awaitChild(storing.process) == 0 && written;
}

/// Adds what the journal itself knows of a process, as far as that still can be learned.
void addSender(JournalEntry& entry, const ucred& sender) {
  const auto process = std::filesystem::path("/proc") / std::to_string(sender.pid);
  std::string name;
  std::error_code error;
  const auto executable = std::filesystem::read_symlink(process / "exe", error);
  entry.fields.emplace_back("_TRANSPORT", "journal");
  entry.fields.emplace_back("_PID", std::to_string(sender.pid));
  entry.fields.emplace_back("_UID", std::to_string(sender.uid));
  entry.fields.emplace_back("_GID", std::to_string(sender.gid));
  if (std::getline(std::ifstream(process / "comm"), name)) {
    entry.fields.emplace_back("_COMM", name);
  }
  if (!error) {
    entry.fields.emplace_back("_EXE", executable.string());
  }
}

}  // namespace

std::unique_ptr<Journal> Journal::create(const std::filesystem::path& root,
                                         const std::vector<JournalEntry>& entries) {
  // A process that stores and dies is noticed when it is written to.
  std::signal(SIGPIPE, SIG_IGN);
  const auto file = root / kJournalFile;
  const auto path = root / kJournalSocket;
  std::error_code error;
  std::filesystem::create_directories(file.parent_path(), error);
  std::filesystem::create_directories(path.parent_path(), error);
  if (!storeAll(file, entries)) {
    complain("the device's journal could not be stored");
    return nullptr;
  }
  auto listening = listenForLog(path);
  auto storing = startStoring(file);
  if (!listening || storing.process < 0) {
    return nullptr;
  }
  return std::unique_ptr<Journal>(
      new Journal(std::move(listening), storing.process, std::move(storing.pipe)));
}

Journal::~Journal() {
  pipe = FileDescriptor();
  awaitChild(storing);
}

int Journal::run() {
  while (storeNext()) {
  }
  complain(std::string("the device's journal is lost: ") + std::strerror(errno));
  return EXIT_FAILURE;
}

/// Waits for a message and stores it; one that is malformed is dropped.
bool Journal::storeNext() {
  const auto datagram = receiveLog(socket.get(), 0);
  if (!datagram) {
    return false;
  }
  auto entry = fromNativeProtocol(datagram->bytes);
  if (!entry || entry->fields.empty()) {
    return true;
  }
  entry->time = std::chrono::floor<std::chrono::microseconds>(std::chrono::system_clock::now());
  addSender(*entry, datagram->sender);
  return writeAll(pipe.get(), toExportFormat(*entry));
}

}  // namespace simulator
