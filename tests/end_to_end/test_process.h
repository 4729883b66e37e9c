#pragma once

#include "platform/posix/file_descriptor.h"

#include <sys/types.h>

#include <chrono>
#include <filesystem>
#include <memory>
#include <ostream>
#include <string>
#include <vector>

/// What a process that has ended left behind.
struct ProcessResult {
  int status = 0;  ///< Its exit status, 128 and the signal when one ended it.
  std::string output;
  std::string errors;

  friend bool operator==(const ProcessResult&, const ProcessResult&) = default;
  friend std::ostream& operator<<(std::ostream& stream, const ProcessResult& result) {
    return stream << "status " << result.status << "\noutput:\n"
                  << result.output << "errors:\n"
                  << result.errors;
  }
};

/// A process whose standard input and output are pipes that the test holds. What the test waits for
/// and does not get within a minute throws std::runtime_error that tells what the process had
/// written. Used by one thread. Killed with the object, and also when the test program dies.
class TestProcess {
 public:
  /// Starts what env(1) makes of `words`: a program, looked up along PATH, and its arguments,
  /// behind the NAME=VALUE that it gets on top of the test's own environment. A program that cannot
  /// be run is a process that ends with 127.
  explicit TestProcess(std::vector<std::string> words);

  /// Writes to its standard input; what it does not take, because it has ended, is dropped.
  void write(const std::string& text) const;

  /// Waits until it has written `text` to standard output behind what earlier calls took, and takes
  /// everything up to there.
  std::string readUntil(const std::string& text);

  /// The next line of standard output, without its newline.
  std::string readLine();

  /// Waits for more standard output and keeps it for the calls that take it. False at the end. A
  /// wait that is given up names what was `awaited`.
  bool readSome(const std::string& awaited = "more output");

  /// Whether standard output has more, now or within `patience`; true at its end, too.
  [[nodiscard]] bool hasMore(std::chrono::milliseconds patience) const;

  /// Whether each write to standard output so far ended with its first line break, if it had any.
  [[nodiscard]] bool wroteEachLineAtOnce() const { return eachLineAtOnce; }

  void sendSignal(int signalNumber) const;

  /// Closes its input and waits for its end. The output is what no earlier call has taken.
  ProcessResult finish();

 private:
  [[noreturn]] void giveUp(const std::string& awaited) const;
  [[nodiscard]] std::string writtenErrors() const;

  FileDescriptor input;
  FileDescriptor output;
  FileDescriptor errors;  ///< The file that is its standard error.
  std::string unreadOutput;
  bool eachLineAtOnce = true;
  pid_t process;
  std::shared_ptr<void> killer;
};

/// A file's content; empty when there is none.
std::string contentOf(const std::filesystem::path& path);
