#include "simulator/device.h"

#include "simulator/child_process.h"
#include "simulator/complaint.h"
#include "simulator/device_root.h"
#include "simulator/profile.h"
#include "simulator/service.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <fstream>
#include <iostream>
#include <iterator>

namespace simulator {

namespace {

constexpr int kStartTimeLimitMilliseconds = 20'000;
constexpr timespec kTimeToObey = {3, 0};

sigset_t deviceSignals() {
  sigset_t signals;
  sigemptyset(&signals);
  for (const int signalNumber : {SIGCHLD, SIGINT, SIGQUIT, SIGTERM, SIGHUP}) {
    sigaddset(&signals, signalNumber);
  }
  return signals;
}

/// Waits for a whole line, which tells that a service can be reached.
bool awaitLine(int file) {
  std::array<char, 512> buffer{};
  pollfd readable = {file, POLLIN, 0};
  while (poll(&readable, 1, kStartTimeLimitMilliseconds) > 0) {
    const auto count = read(file, buffer.data(), buffer.size());
    if (count <= 0) {
      return false;
    }
    if (std::memchr(buffer.data(), '\n', static_cast<std::size_t>(count)) != nullptr) {
      return true;
    }
  }
  return false;
}

/// The children of a process with one thread.
std::vector<pid_t> childrenOf(pid_t process) {
  const auto id = std::to_string(process);
  std::ifstream list("/proc/" + id + "/task/" + id + "/children");
  return {std::istream_iterator<pid_t>(list), {}};
}

/// Sends a signal to `process` and all that descend from it, as the terminal does for its keys. A
/// shell that waits for a program leaves SIGINT to that.
void signalFamily(pid_t process, int signalNumber) {
  // Found first: a child whose parent ends is no descendant any more.
  const auto children = childrenOf(process);
  kill(process, signalNumber);
  for (const pid_t child : children) {
    signalFamily(child, signalNumber);
  }
}

}  // namespace

void blockDeviceSignals() {
  const auto signals = deviceSignals();
  sigprocmask(SIG_BLOCK, &signals, nullptr);
}

Device::Device(const DeviceRoot& deviceRoot)
    : root(deviceRoot),
      managerControl(open((deviceRoot.path() / kManagerControl).c_str(), O_RDWR | O_CLOEXEC)) {
  setenv("VELL_SYSROOT", root.path().c_str(), 1);
  setenv("DBUS_SYSTEM_BUS_ADDRESS", root.busAddress().c_str(), 1);
  // What the command has started becomes a child of this process when its own parent ends.
  prctl(PR_SET_CHILD_SUBREAPER, 1);
}

Device::~Device() {
  while (endOneOther()) {
  }
  // The bus goes last, so that no service sees it go and ends in its own way meanwhile.
  for (const bool busItself : {false, true}) {
    for (const auto& [process, name] : services) {
      if ((name == "bus") == busItself) {
        kill(process, SIGKILL);
        awaitChild(process);
      }
    }
  }
}

bool Device::start(const Profile& profile) {
  if (!managerControl) {
    complain("cannot open the manager's control pipe");
    return false;
  }
  if (profile.journal && !startService("journal")) {
    return false;
  }
  if (!profile.bus) {
    return true;
  }
  return startService("bus") && (!profile.manager || startService("manager")) &&
         (!profile.helper || startService("helper"));
}

bool Device::startService(const std::string& name) {
  int ends[2] = {-1, -1};
  if (pipe2(ends, O_CLOEXEC) != 0) {
    complain("cannot start " + name + ": " + std::strerror(errno));
    return false;
  }
  const FileDescriptor readable(ends[0]);
  FileDescriptor writable(ends[1]);
  const auto self = std::filesystem::read_symlink("/proc/self/exe").string();
  const auto log = root.path() / kRequestLogDirectory / (name + ".log");
  const pid_t process = startChild({self, "--serve", name, log.string()}, {},
                                   name == "manager" ? managerControl.get() : -1, writable.get());
  writable = FileDescriptor();
  if (process > 0) {
    services[process] = name;
  }
  const bool reachable = process > 0 && awaitLine(readable.get());
  if (!reachable) {
    complain("the device's " + name + " did not start");
    std::cerr << std::ifstream(log).rdbuf();
  }
  return reachable;
}

int Device::run(const std::vector<std::string>& command) {
  const pid_t process = startChild(command, {SIGHUP, false}, -1, -1);
  if (process < 0) {
    return EXIT_FAILURE;
  }
  const auto signals = deviceSignals();
  bool ending = false;
  auto status = reap(process);
  for (; !status; status = reap(process)) {
    siginfo_t info{};
    const int received =
        ending ? sigtimedwait(&signals, &info, &kTimeToObey) : sigwaitinfo(&signals, &info);
    if (received < 0 && errno == EAGAIN) {
      kill(process, SIGKILL);
    }
    // What the terminal sends for its keys has reached the command already.
    const bool fromTerminal =
        (received == SIGINT || received == SIGQUIT) && info.si_code == SI_KERNEL;
    if (received > 0 && received != SIGCHLD && !fromTerminal) {
      signalFamily(process, received);
      ending = true;
    }
  }
  return *status;
}

bool Device::endOneOther() {
  for (const pid_t child : childrenOf(getpid())) {
    if (!services.contains(child)) {
      kill(child, SIGKILL);
      awaitChild(child);
      return true;
    }
  }
  return false;
}

std::optional<int> Device::reap(pid_t command) {
  std::optional<int> commandStatus;
  int status = 0;
  for (pid_t ended = waitpid(-1, &status, WNOHANG); ended > 0;
       ended = waitpid(-1, &status, WNOHANG)) {
    if (ended == command) {
      commandStatus = exitStatusOf(status);
      continue;
    }
    const auto service = services.extract(ended);
    if (service && exitStatusOf(status) == kStatusRestart) {
      startService(service.mapped());
    }
  }
  return commandStatus;
}

}  // namespace simulator
