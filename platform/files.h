#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <system_error>

/// Leaves an empty file at `path`: one that is there loses its content, one that is not is made,
/// readable and writable by its owner alone. A symbolic link is followed. What is no regular file
/// (a device, a pipe, a folder) has no content to lose and is left alone. Whether it worked shows
/// when the file is opened.
void createEmptyFile(const std::string& path);

/// A file that is open for writing; closed at the end of its life, if not before. One thread at a
/// time.
class WritableFile {
 public:
  /// Opens what is at `path`; null when it cannot be written to. Never waits for a pipe's reader.
  static std::unique_ptr<WritableFile> open(const std::string& path);

  WritableFile() = default;
  WritableFile(const WritableFile&) = delete;
  WritableFile& operator=(const WritableFile&) = delete;
  virtual ~WritableFile() = default;

  /// Moves the position to the end of the file and writes all of `bytes` there, unbuffered. Gives
  /// the error of write(2) when not all could be written, "timed out" when the other side of a pipe
  /// or terminal did not take them within ten seconds. Must be called where SIGPIPE is ignored or
  /// blocked.
  [[nodiscard]] virtual std::error_code append(std::string_view bytes) = 0;

  /// Closes the file, which is not used any more. Gives the error of close(2): there are file
  /// systems that have none before.
  [[nodiscard]] virtual std::error_code close() = 0;
};
