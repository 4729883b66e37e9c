#include "platform/posix/read_file.h"

#include "platform/posix/file_descriptor.h"
#include "platform/process_end.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>

int readRegularFile(const std::filesystem::path& path, std::size_t most, std::string& text) {
  const FileDescriptor file(open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
  struct stat status {};
  if (!file || fstat(file.get(), &status) != 0) {
    endIfScarce(errno);
    return errno;
  }
  if (!S_ISREG(status.st_mode)) {
    return EINVAL;
  }
  text.clear();
  std::array<char, 4096> piece{};  // The size that a kernel names need not be what can be read.
  ssize_t count = 1;
  while ((count > 0 || (count < 0 && errno == EINTR)) && text.size() < most) {
    count = read(file.get(), piece.data(), std::min(piece.size(), most - text.size()));
    text.append(piece.data(), static_cast<std::size_t>(std::max<ssize_t>(count, 0)));
  }
  if (count < 0) {
    endIfScarce(errno);
    return errno;
  }
  return 0;
}
