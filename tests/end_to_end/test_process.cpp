#include "tests/end_to_end/test_process.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <csignal>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <system_error>
#include <utility>

namespace {

/// The end of a new pipe that a process is to have; `testsEnd` is the other one.
FileDescriptor makePipe(FileDescriptor& testsEnd, bool processReads) {
  int ends[2] = {-1, -1};
  // With O_DIRECT, one read gives what one write has written.
  if (pipe2(ends, O_CLOEXEC | (processReads ? 0 : O_DIRECT)) != 0) {
    throw std::system_error(errno, std::generic_category(), "pipe2");
  }
  testsEnd = FileDescriptor(ends[processReads ? 1 : 0]);
  return FileDescriptor(ends[processReads ? 0 : 1]);
}

}  // namespace

TestProcess::TestProcess(std::vector<std::string> words)
    : errors(memfd_create("errors", MFD_CLOEXEC)) {
  // A process that has ended must not end the test when the test writes to it.
  std::signal(SIGPIPE, SIG_IGN);
  words.insert(words.begin(), {"/usr/bin/env", "--default-signal=PIPE"});
  std::vector<char*> arguments(words.size() + 1);
  std::transform(words.begin(), words.end(), arguments.begin(),
                 [](std::string& word) { return word.data(); });
  const auto processInput = makePipe(input, true);
  const auto processOutput = makePipe(output, false);
  process = fork();
  if (process < 0) {
    throw std::system_error(errno, std::generic_category(), "fork");
  }
  if (process == 0) {
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    dup2(processInput.get(), STDIN_FILENO);
    dup2(processOutput.get(), STDOUT_FILENO);
    dup2(errors.get(), STDERR_FILENO);
    execv(arguments.front(), arguments.data());
    _exit(EXIT_FAILURE);
  }
  killer = {nullptr, [started = process](void*) {
              kill(started, SIGKILL);
              waitpid(started, nullptr, 0);
            }};
}

void TestProcess::write(const std::string& text) const {
  // This waits until the pipe has taken everything, or has nobody at its other end.
  [[maybe_unused]] const auto count = ::write(input.get(), text.data(), text.size());
}

std::string TestProcess::readUntil(const std::string& text) {
  while (unreadOutput.find(text) == std::string::npos) {
    if (!readSome(text)) {
      giveUp(text);
    }
  }
  auto taken = unreadOutput.substr(0, unreadOutput.find(text) + text.size());
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
  input = FileDescriptor();
  while (readSome("the end")) {
  }
  // It is reaped later, so that until then its number is no other process's.
  siginfo_t end{};
  waitid(P_PID, static_cast<id_t>(process), &end, WEXITED | WNOWAIT);
  constexpr int kSignalled = 128;
  return {end.si_code == CLD_EXITED ? end.si_status : kSignalled + end.si_status,
          std::exchange(unreadOutput, ""), writtenErrors()};
}

bool TestProcess::readSome(const std::string& awaited) {
  constexpr int kPatienceMilliseconds = 60'000;
  pollfd readable{output.get(), POLLIN, 0};
  if (poll(&readable, 1, kPatienceMilliseconds) == 0) {
    giveUp(awaited);
  }
  std::array<char, PIPE_BUF> buffer{};
  const auto count = read(output.get(), buffer.data(), buffer.size());
  const std::string_view written(buffer.data(),
                                 static_cast<std::size_t>(std::max<ssize_t>(count, 0)));
  eachLineAtOnce = eachLineAtOnce && written.find('\n') >= written.size() - 1;
  unreadOutput.append(written);
  return count > 0;
}

bool TestProcess::hasMore(std::chrono::milliseconds patience) const {
  pollfd readable{output.get(), POLLIN, 0};
  return !unreadOutput.empty() || poll(&readable, 1, static_cast<int>(patience.count())) > 0;
}

void TestProcess::giveUp(const std::string& awaited) const {
  throw std::runtime_error("no \"" + awaited + "\"; unread output \"" + unreadOutput +
                           "\", errors \"" + writtenErrors() + "\"");
}

std::string TestProcess::writtenErrors() const {
  return contentOf("/proc/self/fd/" + std::to_string(errors.get()));
}

std::string contentOf(const std::filesystem::path& path) {
  std::ostringstream text;
  text << std::ifstream(path, std::ios::binary).rdbuf();
  return text.str();
}
