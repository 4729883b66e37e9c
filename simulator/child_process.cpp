#include "simulator/child_process.h"

#include "simulator/complaint.h"

#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

namespace simulator {

namespace {

constexpr int kStatusCannotRun = 127;

void letSignalsThrough() {
  sigset_t none;
  sigemptyset(&none);
  sigprocmask(SIG_SETMASK, &none, nullptr);
}

[[noreturn]] void becomeProgram(const std::vector<std::string>& words) {
  std::vector<char*> arguments;
  arguments.reserve(words.size() + 1);
  for (const auto& word : words) {
    arguments.push_back(const_cast<char*>(word.c_str()));
  }
  arguments.push_back(nullptr);
  execvp(arguments.front(), arguments.data());
  complain(words.front() + ": " + std::strerror(errno));
  _exit(kStatusCannotRun);
}

}  // namespace

pid_t startChild(const std::vector<std::string>& words, const ChildManners& manners, int input,
                 int output) {
  const pid_t parent = getpid();
  const pid_t child = fork();
  if (child < 0) {
    complain("cannot start " + words.front() + ": " + std::strerror(errno));
  }
  if (child != 0) {
    return child;
  }
  prctl(PR_SET_PDEATHSIG, manners.signalAtParentsDeath);
  if (getppid() != parent) {
    _exit(kStatusCannotRun);
  }
  if (manners.isService) {
    setpgid(0, 0);
  }
  if (input >= 0) {
    dup2(input, STDIN_FILENO);
  }
  if (output >= 0) {
    dup2(output, STDOUT_FILENO);
  }
  letSignalsThrough();
  becomeProgram(words);
}

int awaitChild(pid_t child) {
  int status = 0;
  while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  return exitStatusOf(status);
}

int exitStatusOf(int waitStatus) {
  constexpr int kSignalled = 128;
  return WIFEXITED(waitStatus) ? WEXITSTATUS(waitStatus) : kSignalled + WTERMSIG(waitStatus);
}

}  // namespace simulator
