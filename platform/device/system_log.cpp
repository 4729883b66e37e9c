#include "platform/system_log.h"

#include "platform/device/sysroot.h"
#include "platform/posix/file_descriptor.h"
#include "platform/posix/whole_write.h"
#include "platform/process_end.h"

#include <endian.h>
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <syslog.h>

#include <array>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <string_view>

namespace {

/// Adds a field in the form that takes any bytes.
void appendField(std::string& entry, std::string_view name, std::string_view value) {
  const std::uint64_t size = htole64(value.size());
  entry.append(name).append("\n");
  entry.append(reinterpret_cast<const char*>(&size), sizeof size);
  entry.append(value).append("\n");
}

/// One entry in the journal's native protocol, see https://systemd.io/JOURNAL_NATIVE_PROTOCOL/.
std::string nativeEntry(const std::string& message) {
  std::string entry;
  appendField(entry, "PRIORITY", std::to_string(LOG_ERR));
  appendField(entry, "SYSLOG_IDENTIFIER", program_invocation_short_name);
  appendField(entry, "MESSAGE", message);
  return entry;
}

/// A file in memory that holds `bytes` and cannot be changed any more; none when there can be none.
FileDescriptor sealedFile(const std::string& bytes) {
  constexpr int kAllSeals = F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_WRITE | F_SEAL_SEAL;
  FileDescriptor file(memfd_create("journal-entry", MFD_CLOEXEC | MFD_ALLOW_SEALING));
  if (!file || writeWhole(file.get(), bytes) || fcntl(file.get(), F_ADD_SEALS, kAllSeals) != 0) {
    endIfScarce(errno);
    return FileDescriptor();
  }
  return file;
}

/// Sends one datagram and gives errno, 0 when it was sent. A listener that has stopped reading, or
/// reads too slowly, must not stop the tool: all calls together wait for a second.
int sendPatiently(int sender, const msghdr& datagram) {
  using std::chrono::microseconds;
  using Clock = std::chrono::steady_clock;
  static std::atomic<std::int64_t> patience = microseconds(std::chrono::seconds(1)).count();
  constexpr std::int64_t kSecond = 1'000'000;
  const auto left = patience.load();
  const timeval limit{left / kSecond, left % kSecond};
  // A limit of zero would be none.
  const int waiting = left > 0 ? 0 : MSG_DONTWAIT;
  setsockopt(sender, SOL_SOCKET, SO_SNDTIMEO, &limit, sizeof limit);
  const auto start = Clock::now();
  const int error = sendmsg(sender, &datagram, MSG_NOSIGNAL | waiting) < 0 ? errno : 0;
  patience -= std::chrono::ceil<microseconds>(Clock::now() - start).count();
  return error;
}

/// Sends `entry` to `address`: as a datagram or, where that would be too long, as an empty one with
/// a file.
void sendEntry(sockaddr_un& address, std::string& entry) {
  const FileDescriptor sender(socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  if (!sender) {
    endIfScarce(errno);
  }
  iovec bytes{entry.data(), entry.size()};
  msghdr datagram{};
  datagram.msg_name = &address;
  datagram.msg_namelen = sizeof address;
  datagram.msg_iov = &bytes;
  datagram.msg_iovlen = 1;
  const int error = sendPatiently(sender.get(), datagram);
  if (error != EMSGSIZE && error != ENOBUFS) {
    return;
  }
  const auto file = sealedFile(entry);
  const int descriptor = file.get();
  alignas(cmsghdr) std::array<char, CMSG_SPACE(sizeof descriptor)> control{};
  datagram.msg_iovlen = 0;
  datagram.msg_control = control.data();
  datagram.msg_controllen = control.size();
  auto* const header = CMSG_FIRSTHDR(&datagram);
  *header = {CMSG_LEN(sizeof descriptor), SOL_SOCKET, SCM_RIGHTS};
  std::memcpy(CMSG_DATA(header), &descriptor, sizeof descriptor);
  sendPatiently(sender.get(), datagram);
}

}  // namespace

void logSystemError(const std::string& message) {
  // The way through the open directory is short, which the address of a socket has to be (unix(7)),
  // however deep the sysroot lies.
  const auto directory = sysroot() / "run/systemd/journal";
  const FileDescriptor folder(open(directory.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
  if (!folder) {
    endIfScarce(errno);
    return;
  }
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  std::snprintf(address.sun_path, sizeof address.sun_path, "/proc/self/fd/%d/socket", folder.get());
  auto entry = nativeEntry(message);
  sendEntry(address, entry);
}
