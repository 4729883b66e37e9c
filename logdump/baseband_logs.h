#pragma once

#include "framework/command_base.h"

class LogdumpCommand;

/// The handler of "bb": has the manager dump the baseband trace and prints where it lies, also when
/// the manager does not run. It refers to `node`, which owns its handlers. All its work is done
/// when it returns; its result is false only when the manager could not be asked whether the trace
/// is on.
CommandHandler makeBasebandLogsHandler(LogdumpCommand& node);
