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

/// Whether a process runs whose command name, or the last component of whose executable, is exactly
/// `name`. The process table is read at each call; see proc(5).
bool processRunning(const std::string& name);

/// The names for which `processRunning` is true, without the beginnings of longer names.
std::set<std::string> processNames();
