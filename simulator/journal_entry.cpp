#include "simulator/journal_entry.h"

#include "simulator/complaint.h"

#include <endian.h>
#include <fcntl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <fstream>
#include <string_view>
#include <system_error>

namespace simulator {

namespace {

using Fields = std::vector<std::pair<std::string, std::string>>;

constexpr std::size_t kLargestDatagram = 1U << 18U;

/// Entries of one boot; the files of a journal tell boots apart.
constexpr const char* kBoot = "5b2e8c1d4f6a47909c3d1e0f2a4b6c8d";

void appendField(std::string& text, const std::string& name, const std::string& value) {
  const bool isPlain = std::all_of(value.begin(), value.end(), [](char character) {
    return static_cast<unsigned char>(character) >= ' ';
  });
  if (isPlain) {
    text.append(name).append("=").append(value).append("\n");
    return;
  }
  const std::uint64_t size = htole64(value.size());
  text.append(name).append("\n").append(reinterpret_cast<const char*>(&size), sizeof size);
  text.append(value).append("\n");
}

/// Takes a value with its length in front, and the line break behind it, off the start of `rest`.
std::optional<std::string_view> takeSizedValue(std::string_view& rest) {
  std::uint64_t size = 0;
  if (rest.size() <= sizeof size) {
    return std::nullopt;
  }
  std::memcpy(&size, rest.data(), sizeof size);
  size = le64toh(size);
  rest.remove_prefix(sizeof size);
  if (size >= rest.size() || rest[size] != '\n') {
    return std::nullopt;
  }
  const auto value = rest.substr(0, size);
  rest.remove_prefix(size + 1);
  return value;
}

bool isFieldName(std::string_view name) {
  return !name.empty() &&
         name.find_first_not_of("ABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789_") == std::string_view::npos;
}

/// The fields of a datagram that a program can set itself; none when it is malformed.
Fields parseFields(std::string_view datagram) {
  Fields fields;
  while (!datagram.empty()) {
    const auto line = datagram.substr(0, datagram.find('\n'));
    if (line.size() == datagram.size()) {
      return {};
    }
    datagram.remove_prefix(line.size() + 1);
    const auto name = line.substr(0, line.find('='));
    const auto value = name.size() < line.size() ? std::optional(line.substr(name.size() + 1))
                                                 : takeSizedValue(datagram);
    if (!value || !isFieldName(name)) {
      return {};
    }
    if (name.front() != '_') {
      fields.emplace_back(name, *value);
    }
  }
  return fields;
}

/// The content of a file in memory that its sender cannot change any more.
std::string contentOfSealed(const FileDescriptor& file) {
  constexpr int kAllSeals = F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_WRITE | F_SEAL_SEAL;
  struct stat status {};
  if (fcntl(file.get(), F_GET_SEALS) != kAllSeals || fstat(file.get(), &status) != 0) {
    return "";
  }
  std::string content(static_cast<std::size_t>(status.st_size), '\0');
  const auto size = pread(file.get(), content.data(), content.size(), 0);
  return size == status.st_size ? content : "";
}

/// Adds what the journal itself knows of a process, as far as that still can be learned.
void addSender(Fields& fields, const ucred& sender) {
  const auto process = std::filesystem::path("/proc") / std::to_string(sender.pid);
  std::string name;
  std::error_code error;
  const auto executable = std::filesystem::read_symlink(process / "exe", error);
  fields.emplace_back("_TRANSPORT", "journal");
  fields.emplace_back("_PID", std::to_string(sender.pid));
  fields.emplace_back("_UID", std::to_string(sender.uid));
  fields.emplace_back("_GID", std::to_string(sender.gid));
  if (std::getline(std::ifstream(process / "comm"), name)) {
    fields.emplace_back("_COMM", name);
  }
  if (!error) {
    fields.emplace_back("_EXE", executable.string());
  }
}

}  // namespace

JournalTime presentTime() {
  return std::chrono::floor<std::chrono::microseconds>(std::chrono::system_clock::now());
}

std::string toExportFormat(const JournalEntry& entry) {
  const auto time = std::to_string(entry.time.time_since_epoch().count());
  std::string text;
  appendField(text, "__REALTIME_TIMESTAMP", time);
  appendField(text, "__MONOTONIC_TIMESTAMP", time);
  appendField(text, "_BOOT_ID", kBoot);
  for (const auto& [name, value] : entry.fields) {
    appendField(text, name, value);
  }
  return text + "\n";
}

FileDescriptor listenForEntries(const std::filesystem::path& path) {
  std::error_code ignored;
  std::filesystem::create_directories(path.parent_path(), ignored);
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

std::optional<JournalEntry> receiveEntry(int socket, int flags) {
  std::string bytes(kLargestDatagram, '\0');
  iovec part{bytes.data(), bytes.size()};
  alignas(cmsghdr) std::array<char, CMSG_SPACE(sizeof(ucred)) + CMSG_SPACE(sizeof(int))> control{};
  msghdr message{};
  message.msg_iov = &part;
  message.msg_iovlen = 1;
  message.msg_control = control.data();
  message.msg_controllen = control.size();
  const auto size = recvmsg(socket, &message, MSG_CMSG_CLOEXEC | flags);
  if (size < 0) {
    return std::nullopt;
  }
  bytes.resize(static_cast<std::size_t>(size));
  ucred sender{};
  for (auto* header = CMSG_FIRSTHDR(&message); header != nullptr;
       header = CMSG_NXTHDR(&message, header)) {
    if (header->cmsg_type == SCM_CREDENTIALS) {
      std::memcpy(&sender, CMSG_DATA(header), sizeof sender);
    } else if (header->cmsg_type == SCM_RIGHTS) {
      int descriptor = -1;
      std::memcpy(&descriptor, CMSG_DATA(header), sizeof descriptor);
      bytes = contentOfSealed(FileDescriptor(descriptor));
    }
  }
  JournalEntry entry = {presentTime(), parseFields(bytes)};
  if (!entry.fields.empty()) {
    addSender(entry.fields, sender);
  }
  return entry;
}

}  // namespace simulator
