#pragma once

#include "platform/posix/file_descriptor.h"

#include <sys/types.h>

#include <csignal>
#include <string>
#include <vector>

namespace simulator {

/// How a child goes with this process. What is negative is as it is here.
struct ChildManners {
  int signalAtParentsDeath = SIGKILL;  ///< Sent to the child when this process ends.
  bool isService = true;               ///< The child gets no signals from the terminal.
  int input = -1;                      ///< Its standard input.
  int piped = -1;  ///< STDIN_FILENO or STDOUT_FILENO, to have that be a pipe to this process.
};

/// A program that was started.
struct Child {
  pid_t process = -1;                      ///< -1 when there can be no more processes or files.
  FileDescriptor pipe = FileDescriptor();  ///< This end of the pipe, if one was asked for.
};

/// Starts `words` (at least one, looked up along PATH) as a child of this process, with all signals
/// let through. Complains when there can be none. A program that cannot be run is a child that
/// complains and ends with 127. For processes with one thread only.
Child startChild(const std::vector<std::string>& words, const ChildManners& manners);

/// Waits for the end of a child. Gives its exit status, 128 and its signal when one ended it.
int awaitChild(pid_t child);

/// What waitpid(2) told, as `awaitChild` gives it.
int exitStatusOf(int waitStatus);

}  // namespace simulator
