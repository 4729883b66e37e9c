#include "platform/files.h"

#include "platform/posix/file_descriptor.h"
#include "platform/posix/whole_write.h"
#include "platform/process_end.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <system_error>
#include <utility>

namespace {

constexpr std::chrono::seconds kPatience{10};
constexpr mode_t kOwnerAlone = S_IRUSR | S_IWUSR;

/// Without O_NONBLOCK, a pipe that nobody reads would hold up the open, and later the write.
constexpr int kWriting = O_WRONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC;

/// Opens for writing what is at `path`; a text with a NUL is the path of nothing.
FileDescriptor openForWriting(const std::string& path, int flags) {
  if (path.find('\0') != std::string::npos) {
    return FileDescriptor();
  }
  FileDescriptor file(open(path.c_str(), kWriting | flags, kOwnerAlone));
  if (!file) {
    endIfScarce(errno);
  }
  return file;
}

/// With O_APPEND every write(2) moves to the end of the file first, in the one call.
class AppendedFile : public WritableFile {
 public:
  explicit AppendedFile(FileDescriptor opened) : file(std::move(opened)) {}

  std::error_code append(std::string_view bytes) override {
    return writeWhole(file.get(), bytes, kPatience);
  }

  std::error_code close() override {
    const int error = ::close(file.release()) == 0 ? 0 : errno;
    return {error, std::generic_category()};
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
