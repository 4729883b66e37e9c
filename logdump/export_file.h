#pragma once

#include "platform/files.h"

#include <atomic>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>

/// The file that an export writes its lines to. The log reader's thread appends, the thread that
/// waits for it closes; whichever is late finds the file closed. From any thread.
class ExportFile {
 public:
  ExportFile(std::string path, std::unique_ptr<WritableFile> opened);

  /// Writes `line` at the end of the file, at once. Does nothing when the file is closed or has
  /// failed before. Returns false when this is the write that fails; that is told the system log.
  bool append(std::string_view line);

  /// Closes the file; one under a write, which may never return, when this object goes. Nothing
  /// more is written. Returns whether every line was written.
  bool close();

 private:
  const std::string path;
  std::atomic<bool> closed = false;  ///< Set while a write may be under way.
  std::mutex mutex;
  std::unique_ptr<WritableFile> file;  ///< Guarded by `mutex`; null once closed or failed.
  bool failed = false;                 ///< Guarded by `mutex`.
};
