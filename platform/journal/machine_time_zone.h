#pragma once

#include "platform/time_zone.h"

#include <optional>

/// The zone of the machine, as the C library finds it (tzset(3)) when this is made. Entries that
/// follow each other closely are answered from memory.
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
