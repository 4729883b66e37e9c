#pragma once

#include "platform/posix/file_descriptor.h"

#include <sys/socket.h>

#include <filesystem>
#include <optional>
#include <string>

namespace simulator {

/// What one datagram of the journal's native protocol holds, and who sent it.
struct LogDatagram {
  std::string bytes;
  ucred sender{};
};

/// Makes the journal's socket at `path`, however deep that lies. None, after a complaint, when it
/// cannot be.
FileDescriptor listenForLog(const std::filesystem::path& path);

/// Takes a datagram off such a socket, with `flags` as of recvmsg(2). Reads the sealed file that
/// stands for a long one; empty when the file is not sealed. Nothing, and errno is set, when the
/// socket gives none.
std::optional<LogDatagram> receiveLog(int socket, int flags);

}  // namespace simulator
