#pragma once

/// Ends the process with status 1, for want of something that it cannot go on without. Writes
/// "velltool: ", `what` and, unless it is 0, what the errno `error` means as one line to standard
/// error, and sets the terminal as it was found. Nothing else is written: no stream is flushed and
/// nothing is destroyed, see std::quick_exit. Needs no memory.
[[noreturn]] void endProcess(const char* what, int error = 0);

/// Ends the process if the errno `error` says that memory or file descriptors have run out.
void endIfScarce(int error);

/// Ends the process if it finds no memory now, not even for a MiB.
void endWithoutMemory();

/// What a library returned, a negative errno after a failure; ends the process as `endIfScarce`
/// does. Such a failure tells nothing of what was asked.
inline int checked(int result) {
  endIfScarce(-result);
  return result;
}
