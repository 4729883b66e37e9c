#include "platform/terminal/terminal_watch.h"

#include "platform/posix/wake_up.h"

#include <poll.h>
#include <pthread.h>
#include <termios.h>
#include <unistd.h>

#include <atomic>
#include <csignal>
#include <cstdlib>
#include <iterator>

namespace {

pthread_t reader{};
termios found{};
const WakeUp* wakeUp = nullptr;
std::atomic<int> pending = 0;  ///< The signal that `waitForTerminal` is to return.

void handleSignal(int number) {
  if (pthread_equal(pthread_self(), reader) == 0 && number != SIGABRT) {
    // Nothing but the reader sets the terminal otherwise, and it ends in here.
    pthread_kill(reader, number);
  } else {
    if (number != SIGWINCH) {
      restoreTerminal();
      std::signal(number, SIG_DFL);
      raise(number);  // It comes when this returns.
    }
    if (number != SIGABRT) {
      pending = number == SIGWINCH && pending != 0 ? pending.load() : number;
      wakeUp->signal();
    }  // Else the reader, awake before the end comes, would set the terminal for editing.
  }
}

}  // namespace

bool watchTerminal() {
  reader = pthread_self();
  if (tcgetattr(STDIN_FILENO, &found) != 0 || std::atexit(restoreTerminal) != 0) {
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
  const auto foreground = tcgetpgrp(STDIN_FILENO);
  if (wakeUp != nullptr && (foreground < 0 || foreground == getpgrp())) {
    tcsetattr(STDIN_FILENO, TCSANOW, &found);
  }
}

int waitForTerminal() {
  pollfd events[] = {{STDIN_FILENO, POLLIN, 0}, {wakeUp->descriptor(), POLLIN, 0}};
  int signal = 0;
  while (signal == 0 && events[0].revents == 0) {
    poll(events, std::size(events), -1);
    wakeUp->clear();
    signal = pending.exchange(0);
  }
  std::signal(signal, handleSignal);  // Gone if the process was stopped.
  return signal;
}
