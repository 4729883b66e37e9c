#pragma once

#include "framework/command_base.h"

class LogdumpCommand;

/// The handlers of the node "logdump". Those that ask the manager refer to the node, which owns its
/// handlers.

/// The handler of "tel": asks the manager to collect the telephony logs and prints where they are
/// once it has. Its result is always true.
CommandHandler makeTelephonyLogsHandler(LogdumpCommand& node);

/// The handler of "core": as "tel", with a core dump of the modem, which is reset for it.
CommandHandler makeCoreDumpHandler(LogdumpCommand& node);

/// The handler of "bb": has the manager dump the baseband trace and prints where it lies, also when
/// the manager does not run. All its work is done when it returns; its result is false only when
/// the manager could not be asked whether the trace is on.
CommandHandler makeBasebandLogsHandler(LogdumpCommand& node);

/// The handler of "oslog": exports a span of the system log to a text file. Its words are a number
/// of seconds, the file's path, and after "-p" and "-i" the process names and image paths to
/// select; without those, the daemons of the telephony, baseband and power side are selected. Its
/// result is the export's, or false when the first two words are missing.
CommandHandler makeOsLogHandler();

/// The completer of "oslog": offers files, options, and behind "-p" the names of processes that
/// run.
std::set<std::string> completeOsLogArgs(const std::list<std::string>& before,
                                        const std::string& typed);
