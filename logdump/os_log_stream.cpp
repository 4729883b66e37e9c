#include "logdump/os_log_stream.h"

#include "logdump/export_file.h"
#include "logdump/os_log_line.h"
#include "platform/clock.h"
#include "platform/files.h"
#include "platform/log_store.h"
#include "platform/system_log.h"
#include "platform/work_group.h"

#include <algorithm>
#include <chrono>
#include <memory>
#include <utility>

namespace {

constexpr std::chrono::seconds kLongestExport{180};
constexpr unsigned kReaderFlags =
    kLogReaderStoredOnly | kLogReaderOldestFirst | kLogReaderWholeMessages;

/// A reader over the device's own log; null, and the system log knows why, when there is none.
std::unique_ptr<LogReader> prepareReader() {
  std::unique_ptr<LogReader> reader;
  LogStore::openLocal().prepare(
      [&](std::shared_ptr<const LogSource> source, const std::optional<LogStoreError>& error) {
        if (error) {
          logSystemError("Could not open: " + error->description);
        } else if (source != nullptr) {
          reader = std::make_unique<LogReader>(std::move(source));
        }
      });
  if (reader == nullptr) {
    logSystemError("Failed to prepare oslog stream");
  }
  return reader;
}

std::shared_ptr<ExportFile> createFile(const std::string& path) {
  createEmptyFile(path);
  auto opened = WritableFile::open(path);
  if (opened == nullptr) {
    logSystemError("Failed to create file: " + path);
    return nullptr;
  }
  return std::make_shared<ExportFile>(path, std::move(opened));
}

WorkGroup createGroup() {
  auto group = WorkGroup::create();
  if (!group) {
    logSystemError("Failed to get group");
  }
  return group;
}

LogFilter makeFilter(std::vector<std::string> process, std::vector<std::string> imagePath) {
  LogFilter filter;
  for (auto& name : process) {
    filter.push_back({LogComparison::Kind::ProcessEquals, std::move(name)});
  }
  for (auto& text : imagePath) {
    filter.push_back({LogComparison::Kind::SenderImagePathContains, std::move(text)});
  }
  return filter;
}

/// One export under way: what the reader's handlers and the thread that waits for them share.
class Export {
 public:
  Export(std::shared_ptr<ExportFile> output, WorkGroup joined)
      : file(std::move(output)), group(std::move(joined)) {
    group.enter();
  }

  void handleEntry(const LogEntry& entry) {
    if (entry.type == kLogEntryMessage && !file->append(formatOsLogLine(entry))) {
      leave();
    }
  }

  void handleInvalidation(unsigned long reason) {
    if (reason != kLogReaderAtEnd) {
      logSystemError("Invalid oslog stream: reason = " + std::to_string(reason));
    }
    leave();
  }

 private:
  /// Lets the waiting thread go on, because nothing more will be written.
  void leave() {
    if (!std::exchange(left, true)) {
      group.leave();
    }
  }

  const std::shared_ptr<ExportFile> file;
  const WorkGroup group;
  bool left = false;  ///< On the reader's thread.
};

/// When an export of the last `history` seconds starts.
LogTime startOf(double history) {
  // Far enough back and ahead for anything, and not so far that a time cannot hold it.
  constexpr double kLongest = 1e11;
  const std::chrono::duration<double> length(std::clamp(history, -kLongest, kLongest));
  return currentTime() - std::chrono::duration_cast<std::chrono::microseconds>(length);
}

}  // namespace

bool OsLogStream::putOsLogStreamToFile(std::string path, std::vector<std::string> process,
                                       std::vector<std::string> imagePath, double history) {
  const auto reader = prepareReader();
  if (reader == nullptr) {
    return false;
  }
  const auto file = createFile(path);
  if (file == nullptr) {
    return false;
  }
  const auto group = createGroup();
  if (!group) {
    return false;
  }
  reader->setFlags(kReaderFlags);
  auto filter = makeFilter(std::move(process), std::move(imagePath));
  if (!filter.empty()) {
    reader->setFilter(std::move(filter));
  }
  const auto start = startOf(history);
  const auto running = std::make_shared<Export>(file, group);
  reader->setEntryHandler([running](const LogEntry& entry) { running->handleEntry(entry); });
  reader->setInvalidationHandler([running](unsigned long reason, LogTime /*position*/) {
    running->handleInvalidation(reason);
  });
  logSystemError("Getting oslog stream: history = " + std::to_string(history));
  reader->activate(start);
  const bool ended = group.waitFor(kLongestExport);
  if (!ended) {
    reader->invalidate();
    logSystemError("Timeout on getting oslog stream");
  }
  return file->close() && ended;
}
