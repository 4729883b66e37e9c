#include "tests/in_process/log_device.h"

#include "platform/clock.h"
#include "platform/files.h"
#include "platform/system_log.h"

#include <thread>
#include <utility>

namespace in_process {
namespace {

std::unique_ptr<LogDevice>& present() {
  static auto there = std::make_unique<LogDevice>();
  return there;
}

class DeviceFile : public WritableFile {
 public:
  explicit DeviceFile(std::string filePath) : path(std::move(filePath)) {}

  std::error_code append(std::string_view bytes) override {
    auto& room = logDevice().appendsUntilFull;
    if (room && (*room)-- == 0) {
      return std::make_error_code(std::errc::no_space_on_device);
    }
    logDevice().files[path] += bytes;
    return {};
  }

 private:
  std::string path;
};

}  // namespace

LogDevice& logDevice() {
  return *present();
}

LogDevice& startLogDevice() {
  present() = std::make_unique<LogDevice>();
  return *present();
}

}  // namespace in_process

using in_process::logDevice;

LogTime currentTime() {
  return logDevice().now;
}

void logSystemError(const std::string& message) {
  logDevice().messages.push_back(message);
}

void createEmptyFile(const std::string& path) {
  logDevice().files[path].clear();
}

std::unique_ptr<WritableFile> WritableFile::open(const std::string& path) {
  return logDevice().filesCanBeOpened ? std::make_unique<in_process::DeviceFile>(path) : nullptr;
}

class LogSource {};

void LogStore::prepare(const Completion& completion) const {
  if (logDevice().storeError) {
    completion(nullptr, LogStoreError{*logDevice().storeError});
  } else {
    completion(logDevice().storeGivesNothing ? nullptr : std::make_shared<LogSource>(),
               std::nullopt);
  }
}

class LogReader::Session {
 public:
  std::thread delivering;
};

LogReader::LogReader(std::shared_ptr<const LogSource> /*source*/)
    : session(std::make_shared<Session>()) {}

LogReader::~LogReader() {
  if (session->delivering.joinable()) {
    session->delivering.join();
  }
}

void LogReader::setFlags(unsigned flags) {
  logDevice().flags = flags;
}

void LogReader::setFilter(LogFilter filter) {
  logDevice().filter = std::move(filter);
}

void LogReader::setEntryHandler(EntryHandler handler) {
  logDevice().entryHandler = std::move(handler);
}

void LogReader::setInvalidationHandler(InvalidationHandler handler) {
  logDevice().invalidationHandler = std::move(handler);
}

void LogReader::activate(LogTime from) {
  logDevice().from = from;
  session->delivering = std::thread([from] {
    for (const auto& entry : logDevice().entries) {
      logDevice().entryHandler(entry);
    }
    if (logDevice().endReason) {
      logDevice().invalidationHandler(*logDevice().endReason, from);
    }
  });
}

void LogReader::invalidate() {
  logDevice().invalidated = true;
  session->delivering.join();
}
