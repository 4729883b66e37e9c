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
  std::array<char, 4096> part{};
  for (text.clear(); text.size() < most;) {
    const auto count = read(file.get(), part.data(), std::min(part.size(), most - text.size()));
    if (count < 0 && errno != EINTR) {
      return errno;
    }
    if (count == 0) {
      break;
    }
    text.append(part.data(), static_cast<std::size_t>(std::max<ssize_t>(count, 0)));
  }
  return 0;
}
