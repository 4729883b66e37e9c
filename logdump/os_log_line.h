#pragma once

#include "platform/log_entry.h"

#include <string>

/// The line of the export that shows `entry`, its line break included: local time (with the suffix
/// of GMT), thread, activity and process identifiers, process and sender, subsystem, category and
/// message; "(null)" for a text that the entry lacks.
std::string formatOsLogLine(const LogEntry& entry);
