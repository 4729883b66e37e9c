#pragma once

#include <sys/types.h>

#include <csignal>
#include <string>
#include <vector>

namespace simulator {

/// How a child goes with this process.
struct ChildManners {
  int signalAtParentsDeath = SIGKILL;  ///< Sent to the child when this process ends.
  bool isService = true;               ///< The child gets no signals from the terminal.
};

/// Starts `words` (at least one, looked up along PATH) as a child of this process, with all signals
/// let through and with `input` and `output`, where not negative, as its standard input and output.
/// Returns -1, after a complaint, when there can be no more processes. A program that cannot be run
/// is a child that complains and ends with 127. For processes with one thread only.
pid_t startChild(const std::vector<std::string>& words, const ChildManners& manners, int input,
                 int output);

/// Waits for the end of a child. Gives its exit status, 128 and its signal when one ended it.
int awaitChild(pid_t child);

/// What waitpid(2) told, as `awaitChild` gives it.
int exitStatusOf(int waitStatus);

}  // namespace simulator
