#pragma once

#include "platform/device/settings_file.h"
#include "platform/message_dict.h"

#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace simulator {

/// The type that a value has when it is sent, by the `..._TYPE` key beside its own.
enum class ValueType {
  String,
  Integer,
  Boolean,
  Other,         ///< A type that no dictionary of the interface holds.
  Missing,       ///< The key is left out.
  NoDictionary,  ///< What should carry the value is no dictionary.
};

/// A text of the profile together with the type that it is sent as.
struct TypedSetting {
  std::optional<std::string> text;  ///< Empty when the profile does not say.
  ValueType type = ValueType::String;

  /// Sets `key` of `dict`, to the text or else to `fallback`. Only a string keeps its content: the
  /// other types exist to be of another type.
  void putInto(MessageDict& dict, const std::string& key, const std::string& fallback) const;
};

/// The whole of `text` as an integer, in decimal or, after 0x, in hexadecimal, with or without a
/// minus. From any thread.
std::optional<std::int64_t> parseInteger(const std::string& text);

/// Reads the values of a profile and notes what cannot be read. Refers to both arguments.
class ProfileReader {
 public:
  ProfileReader(const SettingsFile& readProfile, std::vector<SettingsFile::Fault>& foundFaults)
      : profile(readProfile), faults(foundFaults) {}

  /// The text under `key`.
  [[nodiscard]] std::optional<std::string> text(const std::string& key) const;

  /// Which of two words stands under `key`: true for `yes`.
  bool either(const std::string& key, const std::string& yes, const std::string& no, bool fallback);

  /// The text under `key` with its type.
  TypedSetting typed(const std::string& key);

  /// Notes that the value of `key`, which the profile has, should have been `expected`.
  void reject(const std::string& key, const std::string& expected);

 private:
  const SettingsFile& profile;
  std::vector<SettingsFile::Fault>& faults;
};

}  // namespace simulator
