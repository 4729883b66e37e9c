#include "platform/telephony.h"

#include "platform/compression.h"
#include "platform/device/device_profile.h"
#include "platform/device/settings_file.h"
#include "platform/device/sysroot.h"

namespace {

DeviceProfile readProfile() {
  const auto path = sysroot() / "etc/vell/device.conf";
  auto file = SettingsFile::read(path);
  if (!file) {
    return {};
  }
  const auto profile = DeviceProfile::from(*file);
  reportFaults(path, file->faults);
  return profile;
}

const DeviceProfile& deviceProfile() {
  // Never destroyed: completions may still ask on another thread while the process exits.
  static const auto& profile = *new DeviceProfile(readProfile());
  return profile;
}

}  // namespace

int radioType() {
  return deviceProfile().radioType;
}

int productCode() {
  return deviceProfile().productCode;
}

int radioVendor() {
  return deviceProfile().radioVendor;
}

bool radioDiagSupportsQdss() {
  return deviceProfile().radioDiagQdss;
}

bool isInternalBuild() {
  return deviceProfile().internalBuild;
}

bool isCarrierBuild() {
  return deviceProfile().carrierBuild;
}

CompressionMode defaultCompressionMode() {
  return deviceProfile().defaultCompression;
}

bool compressionSupported() {
  return deviceProfile().compressionSupported;
}
