#include "platform/process_end.h"

#include "platform/posix/whole_write.h"

#include <unistd.h>

#include <array>
#include <atomic>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <new>
#include <utility>

void endProcess(const char* what, int error) {
  static std::atomic_flag ending = ATOMIC_FLAG_INIT;
  static thread_local bool isEnding = false;
  if (std::exchange(isEnding, true)) {
    std::_Exit(EXIT_FAILURE);  // What restores the terminal finds no memory either.
  }
  while (ending.test_and_set()) {
    pause();  // Another thread ends the process.
  }
  std::array<char, 256> line{};
  std::snprintf(line.data(), line.size(), "velltool: %s%s%s\n", what, error == 0 ? "" : ": ",
                error == 0 ? "" : std::strerror(error));
  static_cast<void>(writeWhole(STDERR_FILENO, line.data()));
  std::quick_exit(EXIT_FAILURE);
}

void endWithoutMemory() {
  constexpr std::size_t kMiB = 1024UL * 1024;
  operator delete(operator new(kMiB));  // With the handler that ends the process.
}

void endIfScarce(int error) {
  if (error == ENOMEM) {
    endProcess("out of memory");
  }
  if (error == EMFILE || error == ENFILE) {
    endProcess("cannot open a file", error);
  }
}
