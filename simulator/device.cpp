#include "simulator/device.h"

#include "simulator/child_process.h"
#include "simulator/complaint.h"
#include "simulator/device_root.h"
#include "simulator/service.h"

#include <poll.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <fstream>
#include <iostream>
#include <iterator>
#include <map>
#include <optional>
#include <system_error>

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

/// Waits until a service says something, which it does once it can be reached.
bool awaitFirstWord(int file) {
  char word = 0;
  pollfd readable = {file, POLLIN, 0};
  return poll(&readable, 1, kStartTimeLimitMilliseconds) > 0 && read(file, &word, 1) > 0;
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

/// The processes of one device. Everything still running is killed with the object. Throws
/// std::system_error where /proc does not tell what this program is.
class Device {
 public:
  /// Sets the environment for the device at `deviceRoot`, which must outlive this.
  explicit Device(const DeviceRoot& deviceRoot) : root(deviceRoot) {
    setenv("VELL_SYSROOT", root.path().c_str(), 1);
    setenv("DBUS_SYSTEM_BUS_ADDRESS", root.busAddress().c_str(), 1);
    // What the command has started becomes a child of this process when its own parent ends.
    prctl(PR_SET_CHILD_SUBREAPER, 1);
  }
  Device(const Device&) = delete;
  Device& operator=(const Device&) = delete;

  ~Device() {
    // What is killed leaves its own children to this process.
    for (auto children = childrenOf(getpid()); children.size() > services.size();
         children = childrenOf(getpid())) {
      for (const pid_t child : children) {
        if (!services.contains(child)) {
          end(child);
        }
      }
    }
    // The bus goes last, so that no service sees it go and ends in its own way meanwhile.
    for (const bool busItself : {false, true}) {
      for (const auto& [process, name] : services) {
        if ((name == "bus") == busItself) {
          end(process);
        }
      }
    }
  }

  /// Starts what runs on the device; false, after a complaint, when something cannot be started.
  bool start(const Profile& profile) {
    return (!profile.journal || startService("journal")) &&
           (!profile.bus || (startService("bus") && (!profile.manager || startService("manager")) &&
                             (!profile.helper || startService("helper"))));
  }

  /// Runs `command` and returns its exit status.
  int run(const std::vector<std::string>& command) {
    const pid_t process = startChild(command, {SIGHUP, false}).process;
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

 private:
  bool startService(const std::string& name) {
    const auto self = std::filesystem::read_symlink("/proc/self/exe").string();
    const auto log = root.path() / kLogDirectory / (name + ".log");
    const auto child = startChild(
        {self, "--serve", name, log.string()},
        {.input = name == "manager" ? root.managerControl() : -1, .piped = STDOUT_FILENO});
    if (child.process > 0) {
      services[child.process] = name;
    }
    const bool reachable = child.process > 0 && awaitFirstWord(child.pipe.get());
    if (!reachable) {
      complain("the device's " + name + " did not start");
      std::cerr << std::ifstream(log).rdbuf();
    }
    return reachable;
  }

  /// Collects the children that have ended; gives the exit status of `command` if it has.
  std::optional<int> reap(pid_t command) {
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

  static void end(pid_t child) {
    kill(child, SIGKILL);
    awaitChild(child);
  }

  const DeviceRoot& root;
  std::map<pid_t, std::string> services;
};

}  // namespace

int runOnDevice(const Profile& profile, const std::vector<std::string>& command) {
  // Blocked before anything is started or written, so that all of it is cleaned up.
  const auto signals = deviceSignals();
  sigprocmask(SIG_BLOCK, &signals, nullptr);
  try {
    const DeviceRoot root(profile);
    Device device(root);
    return device.start(profile) ? device.run(command) : EXIT_FAILURE;
  } catch (const std::system_error& error) {
    complain(std::string("cannot make a device: ") + error.what());
    return EXIT_FAILURE;
  }
}

}  // namespace simulator
