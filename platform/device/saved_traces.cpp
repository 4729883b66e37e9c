#include "platform/device/saved_traces.h"

#include "platform/device/settings_file.h"
#include "platform/device/sysroot.h"

#include <mutex>

std::optional<std::string> savedTraceProperty(const std::string& trace,
                                              const std::string& property) {
  const auto path = sysroot() / "var/lib/vell/traces.conf";
  const auto file = SettingsFile::read(path);
  if (!file) {
    return std::nullopt;
  }
  static std::once_flag reported;
  if (!file->faults.empty()) {
    std::call_once(reported, [&] { reportFaults(path, file->faults); });
  }
  const auto found = file->settings.find(trace + "." + property);
  return found == file->settings.end() ? std::nullopt : std::optional(found->second.value);
}
