#pragma once

class LogdumpCommand;

/// Asks the manager whether the system-logs trace is in mode 3, in which collections are not to be
/// packed. False when the manager does not say so, for whatever reason. Blocks until the manager
/// has answered; on the shell thread.
bool isSystemLogsTraceModeThree(LogdumpCommand& node);
