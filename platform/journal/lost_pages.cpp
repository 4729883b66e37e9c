#include "platform/journal/lost_pages.h"

#include <sys/mman.h>
#include <unistd.h>

#include <csignal>
#include <cstdint>

namespace {

struct sigaction formerAction {};
std::uintptr_t pageSize = 0;

// Each thread has its own. A signal handler may touch these types on the thread that it interrupts.
thread_local volatile std::sig_atomic_t survives = 0;
thread_local volatile std::sig_atomic_t lost = 0;

/// Maps a page of zeros over the lost page that holds `address`. False when mmap(2) fails.
bool replacePage(void* address) {
  const auto offset = reinterpret_cast<std::uintptr_t>(address) % pageSize;
  auto* const page = static_cast<char*>(address) - offset;
  return mmap(page, pageSize, PROT_READ, MAP_PRIVATE | MAP_ANONYMOUS | MAP_FIXED, -1, 0) == page;
}

void handleBusError(int number, siginfo_t* info, void* /*context*/) {
  if (survives != 0 && info->si_code == BUS_ADRERR && replacePage(info->si_addr)) {
    lost = 1;
    return;
  }
  // Returning repeats the access, which now gets the former action. A sent signal has to be
  // re-sent.
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

bool hasLostPage() {
  const bool was = lost != 0;
  lost = 0;
  return was;
}
