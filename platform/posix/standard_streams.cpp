#include "platform/posix/whole_write.h"
#include "platform/program.h"

#include <fcntl.h>
#include <unistd.h>

#include <initializer_list>
#include <iostream>
#include <streambuf>
#include <string>

namespace {

void openMissingStreams() {
  for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    if (fcntl(stream, F_GETFD) < 0) {
      // The lowest free number is this one. What it is opened for is what it is there for.
      static_cast<void>(open("/dev/null", stream == STDIN_FILENO ? O_RDONLY : O_WRONLY));
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

}  // namespace

void prepareStandardStreams() {
  openMissingStreams();
  // Never destroyed: the process flushes both when it exits.
  std::cout.rdbuf(new DescriptorBuffer(STDOUT_FILENO));
  std::cerr.rdbuf(new DescriptorBuffer(STDERR_FILENO));
}
