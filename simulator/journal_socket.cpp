#include "simulator/journal_socket.h"

#include "simulator/complaint.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>

namespace simulator {

namespace {

constexpr std::size_t kLargestDatagram = 1U << 18U;

/// The content of a file in memory that its sender cannot change any more.
std::string contentOfSealed(int file) {
  constexpr int kAllSeals = F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_WRITE | F_SEAL_SEAL;
  struct stat status {};
  if (fcntl(file, F_GET_SEALS) != kAllSeals || fstat(file, &status) != 0) {
    return "";
  }
  std::string content(static_cast<std::size_t>(status.st_size), '\0');
  const auto size = pread(file, content.data(), content.size(), 0);
  return size == status.st_size ? content : "";
}

/// Takes in what came beside a datagram.
void readControl(msghdr& message, LogDatagram& datagram) {
  for (auto* header = CMSG_FIRSTHDR(&message); header != nullptr;
       header = CMSG_NXTHDR(&message, header)) {
    if (header->cmsg_type == SCM_CREDENTIALS) {
      std::memcpy(&datagram.sender, CMSG_DATA(header), sizeof datagram.sender);
    } else if (header->cmsg_type == SCM_RIGHTS) {
      int descriptor = -1;
      std::memcpy(&descriptor, CMSG_DATA(header), sizeof descriptor);
      const FileDescriptor file(descriptor);
      datagram.bytes = contentOfSealed(file.get());
    }
  }
}

}  // namespace

FileDescriptor listenForLog(const std::filesystem::path& path) {
  // Reached through its folder, because the path of a socket must be short, see unix(7).
  const FileDescriptor folder(open(path.parent_path().c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
  FileDescriptor listening(socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  const auto reachable =
      "/proc/self/fd/" + std::to_string(folder.get()) + "/" + path.filename().string();
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  reachable.copy(address.sun_path, sizeof address.sun_path - 1);
  const int on = 1;
  if (!folder || !listening ||
      setsockopt(listening.get(), SOL_SOCKET, SO_PASSCRED, &on, sizeof on) != 0 ||
      bind(listening.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
    complain(path.string() + ": " + std::strerror(errno));
    return FileDescriptor();
  }
  return listening;
}

std::optional<LogDatagram> receiveLog(int socket, int flags) {
  LogDatagram datagram;
  datagram.bytes.resize(kLargestDatagram);
  iovec part{datagram.bytes.data(), datagram.bytes.size()};
  alignas(cmsghdr) std::array<char, CMSG_SPACE(sizeof(ucred)) + CMSG_SPACE(sizeof(int))> control{};
  msghdr message{};
  message.msg_iov = &part;
  message.msg_iovlen = 1;
  message.msg_control = control.data();
  message.msg_controllen = control.size();
  ssize_t size = 0;
  do {
    size = recvmsg(socket, &message, MSG_CMSG_CLOEXEC | flags);
  } while (size < 0 && errno == EINTR);
  if (size < 0) {
    return std::nullopt;
  }
  datagram.bytes.resize(static_cast<std::size_t>(size));
  readControl(message, datagram);
  return datagram;
}

}  // namespace simulator
