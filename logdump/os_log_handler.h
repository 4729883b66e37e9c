#pragma once

#include "framework/command_base.h"

/// The handler of "oslog": exports a span of the system log to a text file. Its words are a number
/// of seconds, the file's path, and after "-p" and "-i" the process names and image paths to
/// select; without those, the daemons of the telephony, baseband and power side are selected. Its
/// result is the export's, or false when the first two words are missing.
CommandHandler makeOsLogHandler();
