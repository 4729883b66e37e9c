#include "platform/device/device_profile.h"

#include <charconv>
#include <optional>

namespace {

bool readInto(const std::string& text, std::int64_t& number) {
  const auto* const end = text.data() + text.size();
  const auto [stopped, error] = std::from_chars(text.data(), end, number);
  return error == std::errc() && stopped == end;
}

bool readInto(const std::string& text, int& number) {
  const auto* const end = text.data() + text.size();
  const auto [stopped, error] = std::from_chars(text.data(), end, number);
  return error == std::errc() && stopped == end;
}

bool readInto(const std::string& text, bool& flag) {
  flag = text == "yes";
  return flag || text == "no";
}

bool readCompression(const std::string& text, CompressionMode& mode) {
  if (text == "nocompress") {
    mode = kCompressionNone;
  } else if (text == "tar.gz") {
    mode = kCompressionTarGz;
  } else if (text == "tar") {
    mode = kCompressionTar;
  } else {
    return readInto(text, mode);
  }
  return true;
}

/// Sets `member` to the value under `key`, if there is one that `read` understands.
template <typename Value, typename Reader>
void take(SettingsFile& file, const char* key, const char* expected, Value& member, Reader read) {
  const auto found = file.settings.find(key);
  if (found == file.settings.end()) {
    return;
  }
  Value value = member;
  if (read(found->second.value, value)) {
    member = value;
  } else {
    file.addFault(found->second.line,
                  std::string(key) + ": '" + found->second.value + "' is not " + expected);
  }
}

void takeInteger(SettingsFile& file, const char* key, int& member) {
  take(file, key, "an integer", member,
       [](const std::string& text, int& value) { return readInto(text, value); });
}

void takeFlag(SettingsFile& file, const char* key, bool& member) {
  take(file, key, "yes or no", member,
       [](const std::string& text, bool& value) { return readInto(text, value); });
}

}  // namespace

DeviceProfile DeviceProfile::from(SettingsFile& file) {
  DeviceProfile profile;
  takeInteger(file, "RADIO_TYPE", profile.radioType);
  takeInteger(file, "PRODUCT_CODE", profile.productCode);
  takeInteger(file, "RADIO_VENDOR", profile.radioVendor);
  takeFlag(file, "RADIO_DIAG_QDSS", profile.radioDiagQdss);
  takeFlag(file, "INTERNAL_BUILD", profile.internalBuild);
  takeFlag(file, "CARRIER_BUILD", profile.carrierBuild);
  take(file, "DEFAULT_COMPRESSION", "nocompress, tar.gz, tar or an integer",
       profile.defaultCompression, readCompression);
  takeFlag(file, "COMPRESSION_SUPPORTED", profile.compressionSupported);
  return profile;
}
