#include "platform/posix/whole_write.h"

#include <poll.h>
#include <unistd.h>

#include <cerrno>

namespace {

using Clock = std::chrono::steady_clock;

/// Waits until a pipe or terminal takes more, no longer than `limit` if there is one.
std::error_code waitForRoom(int file, std::optional<Clock::time_point> limit) {
  constexpr int kForever = -1;
  int milliseconds = kForever;
  if (limit) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(*limit - Clock::now());
    milliseconds = left.count() <= 0 ? 0 : static_cast<int>(left.count());
  }
  pollfd waiting{file, POLLOUT, 0};
  const int ready = poll(&waiting, 1, milliseconds);
  if (ready == 0) {
    return std::make_error_code(std::errc::timed_out);
  }
  return ready < 0 && errno != EINTR ? std::error_code(errno, std::generic_category())
                                     : std::error_code();
}

}  // namespace

std::error_code writeWhole(int file, std::string_view bytes,
                           std::optional<std::chrono::seconds> patience) {
  std::error_code error;
  std::optional<Clock::time_point> limit;
  while (!bytes.empty() && !error) {
    const auto written = write(file, bytes.data(), bytes.size());
    if (written >= 0) {
      bytes.remove_prefix(static_cast<std::size_t>(written));
    } else if (errno == EAGAIN) {
      if (patience && !limit) {
        limit = Clock::now() + *patience;
      }
      error = waitForRoom(file, limit);
    } else if (errno != EINTR) {
      error.assign(errno, std::generic_category());
    }
  }
  return error;
}
