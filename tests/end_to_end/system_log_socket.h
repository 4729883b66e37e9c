#pragma once

#include "platform/posix/file_descriptor.h"
#include "simulator/journal_entry.h"

#include <sys/socket.h>
#include <sys/un.h>

#include <cerrno>
#include <filesystem>
#include <map>
#include <string>
#include <string_view>
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
    std::string datagram(262144, '\0');
    for (ssize_t size = 0; (size = recv(socket.get(), datagram.data(), datagram.size(), 0)) >= 0;) {
      const std::string_view entry(datagram.data(), static_cast<std::size_t>(size));
      const auto fields = simulator::fromNativeProtocol(entry).value().fields;
      std::map<std::string, std::string> values(fields.begin(), fields.end());
      if (values["PRIORITY"] == "3") {
        found.push_back(values["MESSAGE"]);
      }
    }
    return found;
  }

 private:
  FileDescriptor socket;
};
