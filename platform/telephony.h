#pragma once

#include <set>
#include <string>

/// What the device says of its radio, its build and its processes. The answers of the device
/// profile do not change while the process runs.

/// The type of the device's cellular radio; 0 when it has none.
int radioType();

/// The device's product code.
int productCode();

/// The vendor of the device's baseband radio.
int radioVendor();

/// Whether the radio's diagnostic interface supports QDSS tracing.
bool radioDiagSupportsQdss();

/// Whether the operating system is an internal build.
bool isInternalBuild();

/// Whether the operating system is a carrier build.
bool isCarrierBuild();

/// The command names of the processes that run now, and the last components of their executables,
/// see proc(5). Without command names of 15 bytes: those of longer ones are cut so.
std::set<std::string> processNames();

/// Whether a process ran with exactly this name when this was first asked for any name.
bool processRunning(const std::string& name);
