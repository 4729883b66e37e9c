// What the library would add, the place in the source, is of no use to the readers of these logs.
#define SD_JOURNAL_SUPPRESS_LOCATION

#include "platform/system_log.h"

#include "platform/device/sysroot.h"
#include "platform/posix/file_descriptor.h"

#include <endian.h>
#include <fcntl.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <sys/un.h>
#include <syslog.h>
#include <systemd/sd-journal.h>

#include <atomic>
#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <string_view>
#include <vector>

namespace {

struct Field {
  std::string_view name;
  std::string value;
};

std::vector<Field> errorFields(const std::string& message) {
  return {{"PRIORITY", std::to_string(LOG_ERR)},
          {"SYSLOG_IDENTIFIER", program_invocation_short_name},
          {"MESSAGE", message}};
}

void sendToLocalMachine(const std::vector<Field>& fields) {
  std::vector<std::string> assignments;
  assignments.reserve(fields.size());
  for (const auto& field : fields) {
    assignments.push_back(std::string(field.name) + '=' + field.value);
  }
  std::vector<iovec> parts;
  parts.reserve(fields.size());
  for (auto& assignment : assignments) {
    parts.push_back({assignment.data(), assignment.size()});
  }
  sd_journal_sendv(parts.data(), static_cast<int>(parts.size()));
}

/// One entry in the journal's native protocol, every field in the form that takes any bytes.
std::string nativeEntry(const std::vector<Field>& fields) {
  std::string entry;
  for (const auto& field : fields) {
    const std::uint64_t size = htole64(field.value.size());
    entry.append(field.name).append("\n");
    entry.append(reinterpret_cast<const char*>(&size), sizeof size);
    entry.append(field.value).append("\n");
  }
  return entry;
}

/// Sends to the journal's socket in `directory`. The way through the open directory is short, which
/// the address of a socket has to be (unix(7)), however deep the sysroot lies.
void sendToSocketIn(const std::filesystem::path& directory, const std::string& datagram) {
  const FileDescriptor folder(open(directory.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
  const FileDescriptor sender(socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  if (!folder || !sender) {
    return;
  }
  // A listener that has stopped reading must not stop the tool, and is waited for only once.
  static std::atomic<bool> stuck = false;
  const timeval patience{1, 0};
  setsockopt(sender.get(), SOL_SOCKET, SO_SNDTIMEO, &patience, sizeof patience);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  std::snprintf(address.sun_path, sizeof address.sun_path, "/proc/self/fd/%d/socket", folder.get());
  const int waiting = stuck ? MSG_DONTWAIT : 0;
  if (sendto(sender.get(), datagram.data(), datagram.size(), MSG_NOSIGNAL | waiting,
             reinterpret_cast<const sockaddr*>(&address), sizeof address) < 0) {
    stuck = errno == EAGAIN;
  }
}

}  // namespace

void logSystemError(const std::string& message) {
  const auto fields = errorFields(message);
  if (isLocalMachine()) {
    sendToLocalMachine(fields);
  } else {
    sendToSocketIn(sysroot() / "run/systemd/journal", nativeEntry(fields));
  }
}
