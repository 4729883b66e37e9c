#include "platform/device/sysroot.h"
#include "platform/posix/read_file.h"
#include "platform/process_end.h"
#include "platform/telephony.h"

#include <algorithm>
#include <climits>
#include <filesystem>
#include <string>
#include <system_error>

namespace fs = std::filesystem;

std::set<std::string> processNames() {
  constexpr std::size_t kCutLength = 15;
  std::set<std::string> names;
  std::error_code error;
  for (fs::directory_iterator entry(sysroot() / "proc", error), end; !error && entry != end;
       entry.increment(error)) {
    if (entry->path().filename().string().find_first_not_of("0123456789") != std::string::npos) {
      continue;
    }
    // A process may end while it is looked at: what can no longer be read then is empty.
    std::string command;
    readRegularFile(entry->path() / "comm", kCutLength + 1, command);
    command.erase(std::min(command.find('\n'), command.size()));
    std::error_code unknown;
    const auto executable = fs::read_symlink(entry->path() / "exe", unknown).filename().string();
    endIfScarce(unknown.value());
    names.insert(command.size() < kCutLength ? command : "");
    names.insert(executable.size() <= NAME_MAX ? executable : "");
  }
  endIfScarce(error.value());
  names.erase("");
  return names;
}

bool processRunning(const std::string& name) {
  static const auto running = processNames();
  return running.contains(name);
}
