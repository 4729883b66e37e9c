// The simulated device's entry point: a whole device, or one of its services alone.

#include "platform/device/sysroot.h"
#include "platform/program.h"
#include "simulator/complaint.h"
#include "simulator/device.h"
#include "simulator/device_root.h"
#include "simulator/helper_service.h"
#include "simulator/journal.h"
#include "simulator/manager_service.h"
#include "simulator/options.h"
#include "simulator/profile.h"

#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iostream>

namespace {

using simulator::complain;

constexpr int kUsageError = 2;

/// Has what a service and the programs it starts say on standard error go to `log`, if there is
/// one.
void redirectErrors(const std::string& log) {
  if (!log.empty() && std::freopen(log.c_str(), "a", stderr) == nullptr) {
    complain(log + ": " + std::strerror(errno));
  }
}

/// Becomes the daemon, which prints its address on standard output once it can be reached.
int serveBus() {
  const auto configuration = "--config-file=" + (sysroot() / simulator::kBusConfiguration).string();
  // A socket that an earlier daemon left behind would be in the way.
  unlink((sysroot() / simulator::kBusSocket).c_str());
  execlp("dbus-daemon", "dbus-daemon", "--nofork", "--nopidfile", "--nosyslog", "--print-address",
         configuration.c_str(), nullptr);
  complain(std::string("dbus-daemon: ") + std::strerror(errno));
  return EXIT_FAILURE;
}

int serveJournal() {
  const auto now = std::chrono::floor<std::chrono::microseconds>(std::chrono::system_clock::now());
  const auto journal = simulator::Journal::create(sysroot(), simulator::lastHourOfDevice(now));
  if (!journal) {
    return EXIT_FAILURE;
  }
  std::cout << "ready" << std::endl;
  return journal->run();
}

template <typename NamedService>
int serveNamed(const simulator::Profile& profile, const std::string& requestLog) {
  const simulator::RequestLog log(requestLog);
  NamedService service(profile, sysroot(), log);
  if (!service.connect()) {
    return EXIT_FAILURE;
  }
  std::cout << "ready" << std::endl;
  return service.run();
}

int serve(const simulator::Options& options) {
  if (isLocalMachine()) {
    complain("--serve works inside a simulated device only");
    return EXIT_FAILURE;
  }
  redirectErrors(options.requestLog);
  std::ofstream(sysroot() / "run" / (options.service + ".pid")) << getpid() << "\n";
  if (options.service == "bus") {
    return serveBus();
  }
  if (options.service == "journal") {
    return serveJournal();
  }
  const auto profile = simulator::readProfile(sysroot() / simulator::kDeviceProfile);
  if (!profile) {
    return EXIT_FAILURE;
  }
  return options.service == "manager"
             ? serveNamed<simulator::ManagerService>(*profile, options.requestLog)
             : serveNamed<simulator::HelperService>(*profile, options.requestLog);
}

std::vector<std::string> usersShell() {
  const char* shell = std::getenv("SHELL");
  return {shell == nullptr || *shell == '\0' ? "/bin/sh" : shell};
}

int runDevice(const simulator::Options& options) {
  simulator::blockDeviceSignals();
  const auto profile = simulator::readProfile(options.profile);
  if (!profile) {
    return EXIT_FAILURE;
  }
  const auto root = simulator::DeviceRoot::create(*profile);
  if (!root) {
    return EXIT_FAILURE;
  }
  simulator::Device device(*root);
  if (!device.start(*profile)) {
    return EXIT_FAILURE;
  }
  return device.run(options.command.empty() ? usersShell() : options.command);
}

}  // namespace

int main(int count, char** words) {
  prepareStandardStreams();
  const auto options = simulator::parseOptions({words + (count > 0 ? 1 : 0), words + count});
  if (!options) {
    return kUsageError;
  }
  return options->service.empty() ? runDevice(*options) : serve(*options);
}
