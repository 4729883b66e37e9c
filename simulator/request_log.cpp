#include "simulator/request_log.h"

#include "simulator/complaint.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

namespace simulator {

RequestLog::RequestLog(const std::string& path)
    : file(path.empty() ? dup(STDOUT_FILENO)
                        : open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644)) {
  if (!file) {
    complain(path + ": " + std::strerror(errno));
  }
}

void RequestLog::write(const std::string& line) const {
  const auto text = line + "\n";
  for (std::size_t written = 0; written < text.size();) {
    const auto count = ::write(file.get(), text.data() + written, text.size() - written);
    if (count < 0 && errno != EINTR) {
      return;
    }
    written += count > 0 ? static_cast<std::size_t>(count) : 0;
  }
}

}  // namespace simulator
