#pragma once

#include "framework/command_base.h"

class LogdumpCommand;

/// The handler of "tel": asks the manager to collect the telephony logs and prints where they are
/// once it has. It refers to `node`, which owns its handlers. Its result is always true.
CommandHandler makeTelephonyLogsHandler(LogdumpCommand& node);

/// The handler of "core": as "tel", with a core dump of the modem, which is reset for it.
CommandHandler makeCoreDumpHandler(LogdumpCommand& node);
