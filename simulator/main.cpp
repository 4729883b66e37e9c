// The simulated device's entry point: a whole device, or one of its services alone.

#include "platform/device/sysroot.h"
#include "platform/posix/file_descriptor.h"
#include "platform/program.h"
#include "simulator/complaint.h"
#include "simulator/device.h"
#include "simulator/device_root.h"
#include "simulator/journal.h"
#include "simulator/profile.h"
#include "simulator/service.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iostream>
#include <iterator>
#include <map>
#include <string>
#include <vector>

namespace simulator {

namespace {

using Words = std::vector<std::string>;

constexpr int kUsageError = 2;

int refuseWords(const std::string& what) {
  complain(what +
           "; usage: vell-simulator [PROFILE] [-- COMMAND...] | "
           "--serve bus|manager|helper|journal [LOGFILE]");
  return kUsageError;
}

/// Becomes the daemon, which prints its address on standard output once it can be reached.
int serveBus() {
  const auto configuration = "--config-file=" + (sysroot() / kBusConfiguration).string();
  // A socket that an earlier daemon left behind would be in the way.
  unlink((sysroot() / kBusSocket).c_str());
  execlp("dbus-daemon", "dbus-daemon", "--nofork", "--nopidfile", "--nosyslog", "--print-address",
         configuration.c_str(), nullptr);
  complain(std::string("dbus-daemon: ") + std::strerror(errno));
  return EXIT_FAILURE;
}

template <auto serveDevice>
int serveByProfile() {
  const auto profile = readProfile(sysroot() / kDeviceProfile);
  return profile ? serveDevice(*profile, sysroot()) : EXIT_FAILURE;
}

/// Has std::clog, which gets the requests, lead to the file at `path`, and what this process and
/// the programs that it starts say on standard error, too. Without a path requests go to standard
/// output. Complains and returns false when the file cannot be written.
bool openLog(const std::string& path) {
  if (path.empty()) {
    std::clog.rdbuf(std::cout.rdbuf());
    return true;
  }
  const FileDescriptor file(open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0644));
  if (!file || dup2(file.get(), STDERR_FILENO) < 0) {
    complain(path + ": " + std::strerror(errno));
    return false;
  }
  std::clog.rdbuf(std::cerr.rdbuf());
  return true;
}

/// Is one service of a device: `words` are its name and perhaps a file to log in.
int serve(const Words& words) {
  const std::map<std::string, int (*)()> services = {
      {"bus", serveBus},
      {"manager", serveByProfile<serveManager>},
      {"helper", serveByProfile<serveHelper>},
      {"journal", [] { return serveJournal(sysroot()); }},
  };
  if (words.empty() || words.size() > 2) {
    return refuseWords("--serve takes a service and perhaps a file");
  }
  const auto& name = words.front();
  const auto service = services.find(name);
  if (service == services.end()) {
    return refuseWords("no service is called \"" + name + "\"");
  }
  if (isLocalMachine()) {
    complain("--serve works inside a simulated device only");
    return EXIT_FAILURE;
  }
  std::ofstream(sysroot() / "run" / (name + ".pid")) << getpid() << "\n";
  return openLog(words.size() == 2 ? words.back() : "") ? service->second() : EXIT_FAILURE;
}

/// The user's shell.
Words defaultCommand() {
  const char* shell = std::getenv("SHELL");
  return {shell == nullptr || *shell == '\0' ? "/bin/sh" : shell};
}

int run(const Words& words) {
  if (!words.empty() && words.front() == "--serve") {
    return serve({words.begin() + 1, words.end()});
  }
  const auto separator = std::find(words.begin(), words.end(), "--");
  if (separator - words.begin() > 1) {
    return refuseWords("more than one profile");
  }
  const bool hasProfile = separator != words.begin();
  if (hasProfile && (words.front().empty() || words.front().front() == '-')) {
    return refuseWords("\"" + words.front() + "\" is no profile");
  }
  const bool hasCommand = separator != words.end();
  if (hasCommand && std::next(separator) == words.end()) {
    return refuseWords("no command after --");
  }
  const auto profile = readProfile(hasProfile ? words.front() : "");
  if (!profile) {
    return EXIT_FAILURE;
  }
  return runOnDevice(*profile,
                     hasCommand ? Words(std::next(separator), words.end()) : defaultCommand());
}

}  // namespace

}  // namespace simulator

int main(int count, char** words) {
  prepareStandardStreams();
  return simulator::run({words + (count > 0 ? 1 : 0), words + count});
}
