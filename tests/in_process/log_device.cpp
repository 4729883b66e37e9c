#include "tests/in_process/log_device.h"

#include "platform/clock.h"
#include "platform/files.h"
#include "platform/portable/work_group_state.h"
#include "platform/system_log.h"

#include <memory>
#include <utility>

using in_process::logDevice;

namespace {

struct DeviceFile : WritableFile {
  explicit DeviceFile(std::string filePath) : path(std::move(filePath)) {}

  std::error_code append(std::string_view bytes) override {
    if (logDevice.hang) {
      logDevice.hang->begun.set_value();  // Throws the second time.
      logDevice.hang->released.get_future().wait();
    }
    if (logDevice.appendsUntilFull-- == 0) {
      return std::make_error_code(std::errc::no_space_on_device);
    }
    logDevice.files[path] += bytes;
    return {};
  }

  std::error_code close() override { return std::make_error_code(logDevice.closeError); }

  const std::shared_ptr<void> closing{nullptr, [](void*) { ++logDevice.filesClosed; }};
  std::string path;
};

}  // namespace

class LogReader::Session {};

std::unique_ptr<WritableFile> WritableFile::open(const std::string& path) {
  return std::make_unique<DeviceFile>(path);
}

void LogReader::activate(LogTime from) {
  logDevice.from = from;
  const auto deliver = [from] {
    for (const auto& entry : logDevice.entries) {
      logDevice.entryHandler(entry);
    }
    if (logDevice.endReason) {
      logDevice.endHandler(*logDevice.endReason, from);
    }
  };
  if (logDevice.hang) {
    logDevice.delivering = std::thread(deliver);
    logDevice.hang->begun.get_future().wait();
  } else {
    deliver();
  }
}

WorkGroup WorkGroup::create() {
  WorkGroup group;
  group.state = logDevice.groupsCanBeMade ? std::make_shared<State>() : nullptr;
  return group;
}

/// The time runs out at once.
bool WorkGroup::waitFor(std::chrono::nanoseconds timeout) const {
  logDevice.longestWait = timeout;
  const std::lock_guard lock(state->mutex);
  return state->outstanding == 0;
}

// clang-format off

LogTime currentTime() { return logDevice.now; }
void logSystemError(const std::string& message) { logDevice.messages.push_back(message); }
void createEmptyFile(const std::string& path) { logDevice.files[path].clear(); }
void LogStore::prepare(const Completion& completion) const {
  completion(std::make_shared<LogSource>(), std::nullopt);
}
LogReader::LogReader(std::shared_ptr<const LogSource> /*source*/) {}
LogReader::~LogReader() = default;
void LogReader::setFlags(unsigned flags) { logDevice.flags = flags; }
void LogReader::setFilter(LogFilter filter) { logDevice.filter = filter; }
void LogReader::setEntryHandler(EntryHandler handler) { logDevice.entryHandler = handler; }
void LogReader::setInvalidationHandler(InvalidationHandler handler) {
  logDevice.endHandler = handler;
}
void LogReader::invalidate() { logDevice.invalidated = true; }

// clang-format on
