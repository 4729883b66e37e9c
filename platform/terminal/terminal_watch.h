#pragma once

/// Keeps how the terminal at standard input is set now, and sets it so again when the process
/// exits, when it is stopped by SIGTSTP, and when a signal ends it whose action is still the
/// default one. Called once, on the thread that is to read from the terminal: from then on it acts
/// on the signals. False, and nothing is done, when standard input is no terminal.
bool watchTerminal();

/// Sets the terminal as it was found, unless it is not watched or another process's now.
void restoreTerminal();

/// Waits until standard input can be read; or until the size of the window may have changed, or the
/// process was stopped and goes on. Returns whether standard input can be read, and in `wasStopped`
/// whether the process was stopped since the last call. On the reading thread.
bool waitForTerminal(bool& wasStopped);
