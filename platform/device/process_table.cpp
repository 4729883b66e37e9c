#include "platform/device/sysroot.h"
#include "platform/telephony.h"

#include <filesystem>
#include <fstream>
#include <system_error>

namespace {

namespace fs = std::filesystem;

bool isProcessFolder(const fs::path& path) {
  const auto name = path.filename().string();
  return !name.empty() && name.find_first_not_of("0123456789") == std::string::npos;
}

/// A process may end while it is looked at: what can no longer be read then does not match.
bool isNamed(const fs::path& process, const std::string& name) {
  std::ifstream comm(process / "comm");
  std::string command;
  if (std::getline(comm, command) && command == name) {
    return true;
  }
  std::error_code error;
  const auto executable = fs::read_symlink(process / "exe", error);
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
  return false;
}
