#include "platform/log_store.h"

#include "platform/journal/batch_queue.h"
#include "platform/journal/entry_decoder.h"
#include "platform/journal/journal_reader.h"
#include "platform/system_log.h"
#include "platform/threads.h"

#include <atomic>
#include <set>
#include <thread>
#include <utility>

/// Has nothing in it: a reader finds the journals that are there when it is activated.
class LogSource {};

void LogStore::prepare(const Completion& completion) const {
  const auto files = findJournalFiles(0, 1);
  if (!files.found.empty()) {
    completion(std::make_shared<LogSource>(), std::nullopt);
  } else {
    completion(nullptr, LogStoreError{files.missed.empty() ? "No journal files were found"
                                                           : files.missed.begin()->text()});
  }
}

namespace {

constexpr unsigned kSupportedFlags =
    kLogReaderStoredOnly | kLogReaderOldestFirst | kLogReaderWholeMessages;

/// The reading thread: puts the selected entries into `queue`. Returns the files of which entries
/// are or may be missing.
std::set<FileStatus> readAll(const std::optional<LogFilter>& filter, LogTime from,
                             BatchQueue& queue) {
  JournalReader reader(filter, from);
  EntryBatch batch;
  bool more = true;
  while (more) {
    more = reader.read(batch);
    more = queue.push(batch) && more;
  }
  queue.finish();
  return reader.missed();
}

}  // namespace

/// What a reader shares with its two threads. One reads the journal; the other, which is the
/// reader's own as far as its handlers can tell, delivers.
class LogReader::Session {
 public:
  /// `self` owns this; the delivering thread holds it until it ends.
  void start(const std::shared_ptr<Session>& self, LogTime from);
  void stop();

  unsigned flags = 0;
  std::optional<LogFilter> filter;
  EntryHandler entryHandler;
  InvalidationHandler invalidationHandler;

 private:
  void run(LogTime from);
  unsigned long deliverAll(LogTime from);
  void deliverQueued();
  void deliver(const JournalValues& values, std::uint64_t realtime);

  LogTime position;  ///< The delivering thread's once that is started.
  EntryDecoder decoder;
  BatchQueue queue;
  std::atomic<bool> stopped = false;
};

void LogReader::Session::start(const std::shared_ptr<Session>& self, LogTime from) {
  position = from;
  startThread("log.deliver", [self, from] { self->run(from); }).detach();
}

void LogReader::Session::stop() {
  stopped = true;
  queue.close();
}

void LogReader::Session::run(LogTime from) {
  const auto reason = flags == kSupportedFlags ? deliverAll(from) : kLogReaderUnsupported;
  if (!stopped && invalidationHandler) {
    invalidationHandler(reason, position);
  }
  // What the handlers hold, as a file, may take its time to go: here, nobody waits for it.
  entryHandler = nullptr;
  invalidationHandler = nullptr;
}

/// Reads and delivers everything, or until the reader is stopped. Returns the reason of the end.
unsigned long LogReader::Session::deliverAll(LogTime from) {
  std::set<FileStatus> missed;
  auto reading = startThread("log.read", [&] { missed = readAll(filter, from, queue); });
  deliverQueued();
  reading.join();
  for (const auto& file : missed) {
    logSystemError(file.text());
  }
  return missed.empty() ? kLogReaderAtEnd : kLogReaderReadError;
}

/// Delivers until the queue ends.
void LogReader::Session::deliverQueued() {
  EntryBatch batch;
  while (queue.pop(batch)) {
    for (std::size_t entry = 0; entry < batch.size() && !stopped; ++entry) {
      deliver(batch.valuesOf(entry), batch.realtimeOf(entry));
    }
  }
}

void LogReader::Session::deliver(const JournalValues& values, std::uint64_t realtime) {
  const auto entry = decoder.decode(values, realtime);
  position = entry.time;
  if (entryHandler) {
    entryHandler(entry);
  }
}

LogReader::LogReader(std::shared_ptr<const LogSource> /*source*/)
    : session(std::make_shared<Session>()) {}

LogReader::~LogReader() {
  session->stop();
}

void LogReader::setFlags(unsigned flags) {
  session->flags = flags;
}

void LogReader::setFilter(LogFilter filter) {
  session->filter = std::move(filter);
}

void LogReader::setEntryHandler(EntryHandler handler) {
  session->entryHandler = std::move(handler);
}

void LogReader::setInvalidationHandler(InvalidationHandler handler) {
  session->invalidationHandler = std::move(handler);
}

void LogReader::activate(LogTime from) {
  session->start(session, from);
}

void LogReader::invalidate() {
  session->stop();
}
