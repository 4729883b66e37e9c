#include "simulator/child_process.h"

#include "simulator/complaint.h"

#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <utility>

namespace simulator {

namespace {

constexpr int kStatusCannotRun = 127;

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

/// Makes this process, a new child of `parent`, what `manners` say.
void adopt(const ChildManners& manners, pid_t parent, int pipe) {
  prctl(PR_SET_PDEATHSIG, manners.signalAtParentsDeath);
  if (getppid() != parent) {
    _exit(kStatusCannotRun);
  }
  if (manners.isService) {
    setpgid(0, 0);
  }
  if (manners.input >= 0) {
    dup2(manners.input, STDIN_FILENO);
  }
  if (manners.piped >= 0) {
    dup2(pipe, manners.piped);
  }
  sigset_t none;
  sigemptyset(&none);
  sigprocmask(SIG_SETMASK, &none, nullptr);
}

}  // namespace

Child startChild(const std::vector<std::string>& words, const ChildManners& manners) {
  int ends[2] = {-1, -1};
  const bool piped = manners.piped < 0 || pipe2(ends, O_CLOEXEC) == 0;
  FileDescriptor readable(ends[0]);
  FileDescriptor writable(ends[1]);
  const bool childReads = manners.piped == STDIN_FILENO;
  const pid_t parent = getpid();
  const pid_t child = piped ? fork() : -1;
  if (child < 0) {
    complain("cannot start " + words.front() + ": " + std::strerror(errno));
  }
  if (child == 0) {
    adopt(manners, parent, childReads ? readable.get() : writable.get());
    becomeProgram(words);
  }
  return {child, std::move(childReads ? writable : readable)};
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
