#include "simulator/profile.h"

#include "simulator/complaint.h"
#include "simulator/default_profile.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <set>
#include <sstream>
#include <string_view>
#include <utility>

namespace simulator {

namespace {

std::optional<std::string> readText(const std::string& path) {
  // A folder opens like a file and fails only when it is read.
  std::ifstream stream(path, std::ios::binary);
  std::ostringstream text;
  errno = stream ? 0 : errno;
  if (stream) {
    text << stream.rdbuf();
  }
  if (errno != 0) {
    complain(path + ": " + std::strerror(errno));
    return std::nullopt;
  }
  return text.str();
}

void report(const std::string& path, const SettingsFile::Fault& fault) {
  complain(path + ":" + std::to_string(fault.line) + ": " + fault.what);
}

/// The keys that the default profile has or explains: all there are, but those of trace properties.
std::set<std::string> explainedKeys() {
  std::set<std::string> keys;
  std::istringstream lines(kDefaultProfile);
  for (std::string line; std::getline(lines, line);) {
    const auto start = line.starts_with('#') ? std::size_t{1} : std::size_t{0};
    keys.insert(line.substr(start, line.find('=') - start));
  }
  return keys;
}

/// Warns of keys that nobody reads, most likely because they are misspelt.
void warnOfUnknownKeys(const std::string& path, const SettingsFile& settings) {
  constexpr std::string_view kTypeEnding = "_TYPE";
  const auto known = explainedKeys();
  for (const auto& [key, setting] : settings.settings) {
    const auto base =
        key.ends_with(kTypeEnding) ? key.substr(0, key.size() - kTypeEnding.size()) : key;
    if (key.find('.') == std::string::npos && !known.contains(key) && !known.contains(base)) {
      report(path, {setting.line, key + ": not a key of the simulator's; it changes nothing"});
    }
  }
}

}  // namespace

std::optional<DeviceModel> describeDevice(const SettingsFile& settings, const std::string& path) {
  std::vector<SettingsFile::Fault> faults;
  auto model = DeviceModel::fromProfile(settings, faults);
  for (const auto& fault : faults) {
    report(path, fault);
  }
  return faults.empty() ? std::optional(std::move(model)) : std::nullopt;
}

std::optional<Profile> loadProfile(const std::string& path) {
  auto text = path.empty() ? std::optional<std::string>(kDefaultProfile) : readText(path);
  if (!text) {
    return std::nullopt;
  }
  const auto settings = SettingsFile::parse(*text);
  for (const auto& fault : settings.faults) {
    report(path, fault);
  }
  warnOfUnknownKeys(path, settings);
  auto model = describeDevice(settings, path);
  return model ? std::optional(Profile{*std::move(text), *std::move(model)}) : std::nullopt;
}

}  // namespace simulator
