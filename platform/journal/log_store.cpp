#include "platform/log_store.h"

#include "platform/journal/entry_decoder.h"
#include "platform/journal/entry_merge.h"
#include "platform/journal/reading_thread.h"

#include <array>
#include <atomic>
#include <csignal>
#include <cstring>
#include <exception>
#include <list>
#include <system_error>
#include <thread>
#include <utility>

/// The device's journals, of which one at least can be read.
class LogSource {};

void LogStore::prepare(const Completion& completion) const {
  const auto files = findJournalFiles(1);
  if (!files.found.empty()) {
    completion(std::make_shared<LogSource>(), std::nullopt);
  } else {
    completion(nullptr, LogStoreError{files.error == 0 ? "No journal files were found"
                                                       : std::strerror(files.error)});
  }
}

namespace {

constexpr unsigned kSupportedFlags =
    kLogReaderStoredOnly | kLogReaderOldestFirst | kLogReaderWholeMessages;

/// While entries of one are delivered, the other reads on. On two cores two threads are as many as
/// have work to do.
constexpr std::size_t kReadingThreads = 2;

/// Leaves the process's signals to the threads that expect them; a pipe that breaks under a write
/// on this thread shows as an error then. Threads started from here on do the same.
void blockSignals() {
  sigset_t blocked{};
  sigfillset(&blocked);
  for (const int fault : {SIGBUS, SIGFPE, SIGILL, SIGSEGV}) {
    sigdelset(&blocked, fault);
  }
  pthread_sigmask(SIG_BLOCK, &blocked, nullptr);
}

}  // namespace

/// What a reader and its threads share. Some read journal files, and the one that is the reader's
/// own, as far as the outside goes, delivers.
class LogReader::Session {
 public:
  /// `self` owns this; the thread keeps it until it has run out.
  void start(const std::shared_ptr<Session>& self, LogTime from);
  void stop();

  /// Ends the thread in good order when it is at its end, and else lets it run out on its own.
  void release();

  unsigned flags = 0;
  std::optional<LogFilter> filter;
  EntryHandler entryHandler;
  InvalidationHandler invalidationHandler;

 private:
  void run(LogTime from);
  unsigned long deliverAll(LogTime from);
  bool readAll(LogTime from);
  void deliver(const JournalValues& values, std::uint64_t realtime);
  void end(unsigned long reason);

  LogTime position;  ///< Belongs to the delivering thread once it is started.
  EntryDecoder decoder;
  std::array<EntryPipe, kReadingThreads> pipes;
  std::atomic<bool> stopped = false;
  std::atomic<bool> ended = false;
  std::thread delivering;
};

void LogReader::Session::start(const std::shared_ptr<Session>& self, LogTime from) {
  position = from;
  try {
    delivering = std::thread([self, from] { self->run(from); });
  } catch (const std::system_error&) {
    end(kLogReaderReadError);
  }
}

void LogReader::Session::stop() {
  stopped = true;
  for (auto& pipe : pipes) {
    pipe.close();
  }
}

void LogReader::Session::release() {
  if (!ended) {
    stop();
  }
  if (delivering.joinable() && ended) {
    delivering.join();
  } else if (delivering.joinable()) {
    delivering.detach();
  }
}

void LogReader::Session::run(LogTime from) {
  blockSignals();
  const auto reason = flags == kSupportedFlags ? deliverAll(from) : kLogReaderUnsupported;
  if (!stopped) {
    end(reason);
  }
}

void LogReader::Session::end(unsigned long reason) {
  ended = true;
  if (invalidationHandler) {
    invalidationHandler(reason, position);
  }
}

unsigned long LogReader::Session::deliverAll(LogTime from) {
  bool complete = false;
  try {
    complete = readAll(from);
  } catch (const std::exception&) {
    // There is no thread or no memory to be had.
  }
  return complete ? kLogReaderAtEnd : kLogReaderReadError;
}

/// Reads and delivers everything, or until the reader is stopped. Returns whether nothing is
/// missing.
bool LogReader::Session::readAll(LogTime from) {
  auto files = findJournalFiles();
  JournalFileQueue queue(std::move(files.found), from);
  auto first = queue.takeFirst(kReadingThreads);
  std::list<ReadingThread> threads;
  for (std::size_t at = 0; at < kReadingThreads; ++at) {
    threads.emplace_back(std::move(first.at(at)), queue, filter, from, pipes.at(at));
  }
  EntryMerge entries(pipes);
  while (!stopped && entries.next()) {
    deliver(entries.values(), entries.realtime());
  }
  bool complete = !files.damaged;
  for (auto& thread : threads) {
    complete = thread.finish() && complete;
  }
  return complete;
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
  session->release();
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
