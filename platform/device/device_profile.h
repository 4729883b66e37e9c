#pragma once

#include "platform/compression.h"
#include "platform/device/settings_file.h"

/// What the device is, as etc/vell/device.conf says. Each member has the default of its key.
struct DeviceProfile {
  int radioType = 0;
  int productCode = 0;
  int radioVendor = 0;
  bool radioDiagQdss = false;
  bool internalBuild = false;
  bool carrierBuild = false;
  CompressionMode defaultCompression = kCompressionNone;
  bool compressionSupported = true;

  /// Reads the known keys of `file`, and passes over the others. A value that cannot be read
  /// leaves the default, and a fault in `file`.
  static DeviceProfile from(SettingsFile& file);
};
