#include "platform/device/sysroot.h"
#include "platform/posix/read_file.h"
#include "platform/process_end.h"
#include "platform/telephony.h"

#include <algorithm>
#include <filesystem>
#include <functional>
#include <string>
#include <system_error>

namespace {

namespace fs = std::filesystem;

bool isProcessFolder(const fs::path& path) {
  const auto name = path.filename().string();
  return !name.empty() && name.find_first_not_of("0123456789") == std::string::npos;
}

struct Process {
  std::string command;     ///< Cut at 15 bytes, see proc(5).
  std::string executable;  ///< The last component of its path.
};

/// A process may end while it is looked at: what can no longer be read then is empty.
Process lookAt(const fs::path& folder) {
  constexpr std::size_t kLongestCommand = 16;  // With its line break.
  Process process;
  readRegularFile(folder / "comm", kLongestCommand, process.command);
  process.command.erase(std::min(process.command.find('\n'), process.command.size()));
  std::error_code error;
  process.executable = fs::read_symlink(folder / "exe", error).filename();
  endIfScarce(error.value());
  return process;
}

/// Whether `holds` for a process; it is not called again once it does.
bool anyProcess(const std::function<bool(const Process&)>& holds) {
  bool found = false;
  std::error_code error;
  for (fs::directory_iterator entry(sysroot() / "proc", error), end;
       !error && !found && entry != end; entry.increment(error)) {
    found = isProcessFolder(entry->path()) && holds(lookAt(entry->path()));
  }
  endIfScarce(error.value());
  return found;
}

}  // namespace

bool processRunning(const std::string& name) {
  return anyProcess([&](const Process& process) {
    return process.command == name || process.executable == name;
  });
}

std::set<std::string> processNames() {
  constexpr std::size_t kCutLength = 15;
  std::set<std::string> names;
  anyProcess([&](const Process& process) {
    names.insert(process.executable);
    if (process.command.size() < kCutLength) {
      names.insert(process.command);
    }
    return false;
  });
  names.erase("");
  return names;
}
