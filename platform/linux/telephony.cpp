#include "platform/telephony.h"

#include "platform/compression.h"
#include "platform/linux/device_profile.h"

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
