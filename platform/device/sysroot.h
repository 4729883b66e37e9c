#pragma once

#include <filesystem>

/// The directory that stands for the root of the device's file system: what VELL_SYSROOT named when
/// it was first asked for, "/" when that is unset, empty, or not to be trusted (secure_getenv(3)).
const std::filesystem::path& sysroot();

/// Whether the device is the local machine itself, that is, `sysroot()` was not set by anyone.
bool isLocalMachine();
