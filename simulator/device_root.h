#pragma once

#include "platform/posix/file_descriptor.h"
#include "simulator/answer.h"
#include "simulator/profile.h"

#include <filesystem>
#include <string>
#include <utility>

namespace simulator {

/// Places below the device's root that the simulator and its services share.
inline constexpr const char* kDeviceProfile = "etc/vell/device.conf";
inline constexpr const char* kLogDirectory = "var/log/vell-simulator";
inline constexpr const char* kBusConfiguration = "run/bus.conf";
inline constexpr const char* kBusSocket = "run/bus";

/// The file system of one simulated device, in a directory of its own; gone with this object.
class DeviceRoot {
 public:
  /// Makes the file system of the device that `profile` describes. Throws std::system_error, and
  /// leaves nothing behind, when that is not possible.
  explicit DeviceRoot(const Profile& profile);
  DeviceRoot(const DeviceRoot&) = delete;
  DeviceRoot& operator=(const DeviceRoot&) = delete;
  ~DeviceRoot();

  /// The directory, as an absolute path.
  [[nodiscard]] const std::filesystem::path& path() const { return root; }

  /// The address of the device's bus, as DBUS_SYSTEM_BUS_ADDRESS takes it.
  [[nodiscard]] std::string busAddress() const;

  /// The pipe to its manager, for that to read.
  [[nodiscard]] int managerControl() const { return control.get(); }

 private:
  explicit DeviceRoot(std::filesystem::path directory) : root(std::move(directory)) {}

  std::filesystem::path root;
  FileDescriptor control;  ///< Open at both ends, so that the manager never sees the end of it.
};

/// Makes the collection on the device at `root`: its directories with one file in each that holds
/// `contents`, packed with tar(1) when the collection says so. False, after a complaint, when that
/// was not possible. Blocks until all is on disk; for processes with one thread only.
bool writeCollection(const std::filesystem::path& root, const Collection& collection,
                     const std::string& contents);

}  // namespace simulator
