#include "platform/device/sysroot.h"
#include "platform/posix/read_file.h"
#include "platform/process_end.h"
#include "platform/telephony.h"

#include <filesystem>
#include <system_error>

namespace {

namespace fs = std::filesystem;

bool isProcessFolder(const fs::path& path) {
  const auto name = path.filename().string();
  return !name.empty() && name.find_first_not_of("0123456789") == std::string::npos;
}

/// A process may end while it is looked at: what can no longer be read then does not match.
bool isNamed(const fs::path& process, const std::string& name) {
  constexpr std::size_t kLongestCommand = 16;  // With its line break, see proc(5).
  std::string command;
  if (readRegularFile(process / "comm", kLongestCommand, command) == 0 &&
      command.substr(0, command.find('\n')) == name) {
    return true;
  }
  std::error_code error;
  const auto executable = fs::read_symlink(process / "exe", error);
  endIfScarce(error.value());
  return !error && executable.filename() == name;
}

}  // namespace

bool processRunning(const std::string& name) {
  std::error_code error;
  for (fs::directory_iterator entry(sysroot() / "proc", error), end; !error && entry != end;
       entry.increment(error)) {
    if (isProcessFolder(entry->path()) && isNamed(entry->path(), name)) {
      return true;
    }
  }
  endIfScarce(error.value());
  return false;
}
