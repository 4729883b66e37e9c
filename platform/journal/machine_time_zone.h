#pragma once

#include "platform/time_zone.h"

#include <optional>

/// The machine's time zone, read when this is made, see tzset(3). Asks the C library once for
/// entries that follow each other closely. On one thread.
class MachineTimeZone : public TimeZone {
 public:
  MachineTimeZone();

  [[nodiscard]] std::chrono::seconds offsetAt(std::chrono::sys_seconds time) const override;

 private:
  /// A quarter of an hour in which the offset does not change.
  struct Stretch {
    std::chrono::sys_seconds start;
    std::chrono::seconds offset;
  };

  mutable std::optional<Stretch> latest;
};
