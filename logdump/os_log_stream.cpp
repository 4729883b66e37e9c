#include "logdump/os_log_stream.h"

#include "logdump/os_log_line.h"
#include "platform/clock.h"
#include "platform/files.h"
#include "platform/log_store.h"
#include "platform/system_log.h"
#include "platform/threads.h"
#include "platform/work_group.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <future>
#include <memory>
#include <system_error>
#include <utility>

namespace {

constexpr std::chrono::seconds kLongestExport{180};
const char* const kTimeout = "Timeout on getting oslog stream";
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

std::unique_ptr<WritableFile> createFile(const std::string& path) {
  createEmptyFile(path);
  auto file = WritableFile::open(path);
  if (file == nullptr) {
    logSystemError("Failed to create file: " + path);
  }
  return file;
}

/// As `createFile`, on a thread of its own, because a file system may never answer; null then.
std::unique_ptr<WritableFile> createFileInTime(const std::string& path) {
  const auto created = std::make_shared<std::promise<std::unique_ptr<WritableFile>>>();
  auto file = created->get_future();
  startThread("log.file", [created, path] { created->set_value(createFile(path)); }).detach();
  if (file.wait_for(kLongestExport) == std::future_status::ready) {
    return file.get();
  }
  logSystemError(kTimeout);
  return nullptr;
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

enum class Outcome { none, complete, failed, timedOut };

/// What the reader's handlers share. It is on the reader's thread from its first entry to its end,
/// so that the file may take its time: nobody waits for it longer than for an export.
class Export {
 public:
  Export(std::string filePath, std::unique_ptr<WritableFile> opened, WorkGroup joined,
         std::shared_ptr<std::atomic<Outcome>> shared)
      : path(std::move(filePath)),
        file(std::move(opened)),
        group(std::move(joined)),
        outcome(std::move(shared)) {
    group.enter();
  }

  void handleEntry(const LogEntry& entry) {
    if (entry.type == kLogEntryMessage && *outcome == Outcome::none) {
      if (const auto error = file->append(formatOsLogLine(entry))) {
        end(error);
      }
    }
  }

  void handleInvalidation(unsigned long reason) {
    if (reason != kLogReaderAtEnd) {
      logSystemError("Invalid oslog stream: reason = " + std::to_string(reason));
    }
    if (*outcome == Outcome::none) {
      end(file->close());
    }
  }

 private:
  /// Lets the waiting thread go on, because nothing more will be written.
  void end(const std::error_code& error) {
    if (error) {
      logSystemError("Failed to write file: " + path + ": " + error.message());
    }
    *outcome = error ? Outcome::failed : Outcome::complete;
    group.leave();
  }

  const std::string path;
  const std::unique_ptr<WritableFile> file;
  const WorkGroup group;
  const std::shared_ptr<std::atomic<Outcome>> outcome;
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
  auto file = createFileInTime(path);
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
  const auto outcome = std::make_shared<std::atomic<Outcome>>(Outcome::none);
  auto running = std::make_shared<Export>(std::move(path), std::move(file), group, outcome);
  reader->setEntryHandler([running](const LogEntry& entry) { running->handleEntry(entry); });
  reader->setInvalidationHandler(
      [running = std::move(running)](unsigned long reason, LogTime /*position*/) {
        running->handleInvalidation(reason);
      });
  logSystemError("Getting oslog stream: history = " + std::to_string(history));
  reader->activate(start);
  const bool ended = group.waitFor(kLongestExport);
  if (!ended) {
    *outcome = Outcome::timedOut;
    reader->invalidate();
    logSystemError(kTimeout);
  }
  return ended && *outcome == Outcome::complete;
}
