#include "platform/terminal/terminal_watch.h"

#include "platform/posix/wake_up.h"

#include <poll.h>
#include <pthread.h>
#include <termios.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <iterator>

namespace {

pthread_t reader{};
termios found{};
const WakeUp* wakeUp = nullptr;
std::atomic<bool> stopped = false;  ///< Since `waitForTerminal` told it last.

/// Sets the terminal, unless it is another process's now.
void setTerminal(const termios& settings) {
  const auto foreground = tcgetpgrp(STDIN_FILENO);
  if (foreground < 0 || foreground == getpgrp()) {
    tcsetattr(STDIN_FILENO, TCSANOW, &settings);
  }
}

void handleSignal(int number) {
  if (pthread_equal(pthread_self(), reader) == 0 && number != SIGABRT) {
    // The reader alone sets the terminal. abort(3) does not wait for it.
    pthread_kill(reader, number);
    return;
  }
  const int error = errno;
  if (number != SIGWINCH) {
    termios used = found;
    tcgetattr(STDIN_FILENO, &used);
    restoreTerminal();
    std::signal(number, SIG_DFL);
    raise(number);
    sigset_t none;
    sigemptyset(&none);
    pthread_sigmask(SIG_SETMASK, &none, nullptr);
    // The process was stopped, and goes on.
    std::signal(number, handleSignal);
    setTerminal(used);
    stopped = true;
  }
  wakeUp->signal();
  errno = error;  // The signal may have come before somebody looked at it.
}

}  // namespace

bool watchTerminal() {
  reader = pthread_self();
  if (tcgetattr(STDIN_FILENO, &found) != 0 || std::atexit(restoreTerminal) != 0 ||
      std::at_quick_exit(restoreTerminal) != 0) {
    return false;
  }
  wakeUp = new WakeUp;
  for (int number = 1; number <= SIGRTMAX; ++number) {
    struct sigaction action {};
    const bool doesNothing = number == SIGCHLD || number == SIGCONT || number == SIGURG;
    sigaction(number, nullptr, &action);
    if (!doesNothing && action.sa_handler == SIG_DFL) {
      std::signal(number, handleSignal);
    }
  }
  return true;
}

void restoreTerminal() {
  if (wakeUp != nullptr) {
    setTerminal(found);
  }
}

bool waitForTerminal(bool& wasStopped) {
  pollfd events[] = {{STDIN_FILENO, POLLIN, 0}, {wakeUp->descriptor(), POLLIN, 0}};
  poll(events, std::size(events), -1);
  wakeUp->clear();
  wasStopped = stopped.exchange(false);
  return events[0].revents != 0;
}
