#pragma once

#include "simulator/device_model.h"

#include <optional>
#include <string>

namespace simulator {

/// A profile as it was written, and the device that it describes.
struct Profile {
  std::string text;
  DeviceModel model;
};

/// The device that `settings` describes. Complains, of the file at `path`, of each value that
/// cannot be read, and is empty when there is one.
std::optional<DeviceModel> describeDevice(const SettingsFile& settings, const std::string& path);

/// Reads the profile in the file at `path`, the default device's when `path` is empty. Complains of
/// each thing that cannot be read; empty when that is the file or a value that the simulator goes
/// by. A line that is no setting at all does not stop it: the tool has to live with such lines too.
std::optional<Profile> loadProfile(const std::string& path);

}  // namespace simulator
