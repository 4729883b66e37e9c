#pragma once

#include "simulator/journal_entry.h"

#include <sys/socket.h>

#include <map>
#include <stdexcept>
#include <string>
#include <vector>

/// The journal's socket of a device, held by the test: the messages that the device's programs
/// write to the system log come here, and nobody takes them away.
class SystemLogSocket {
 public:
  /// Takes the place of the journal below `root`. Throws std::runtime_error when it cannot.
  explicit SystemLogSocket(const std::filesystem::path& root) {
    socket = simulator::listenForEntries(root / "run/systemd/journal/socket");
    if (!socket) {
      throw std::runtime_error("no socket below " + root.string());
    }
  }

  /// The MESSAGE of each entry at priority `err` that has come since the last call.
  std::vector<std::string> messages() {
    std::vector<std::string> found;
    while (const auto entry = simulator::receiveEntry(socket.get(), MSG_DONTWAIT)) {
      std::map<std::string, std::string> values(entry->fields.begin(), entry->fields.end());
      if (values["PRIORITY"] == "3") {
        found.push_back(values["MESSAGE"]);
      }
    }
    return found;
  }

 private:
  FileDescriptor socket;
};
