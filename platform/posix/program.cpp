#include "platform/program.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <initializer_list>

const char* getprogname() {
  const char* name = program_invocation_short_name;
  return name == nullptr || *name == '\0' ? "velltool" : name;
}

void openMissingStandardStreams() {
  for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    if (fcntl(stream, F_GETFD) < 0) {
      // The lowest free number is this one. What it is opened for is what it is there for.
      static_cast<void>(open("/dev/null", stream == STDIN_FILENO ? O_RDONLY : O_WRONLY));
    }
  }
}

void runMainEventLoop() {
  // Nothing on this platform is delivered to the main thread; it only has to stay.
  while (true) {
    pause();
  }
}
