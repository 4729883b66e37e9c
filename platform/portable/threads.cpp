#include "platform/threads.h"

#include "platform/process_end.h"

#include <pthread.h>

#include <system_error>
#include <utility>

sigset_t blockSignals() {
  sigset_t blocked{};
  sigset_t before{};
  sigfillset(&blocked);
  for (const int fault : {SIGBUS, SIGFPE, SIGILL, SIGSEGV}) {
    sigdelset(&blocked, fault);
  }
  pthread_sigmask(SIG_BLOCK, &blocked, &before);
  return before;
}

std::thread startThread(const std::string& name, std::function<void()> work) {
  constexpr std::size_t kLongestName = 15;
  // The thread never runs with other signals than its own.
  const auto before = blockSignals();
  try {
    std::thread started(std::move(work));
    pthread_setname_np(started.native_handle(), name.substr(0, kLongestName).c_str());
    pthread_sigmask(SIG_SETMASK, &before, nullptr);
    return started;
  } catch (const std::system_error& error) {
    endProcess("cannot start a thread", error.code().value());
  }
}
