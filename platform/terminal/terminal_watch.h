#pragma once

/// Keeps how the terminal at standard input is set now, and sets it so again when the process
/// exits, when it is stopped by SIGTSTP, and when a signal ends it whose action is still the
/// default one. Called once, on the thread that is to read from the terminal: from then on it acts
/// on the signals. False, and nothing is done, when standard input is no terminal.
bool watchTerminal();

/// Sets the terminal as it was found, unless it is not watched or another process's now.
void restoreTerminal();

/// Waits until standard input can be read, and returns 0; or until the size of the window has
/// changed, or the process was stopped and goes on with the terminal as it was found, and returns
/// the signal that said so: SIGWINCH, or the one that stopped it. On the reading thread.
int waitForTerminal();
