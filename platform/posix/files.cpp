#include "platform/files.h"

#include "platform/posix/file_descriptor.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>

#include <cerrno>
#include <chrono>
#include <optional>
#include <utility>

namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::seconds kPatience{10};
constexpr mode_t kOwnerAlone = S_IRUSR | S_IWUSR;

/// Without O_NONBLOCK, a pipe that nobody reads would hold up the open, and later the write.
constexpr int kWriting = O_WRONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC;

/// Opens for writing what is at `path`; a text with a NUL is the path of nothing.
FileDescriptor openForWriting(const std::string& path, int flags) {
  if (path.find('\0') != std::string::npos) {
    return FileDescriptor();
  }
  return FileDescriptor(open(path.c_str(), kWriting | flags, kOwnerAlone));
}

/// Waits until a pipe or terminal takes more, no longer than `limit`.
std::error_code waitForRoom(int file, Clock::time_point limit) {
  const auto left = std::chrono::ceil<std::chrono::milliseconds>(limit - Clock::now());
  pollfd waiting{file, POLLOUT, 0};
  const int ready = left.count() <= 0 ? 0 : poll(&waiting, 1, static_cast<int>(left.count()));
  if (ready == 0) {
    return std::make_error_code(std::errc::timed_out);
  }
  return ready < 0 && errno != EINTR ? std::error_code(errno, std::generic_category())
                                     : std::error_code();
}

/// With O_APPEND every write(2) moves to the end of the file first, in the one call.
class AppendedFile : public WritableFile {
 public:
  explicit AppendedFile(FileDescriptor opened) : file(std::move(opened)) {}

  std::error_code append(std::string_view bytes) override {
    std::error_code error;
    std::optional<Clock::time_point> limit;
    while (!bytes.empty() && !error) {
      const auto written = write(file.get(), bytes.data(), bytes.size());
      if (written >= 0) {
        bytes.remove_prefix(static_cast<std::size_t>(written));
      } else if (errno == EAGAIN) {
        limit = limit.value_or(Clock::now() + kPatience);
        error = waitForRoom(file.get(), *limit);
      } else if (errno != EINTR) {
        error.assign(errno, std::generic_category());
      }
    }
    return error;
  }

 private:
  FileDescriptor file;
};

}  // namespace

void createEmptyFile(const std::string& path) {
  struct stat there {};
  if (stat(path.c_str(), &there) == 0 && !S_ISREG(there.st_mode)) {
    return;
  }
  openForWriting(path, O_CREAT | O_TRUNC);
}

std::unique_ptr<WritableFile> WritableFile::open(const std::string& path) {
  auto file = openForWriting(path, O_APPEND);
  return file ? std::make_unique<AppendedFile>(std::move(file)) : nullptr;
}
