#include "logdump/export_file.h"

#include "platform/system_log.h"

#include <utility>

ExportFile::ExportFile(std::string filePath, std::unique_ptr<WritableFile> opened)
    : path(std::move(filePath)), file(std::move(opened)) {}

bool ExportFile::append(std::string_view line) {
  const std::lock_guard lock(mutex);
  if (closed || file == nullptr) {
    return true;
  }
  const auto error = file->append(line);
  if (!error) {
    return true;
  }
  logSystemError("Failed to write file: " + path + ": " + error.message());
  failed = true;
  file.reset();
  return false;
}

bool ExportFile::close() {
  closed = true;
  const std::unique_lock lock(mutex, std::try_to_lock);
  if (!lock) {
    return false;
  }
  file.reset();
  return !failed;
}
