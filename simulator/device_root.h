#pragma once

#include "simulator/profile.h"

#include <filesystem>
#include <memory>
#include <string>

namespace simulator {

/// Places below the device's root that the simulator and its services share.
inline constexpr const char* kDeviceProfile = "etc/vell/device.conf";
inline constexpr const char* kSavedTraces = "var/lib/vell/traces.conf";
inline constexpr const char* kRequestLogDirectory = "var/log/vell-simulator";
inline constexpr const char* kSnapshotDirectory =
    "private/var/wireless/Library/Logs/Faultkeeper/Baseband";
inline constexpr const char* kBusConfiguration = "run/bus.conf";
inline constexpr const char* kBusSocket = "run/bus";
inline constexpr const char* kManagerControl = "run/manager.control";

/// The file system of one simulated device, in a directory of its own; gone with this object.
class DeviceRoot {
 public:
  /// Makes the file system of the device that `profile` describes. Complains and gives nothing when
  /// that is not possible.
  static std::unique_ptr<DeviceRoot> create(const Profile& profile);

  DeviceRoot(const DeviceRoot&) = delete;
  DeviceRoot& operator=(const DeviceRoot&) = delete;
  ~DeviceRoot();

  /// The directory, as an absolute path.
  [[nodiscard]] const std::filesystem::path& path() const { return root; }

  /// The address of the device's bus, as DBUS_SYSTEM_BUS_ADDRESS takes it.
  [[nodiscard]] std::string busAddress() const;

 private:
  explicit DeviceRoot(std::filesystem::path directory) : root(std::move(directory)) {}

  void fill(const Profile& profile) const;

  std::filesystem::path root;
};

}  // namespace simulator
