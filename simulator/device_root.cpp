#include "simulator/device_root.h"

#include "simulator/child_process.h"
#include "simulator/complaint.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cctype>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iomanip>
#include <sstream>
#include <system_error>
#include <vector>

namespace simulator {

namespace {

namespace fs = std::filesystem;

// Where collections are made, and where the live traces are.
constexpr const char* kSnapshotDirectory = "private/var/wireless/Library/Logs/Faultkeeper/Baseband";
constexpr const char* kDiagDirectory = "private/var/wireless/Library/Logs/VellManager/DIAG.scratch";
constexpr const char* kQdssDirectory = "private/var/wireless/Library/Logs/VellManager/QDSS.scratch";

/// Makes an empty directory and returns its path. Throws std::system_error.
fs::path makeDirectory() {
  auto pattern = (fs::temp_directory_path() / "vell-simulator-XXXXXX").string();
  if (mkdtemp(pattern.data()) == nullptr) {
    throw std::system_error(errno, std::generic_category(), pattern);
  }
  return fs::canonical(pattern);
}

/// Throws std::system_error.
void writeFile(const fs::path& path, const std::string& text) {
  fs::create_directories(path.parent_path());
  std::ofstream file(path, std::ios::binary);
  file << text << std::flush;
  if (!file) {
    throw std::system_error(errno, std::generic_category(), path);
  }
}

/// As a value of a bus address: what has a meaning there is written in hexadecimal. That leaves
/// nothing that has one in XML.
std::string escapeForAddress(const std::string& text) {
  std::ostringstream escaped;
  escaped << std::hex << std::setfill('0');
  for (const char character : text) {
    const auto byte = static_cast<unsigned char>(character);
    if (byte < 0x80 && (std::isalnum(byte) != 0 || std::strchr("-_/.*", byte) != nullptr)) {
      escaped << byte;
    } else {
      escaped << '%' << std::setw(2) << unsigned{byte};
    }
  }
  return escaped.str();
}

/// A bus on which everybody may do everything: it is the device's owner who runs it.
std::string busConfiguration(const std::string& address) {
  return R"(<!DOCTYPE busconfig PUBLIC "-//freedesktop//DTD D-Bus Bus Configuration 1.0//EN"
 "http://www.freedesktop.org/standards/dbus/1.0/busconfig.dtd">
<busconfig>
  <auth>EXTERNAL</auth>
  <policy context="default">
    <allow user="*"/>
    <allow own="*"/>
    <allow send_destination="*"/>
    <allow receive_sender="*"/>
  </policy>
  <listen>)" +
         address + "</listen>\n</busconfig>\n";
}

/// The trace properties that are texts, as a settings file.
std::string savedTraces(const Profile& profile) {
  std::ostringstream text;
  for (const auto& [name, payload] : profile.traces) {
    if (const auto* const value = textIn(payload)) {
      text << name << '=' << std::quoted(*value) << '\n';
    }
  }
  return text.str();
}

/// Writes the process table; see proc(5).
void writeProcesses(const fs::path& table, const std::vector<std::string>& names) {
  constexpr std::size_t kLongestCommandName = 15;
  fs::create_directories(table);
  for (int process = 100; const auto& name : names) {
    const auto entry = table / std::to_string(process++);
    writeFile(entry / "comm", name.substr(0, kLongestCommandName) + "\n");
    fs::create_symlink("/usr/libexec/" + name, entry / "exe");
  }
}

/// Packs the directories of a collection, which lie in `folder`, into `archive`. Removes `folder`.
bool pack(const fs::path& folder, const std::vector<std::string>& directories,
          const fs::path& archive) {
  std::vector<std::string> words = {"tar",
                                    "--create",
                                    "--force-local",
                                    "--auto-compress",
                                    "--file=" + archive.string(),
                                    "--directory=" + folder.string()};
  words.insert(words.end(), directories.begin(), directories.end());
  const pid_t tar = startChild(words, {}).process;
  const bool packed = tar > 0 && awaitChild(tar) == 0;
  fs::remove_all(folder);
  return packed;
}

}  // namespace

DeviceRoot::DeviceRoot(const Profile& profile) : DeviceRoot(makeDirectory()) {
  for (const auto* const directory :
       {kLogDirectory, kSnapshotDirectory, kDiagDirectory, kQdssDirectory}) {
    fs::create_directories(root / directory);
  }
  writeFile(root / kDeviceProfile, profile.text);
  writeFile(root / kBusConfiguration, busConfiguration(busAddress()));
  writeProcesses(root / "proc", profile.processes);
  if (profile.savedTraces) {
    writeFile(root / "var/lib/vell/traces.conf", savedTraces(profile));
  }
  const auto pipe = root / "run/manager.control";
  if (mkfifo(pipe.c_str(), S_IRUSR | S_IWUSR) == 0) {
    control = FileDescriptor(open(pipe.c_str(), O_RDWR | O_CLOEXEC));
  }
  if (!control) {
    throw std::system_error(errno, std::generic_category(), pipe);
  }
}

DeviceRoot::~DeviceRoot() {
  // What the device's processes have started ends a little after them, and may still make files.
  constexpr int kMostAttempts = 100;
  std::error_code error;
  for (int attempt = 0; attempt < kMostAttempts && fs::exists(root); ++attempt) {
    fs::remove_all(root, error);
  }
  if (fs::exists(root)) {
    complain("cannot remove " + root.string() + ": " + error.message());
  }
}

std::string DeviceRoot::busAddress() const {
  return "unix:path=" + escapeForAddress((root / kBusSocket).string());
}

bool writeCollection(const fs::path& root, const Collection& collection,
                     const std::string& contents) {
  const auto& [directories, archive] = collection;
  const auto snapshots = root / kSnapshotDirectory;
  const auto folder = archive.empty() ? snapshots : root / "var/tmp" / archive;
  try {
    for (const auto& directory : directories) {
      writeFile(folder / directory / "request.txt", contents + "\n");
    }
    return archive.empty() || pack(folder, directories, snapshots / archive);
  } catch (const std::system_error& error) {
    complain(std::string("cannot write a collection: ") + error.what());
    return false;
  }
}

}  // namespace simulator
