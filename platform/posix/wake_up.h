#pragma once

#include "platform/posix/file_descriptor.h"

/// A way to wake a thread that waits in poll(2), see eventfd(2).
class WakeUp {
 public:
  /// Ends the process when the system has none to give.
  WakeUp();

  /// Wakes the thread, or keeps it from falling asleep the next time. From any thread.
  void signal() const;

  /// Takes back all signals so far. On the thread that waits.
  void clear() const;

  /// What to wait on; readable while there is a signal.
  [[nodiscard]] int descriptor() const { return event.get(); }

 private:
  FileDescriptor event;
};
