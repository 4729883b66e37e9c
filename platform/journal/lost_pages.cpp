#include "platform/journal/lost_pages.h"

#include <sys/mman.h>
#include <unistd.h>

#include <csignal>
#include <cstdint>

namespace {

struct sigaction formerAction {};
std::uintptr_t pageSize = 0;

// Of a thread's own, and of types that a signal handler may touch on the thread it interrupts.
thread_local volatile std::sig_atomic_t survives = 0;
thread_local volatile unsigned long lost = 0;

/// Puts a page of zeros in place of the one that is gone, which holds `address`. False when that
/// cannot be done.
bool replacePage(void* address) {
  const auto offset = reinterpret_cast<std::uintptr_t>(address) % pageSize;
  auto* const page = static_cast<char*>(address) - offset;
  return mmap(page, pageSize, PROT_READ, MAP_PRIVATE | MAP_ANONYMOUS | MAP_FIXED, -1, 0) == page;
}

void handleBusError(int number, siginfo_t* info, void* /*context*/) {
  if (survives != 0 && info->si_code == BUS_ADRERR && replacePage(info->si_addr)) {
    lost = lost + 1;
    return;
  }
  // What touched the page does so again, and meets what was there before; what was sent is sent on.
  sigaction(SIGBUS, &formerAction, nullptr);
  if (info->si_code != BUS_ADRERR) {
    raise(number);
  }
}

bool takeBusErrors() {
  pageSize = static_cast<std::uintptr_t>(sysconf(_SC_PAGESIZE));
  struct sigaction action {};
  action.sa_sigaction = handleBusError;
  action.sa_flags = SA_SIGINFO;
  sigemptyset(&action.sa_mask);
  return sigaction(SIGBUS, &action, &formerAction) == 0;
}

}  // namespace

void surviveLostPages() {
  static const bool taken = takeBusErrors();
  survives = taken ? 1 : 0;
}

unsigned long lostPages() {
  return lost;
}
