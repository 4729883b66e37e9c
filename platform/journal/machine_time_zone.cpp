#include "platform/journal/machine_time_zone.h"

#include "platform/process_end.h"

#include <cerrno>
#include <cstdint>
#include <ctime>
#include <ratio>

namespace {

/// No zone changes its offset twice in so short a time: equal offsets at both ends hold in between.
using QuarterHours = std::chrono::duration<std::int64_t, std::ratio<15L * 60>>;

std::chrono::seconds askLibrary(std::chrono::sys_seconds time) {
  const std::time_t seconds = time.time_since_epoch().count();
  std::tm local{};
  return localtime_r(&seconds, &local) == nullptr ? std::chrono::seconds(0)
                                                  : std::chrono::seconds(local.tm_gmtoff);
}

}  // namespace

MachineTimeZone::MachineTimeZone() {
  errno = 0;
  tzset();  // Takes a zone that it cannot read for UTC.
  endIfScarce(errno);
}

std::chrono::seconds MachineTimeZone::offsetAt(std::chrono::sys_seconds time) const {
  const std::chrono::sys_seconds start = std::chrono::floor<QuarterHours>(time);
  if (latest && latest->start == start) {
    return latest->offset;
  }
  const auto offset = askLibrary(time);
  const auto last = start + QuarterHours(1) - std::chrono::seconds(1);
  const bool constant = askLibrary(start) == offset && askLibrary(last) == offset;
  latest = constant ? std::optional(Stretch{start, offset}) : std::nullopt;
  return offset;
}
