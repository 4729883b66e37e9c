#include "platform/device/sysroot.h"
#include "platform/posix/read_file.h"
#include "platform/process_end.h"
#include "platform/telephony.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
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
    std::string executable(PATH_MAX, '\0');
    const auto length = readlink((entry->path() / "exe").c_str(), executable.data(), PATH_MAX);
    endIfScarce(length < 0 ? errno : 0);
    executable.resize(static_cast<std::size_t>(std::max<ssize_t>(length, 0)));
    executable.erase(0, executable.rfind('/') + 1);
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
