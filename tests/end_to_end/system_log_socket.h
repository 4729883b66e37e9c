#pragma once

#include "platform/linux/file_descriptor.h"

#include <sys/socket.h>
#include <sys/un.h>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <filesystem>
#include <string>
#include <system_error>
#include <vector>

/// The journal's socket of a device, held by the test: the messages that the device's programs
/// write to the system log come here, and nobody takes them away.
class SystemLogSocket {
 public:
  /// Takes the place of the journal below `root`. Throws std::system_error when it cannot.
  explicit SystemLogSocket(const std::filesystem::path& root)
      : socket(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0)) {
    const auto path = root / "run/systemd/journal/socket";
    std::filesystem::create_directories(path.parent_path());
    sockaddr_un address{AF_UNIX, ""};
    path.string().copy(address.sun_path, sizeof address.sun_path - 1);
    if (bind(socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
      throw std::system_error(errno, std::generic_category(), path.string());
    }
  }

  /// The MESSAGE of each entry at priority `err` that has come since the last call.
  std::vector<std::string> messages() {
    std::vector<std::string> found;
    std::string entry(262144, '\0');
    for (ssize_t size = 0; (size = recv(socket.get(), entry.data(), entry.size(), 0)) >= 0;) {
      const auto whole = "\n" + entry.substr(0, static_cast<std::size_t>(size));
      if (valueOf(whole, "\nPRIORITY\n") == "3") {
        found.push_back(valueOf(whole, "\nMESSAGE\n"));
      }
    }
    return found;
  }

 private:
  /// A field of an entry in the journal's native protocol, in its form with a length.
  static std::string valueOf(const std::string& entry, const std::string& field) {
    const auto start = entry.find(field) + field.size();
    std::uint64_t size = 0;
    std::memcpy(&size, entry.data() + start, sizeof size);
    return entry.substr(start + sizeof size, size);
  }

  FileDescriptor socket;
};
