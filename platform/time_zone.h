#pragma once

#include <chrono>

/// The rules of civil time in one place.
class TimeZone {
 public:
  TimeZone() = default;
  TimeZone(const TimeZone&) = delete;
  TimeZone& operator=(const TimeZone&) = delete;
  virtual ~TimeZone() = default;

  /// How far local time is ahead of GMT at `time`, daylight saving included; negative in the west.
  /// One thread at a time.
  [[nodiscard]] virtual std::chrono::seconds offsetAt(std::chrono::sys_seconds time) const = 0;
};
