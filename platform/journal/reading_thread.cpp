#include "platform/journal/reading_thread.h"

#include "platform/journal/journal_reading.h"

#include <new>
#include <utility>

ReadingThread::ReadingThread(std::vector<JournalFile> own, JournalFileQueue& others,
                             std::optional<LogFilter> filter, LogTime from, EntryPipe& into)
    : pipe(into),
      thread([this, own = std::move(own), &others, filter = std::move(filter), from]() mutable {
        run(std::move(own), others, filter, from);
      }) {}

ReadingThread::~ReadingThread() {
  pipe.close();
  if (thread.joinable()) {
    thread.join();
  }
}

bool ReadingThread::finish() {
  thread.join();
  return complete;
}

void ReadingThread::run(std::vector<JournalFile> own, JournalFileQueue& others,
                        const std::optional<LogFilter>& filter, LogTime from) {
  try {
    JournalReading reading(std::move(own), others, filter, from);
    EntryBatch batch;
    bool more = true;
    while (more) {
      more = reading.read(batch);
      more = pipe.push(batch) && more;
    }
    complete = reading.isComplete();
  } catch (const std::bad_alloc&) {
    // What has not been read by now is missing.
  }
  pipe.finish();
}
