#include "platform/program.h"

#include <unistd.h>

#include <cerrno>

const char* getprogname() {
  const char* name = program_invocation_short_name;
  return name == nullptr || *name == '\0' ? "velltool" : name;
}

void runMainEventLoop() {
  // Nothing on this platform is delivered to the main thread; it only has to stay.
  while (true) {
    pause();
  }
}
