#pragma once

#include <chrono>

/// A point in time, UTC, in the resolution of the system log. Points before 1970 are negative.
using LogTime = std::chrono::sys_time<std::chrono::microseconds>;

/// The current time of the system's clock, which may be set back and forth.
LogTime currentTime();
