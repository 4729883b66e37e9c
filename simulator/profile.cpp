#include "simulator/profile.h"

#include "simulator/complaint.h"
#include "simulator/default_profile.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <sstream>
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
  auto text = path.empty() ? kDefaultProfile : readText(path);
  if (!text) {
    return std::nullopt;
  }
  const auto settings = SettingsFile::parse(*text);
  for (const auto& fault : settings.faults) {
    report(path, fault);
  }
  auto model = describeDevice(settings, path);
  return model ? std::optional(Profile{*std::move(text), *std::move(model)}) : std::nullopt;
}

}  // namespace simulator
