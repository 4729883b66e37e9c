#pragma once

#include <fcntl.h>
#include <unistd.h>

#include <utility>

/// Owns an open file descriptor and closes it; -1 is none. Takes what open(2) and its like return.
class FileDescriptor {
 public:
  explicit FileDescriptor(int opened = -1) : number(opened) {}
  FileDescriptor(FileDescriptor&& other) noexcept : number(std::exchange(other.number, -1)) {}
  FileDescriptor& operator=(FileDescriptor&& other) noexcept {
    std::swap(number, other.number);
    return *this;
  }
  FileDescriptor(const FileDescriptor&) = delete;
  FileDescriptor& operator=(const FileDescriptor&) = delete;
  ~FileDescriptor() {
    if (number >= 0) {
      close(number);
    }
  }

  /// Whether there is one.
  explicit operator bool() const { return number >= 0; }

  [[nodiscard]] int get() const { return number; }

  /// A second one for the same open file, closed over exec(3); none, and errno is set, when there
  /// is none to be had.
  [[nodiscard]] FileDescriptor duplicate() const {
    return FileDescriptor(fcntl(number, F_DUPFD_CLOEXEC, 0));
  }

  /// Gives up ownership.
  int release() { return std::exchange(number, -1); }

 private:
  int number;
};
