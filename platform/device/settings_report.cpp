// Apart from the reading itself: the simulator reads settings too, and reports in its own way.

#include "platform/device/settings_file.h"
#include "platform/system_log.h"

void reportFaults(const std::filesystem::path& path,
                  const std::vector<SettingsFile::Fault>& faults) {
  for (const auto& fault : faults) {
    const auto where =
        fault.line == 0 ? path.string() : path.string() + ":" + std::to_string(fault.line);
    logSystemError(where + ": " + fault.what);
  }
}
