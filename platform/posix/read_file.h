#pragma once

#include <cstddef>
#include <filesystem>
#include <string>

/// Reads at most `most` bytes of the regular file at `path` into `text`, without waiting for
/// anybody. Returns 0, or errno; EINVAL when there is something else than a regular file. Ends the
/// process when memory or file descriptors run out.
int readRegularFile(const std::filesystem::path& path, std::size_t most, std::string& text);
