#pragma once

#include "simulator/profile.h"

#include <filesystem>

namespace simulator {

/// How the process of a service ends when a fault ends it; `kStatusRestart` asks for a new one.
inline constexpr int kStatusDied = 70;
inline constexpr int kStatusRestart = 75;

/// Is the manager of the device at `root`, `org.vell.Manager1` on the system bus, until that goes
/// away. Answers as `profile` says, and logs each request in std::clog. Says "ready" on standard
/// output once it can be reached. Returns the exit status of the process, which has one thread.
///
/// When its standard input is a pipe it obeys the lines that come in:
///   state STATE        the server state is STATE from now on, and an event says so
///   event NAME STATE   sends an event NAME that speaks of STATE; the state stays
/// Each is logged once the event is out.
int serveManager(const Profile& profile, const std::filesystem::path& root);

/// As `serveManager`, the manager's helper, `org.vell.Helper1`. Reads no standard input.
int serveHelper(const Profile& profile, const std::filesystem::path& root);

}  // namespace simulator
