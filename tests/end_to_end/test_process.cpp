#include "tests/end_to_end/test_process.h"

#include <fcntl.h>
#include <poll.h>
#include <pty.h>
#include <sys/ioctl.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <stdexcept>
#include <system_error>
#include <utility>

namespace {

constexpr int kPatienceMilliseconds = 60'000;
constexpr int kStatusCannotRun = 127;
constexpr const char* kEndOfFileKey = "\x04";

/// Throws what errno says of `call` when `result` is negative.
int checked(int result, const char* call) {
  if (result < 0) {
    throw std::system_error(errno, std::generic_category(), call);
  }
  return result;
}

struct Pipe {
  FileDescriptor readable;
  FileDescriptor writable;

  Pipe() {
    int ends[2] = {-1, -1};
    checked(pipe2(ends, O_CLOEXEC), "pipe2");
    readable = FileDescriptor(ends[0]);
    writable = FileDescriptor(ends[1]);
  }
};

/// The test's end and the process's end of one of its streams or of two.
struct Streams {
  FileDescriptor testsInput;
  FileDescriptor testsOutput;
  FileDescriptor processInput;
  FileDescriptor processOutput;
};

Streams makePipes() {
  Pipe in;
  Pipe out;
  return {std::move(in.writable), std::move(out.readable), std::move(in.readable),
          std::move(out.writable)};
}

Streams makeTerminal() {
  int master = -1;
  int slave = -1;
  checked(openpty(&master, &slave, nullptr, nullptr, nullptr), "openpty");
  for (const int end : {master, slave}) {
    checked(fcntl(end, F_SETFD, FD_CLOEXEC), "fcntl");
  }
  return {
      FileDescriptor(checked(fcntl(master, F_DUPFD_CLOEXEC, 0), "fcntl")), FileDescriptor(master),
      FileDescriptor(checked(fcntl(slave, F_DUPFD_CLOEXEC, 0), "fcntl")), FileDescriptor(slave)};
}

std::vector<char*> pointersTo(std::vector<std::string>& words) {
  std::vector<char*> pointers;
  pointers.reserve(words.size() + 1);
  for (auto& word : words) {
    pointers.push_back(word.data());
  }
  pointers.push_back(nullptr);
  return pointers;
}

std::vector<std::string> environmentWith(const std::map<std::string, std::string>& additions) {
  std::vector<std::string> environment;
  for (char** variable = environ; *variable != nullptr; ++variable) {
    const std::string text = *variable;
    if (!additions.contains(text.substr(0, text.find('=')))) {
      environment.push_back(text);
    }
  }
  for (const auto& [name, value] : additions) {
    environment.push_back(std::string(name).append("=").append(value));
  }
  return environment;
}

}  // namespace

TestProcess::TestProcess(const ProcessStart& start) : terminal(start.onTerminal) {
  // A process that has ended must not end the test when the test writes to it.
  std::signal(SIGPIPE, SIG_IGN);
  auto streams = terminal ? makeTerminal() : makePipes();
  Pipe errorPipe;
  auto words = start.words;
  if (!start.name.empty()) {
    words.front() = start.name;
  }
  auto environment = environmentWith(start.environment);
  const auto arguments = pointersTo(words);
  const auto variables = pointersTo(environment);
  process = checked(fork(), "fork");
  if (process == 0) {
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    std::signal(SIGPIPE, SIG_DFL);
    dup2(streams.processInput.get(), STDIN_FILENO);
    dup2(streams.processOutput.get(), STDOUT_FILENO);
    dup2(errorPipe.writable.get(), STDERR_FILENO);
    if (terminal) {
      setsid();
      ioctl(STDIN_FILENO, TIOCSCTTY, 0);
    }
    execve(start.words.front().c_str(), arguments.data(), variables.data());
    _exit(kStatusCannotRun);
  }
  input = std::move(streams.testsInput);
  output = std::move(streams.testsOutput);
  errors = std::move(errorPipe.readable);
}

TestProcess::TestProcess(TestProcess&& other) noexcept
    : terminal(other.terminal),
      process(std::exchange(other.process, -1)),
      input(std::move(other.input)),
      output(std::move(other.output)),
      errors(std::move(other.errors)),
      unreadOutput(std::move(other.unreadOutput)),
      allErrors(std::move(other.allErrors)) {}

TestProcess::~TestProcess() {
  if (process > 0) {
    kill(process, SIGKILL);
    waitpid(process, nullptr, 0);
  }
}

void TestProcess::write(const std::string& text) {
  for (std::size_t written = 0; written < text.size();) {
    const auto count = ::write(input.get(), text.data() + written, text.size() - written);
    if (count < 0) {
      return;
    }
    written += static_cast<std::size_t>(count);
  }
}

void TestProcess::endInput() {
  if (terminal) {
    return write(kEndOfFileKey);
  }
  input = FileDescriptor();
}

std::string TestProcess::readUntil(const std::string& text) {
  auto found = unreadOutput.find(text);
  while (found == std::string::npos) {
    if (!readSome(false)) {
      giveUp(text);
    }
    found = unreadOutput.find(text);
  }
  auto taken = unreadOutput.substr(0, found + text.size());
  unreadOutput.erase(0, taken.size());
  return taken;
}

std::string TestProcess::readLine() {
  auto line = readUntil("\n");
  line.pop_back();
  return line;
}

void TestProcess::sendSignal(int signalNumber) const {
  kill(process, signalNumber);
}

ProcessResult TestProcess::finish() {
  endInput();
  return await();
}

ProcessResult TestProcess::await() {
  while (readSome(true)) {
  }
  int status = 0;
  waitpid(std::exchange(process, -1), &status, 0);
  constexpr int kSignalled = 128;
  return {WIFEXITED(status) ? WEXITSTATUS(status) : kSignalled + WTERMSIG(status),
          std::exchange(unreadOutput, ""), std::exchange(allErrors, "")};
}

/// Takes in what can be read now, waiting for it. False at the end of standard output, or with
/// `untilEnd` at the end of both.
bool TestProcess::readSome(bool untilEnd) {
  pollfd ends[] = {{output.get(), POLLIN, 0}, {errors.get(), POLLIN, 0}};
  if (!output && (!untilEnd || !errors)) {
    return false;
  }
  if (checked(poll(ends, 2, kPatienceMilliseconds), "poll") == 0) {
    giveUp(untilEnd ? "its end" : "more output");
  }
  const auto take = [](const pollfd& ready, FileDescriptor& end, std::string& text) {
    std::array<char, 4096> buffer{};
    if (ready.revents == 0) {
      return;
    }
    // A terminal whose other end is closed gives an error where a pipe gives nothing.
    const auto count = read(ready.fd, buffer.data(), buffer.size());
    if (count <= 0) {
      end = FileDescriptor();
      return;
    }
    text.append(buffer.data(), static_cast<std::size_t>(count));
  };
  take(ends[0], output, unreadOutput);
  take(ends[1], errors, allErrors);
  return true;
}

void TestProcess::giveUp(const std::string& awaited) {
  throw std::runtime_error("no \"" + awaited + "\"; unread output \"" + unreadOutput +
                           "\", errors \"" + allErrors + "\"");
}
