#pragma once

#include "platform/linux/file_descriptor.h"

#include <sys/socket.h>
#include <sys/un.h>

#include <array>
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
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.string().copy(address.sun_path, sizeof address.sun_path - 1);
    if (bind(socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
      throw std::system_error(errno, std::generic_category(), path.string());
    }
  }

  /// The MESSAGE of each entry at priority `err` that has come since the last call.
  std::vector<std::string> messages() {
    std::vector<std::string> found;
    std::array<char, 262144> datagram{};
    while (true) {
      const auto size = recv(socket.get(), datagram.data(), datagram.size(), 0);
      if (size < 0) {
        return found;
      }
      const std::string entry(datagram.data(), static_cast<std::size_t>(size));
      if (valueOf(entry, "PRIORITY") == "3") {
        found.push_back(valueOf(entry, "MESSAGE"));
      }
    }
  }

 private:
  /// A field of an entry in the journal's native protocol, in its form with a length.
  static std::string valueOf(const std::string& entry, const std::string& field) {
    const auto start = ("\n" + entry).find("\n" + field + "\n");
    if (start == std::string::npos) {
      return "";
    }
    std::uint64_t size = 0;
    std::memcpy(&size, entry.data() + start + field.size() + 1, sizeof size);
    return entry.substr(start + field.size() + 1 + sizeof size, size);
  }

  FileDescriptor socket;
};
