#pragma once

#include "platform/linux/file_descriptor.h"

#include <sys/types.h>

#include <map>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

/// How to start a process: each member has the plain case as its default.
struct ProcessStart {
  std::vector<std::string> words;                  ///< The program's path and its arguments.
  std::map<std::string, std::string> environment;  ///< On top of the test's own.
  std::string name;                                ///< Its name for itself, if not its path.
  bool onTerminal = false;                         ///< Standard input and output are a terminal.
};

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

/// A process whose standard streams the test holds: pipes, or a terminal and a pipe for standard
/// error. Whatever the test waits for and does not get within a minute throws std::runtime_error
/// that tells what the process had written. Used by one thread. Killed with the object, if it still
/// runs, and also when the test program dies.
class TestProcess {
 public:
  /// Starts it. A program that cannot be run is a process that ends with 127.
  explicit TestProcess(const ProcessStart& start);
  TestProcess(TestProcess&& other) noexcept;
  TestProcess& operator=(TestProcess&&) = delete;
  TestProcess(const TestProcess&) = delete;
  TestProcess& operator=(const TestProcess&) = delete;
  ~TestProcess();

  [[nodiscard]] pid_t id() const { return process; }

  /// Writes to its standard input; what it does not take, because it has ended, is dropped.
  void write(const std::string& text);

  /// Ends its standard input: closes the pipe, or types the end-of-file key.
  void endInput();

  /// Waits until it has written `text` to standard output behind what earlier calls took, and takes
  /// everything up to there.
  std::string readUntil(const std::string& text);

  /// The next line of standard output, without its newline.
  std::string readLine();

  void sendSignal(int signalNumber) const;

  /// Ends its input and waits for its end. The output is what no earlier call has taken.
  ProcessResult finish();

  /// Waits for its end without ending its input.
  ProcessResult await();

 private:
  bool readSome(bool untilEnd);
  [[noreturn]] void giveUp(const std::string& awaited);

  bool terminal;
  pid_t process = -1;
  FileDescriptor input;
  FileDescriptor output;
  FileDescriptor errors;
  std::string unreadOutput;
  std::string allErrors;
};
