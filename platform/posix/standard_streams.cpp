#include "platform/posix/whole_write.h"
#include "platform/process_end.h"
#include "platform/program.h"

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <initializer_list>
#include <iostream>
#include <streambuf>
#include <string>

namespace {

void openMissingStreams() {
  for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    if (fcntl(stream, F_GETFD) < 0) {
      // The lowest free number is this one. What it is opened for is what it is there for.
      if (open("/dev/null", stream == STDIN_FILENO ? O_RDONLY : O_WRONLY) < 0) {
        endProcess("cannot open /dev/null", errno);
      }
    }
  }
}

/// Collects what is written and hands it to an open file, whole, when it is flushed.
class DescriptorBuffer : public std::streambuf {
 public:
  explicit DescriptorBuffer(int descriptor) : file(descriptor) {}

 protected:
  int_type overflow(int_type character) override {
    if (!traits_type::eq_int_type(character, traits_type::eof())) {
      unwritten += traits_type::to_char_type(character);
    }
    return traits_type::not_eof(character);
  }

  int sync() override {
    const auto error = writeWhole(file, unwritten);
    unwritten.clear();
    return error ? -1 : 0;
  }

 private:
  int file;
  std::string unwritten;
};

/// Reads standard input. Waits where it does not block.
class InputBuffer : public std::streambuf {
 protected:
  int_type underflow() override {
    ssize_t count = 0;
    while ((count = read(STDIN_FILENO, bytes.data(), bytes.size())) < 0 &&
           (errno == EAGAIN || errno == EINTR)) {
      pollfd waiting{STDIN_FILENO, POLLIN, 0};
      poll(&waiting, 1, -1);
    }
    setg(bytes.data(), bytes.data(), bytes.data() + std::max<ssize_t>(count, 0));
    return count > 0 ? traits_type::to_int_type(bytes[0]) : traits_type::eof();
  }

 private:
  std::array<char, 4096> bytes = {};
};

}  // namespace

void prepareStandardStreams() {
  openMissingStreams();
  // Never destroyed: the process may still use them when it exits.
  std::cin.rdbuf(new InputBuffer);
  std::cout.rdbuf(new DescriptorBuffer(STDOUT_FILENO));
  std::cerr.rdbuf(new DescriptorBuffer(STDERR_FILENO));
}
