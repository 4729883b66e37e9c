#include "platform/posix/wake_up.h"

#include "platform/process_end.h"

#include <sys/eventfd.h>

#include <cerrno>

WakeUp::WakeUp() : event(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK)) {
  if (!event) {
    endProcess("cannot wait for events", errno);
  }
}

void WakeUp::signal() const {
  static_cast<void>(eventfd_write(event.get(), 1));
}

void WakeUp::clear() const {
  eventfd_t signals = 0;
  static_cast<void>(eventfd_read(event.get(), &signals));
}
