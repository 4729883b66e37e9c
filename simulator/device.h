#pragma once

#include "platform/posix/file_descriptor.h"

#include <sys/types.h>

#include <map>
#include <optional>
#include <string>
#include <vector>

namespace simulator {

class DeviceRoot;
struct Profile;

/// The processes of one simulated device: its bus and its services, as children of this process,
/// and the command that runs in it, with whatever that starts. Uses waitpid(2) for any child, and
/// the environment: one object in a process, with one thread. Everything still running is killed
/// with the object.
class Device {
 public:
  /// Sets the environment for the device at `deviceRoot`, which must outlive this.
  explicit Device(const DeviceRoot& deviceRoot);
  Device(const Device&) = delete;
  Device& operator=(const Device&) = delete;
  ~Device();

  /// Starts what runs on the device that `profile` describes and waits until it can be reached.
  /// Complains and returns false when something cannot be started.
  bool start(const Profile& profile);

  /// Runs `command` in the device and returns its exit status, 128 and the signal when one ended
  /// it. A signal to end that this process gets meanwhile goes to the command and all that descends
  /// from it; a command that does not obey soon is killed. Services that ask for it are started
  /// again meanwhile.
  int run(const std::vector<std::string>& command);

 private:
  bool startService(const std::string& name);

  /// Collects the children that have ended; gives the exit status of `command` if it has.
  std::optional<int> reap(pid_t command);

  const DeviceRoot& root;
  FileDescriptor managerControl;
  std::map<pid_t, std::string> services;
};

/// Blocks the signals that `Device::run` waits for, which must be so before anything is started.
void blockDeviceSignals();

}  // namespace simulator
