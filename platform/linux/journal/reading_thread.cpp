#include "platform/linux/journal/reading_thread.h"

#include "platform/linux/journal/journal_reading.h"

#include <new>
#include <utility>

ReadingThread::ReadingThread(JournalFileQueue& files, std::optional<LogFilter> filter, LogTime from,
                             EntryPipe& into)
    : pipe(into),
      thread([this, &files, filter = std::move(filter), from] { run(files, filter, from); }) {}

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

void ReadingThread::run(JournalFileQueue& files, const std::optional<LogFilter>& filter,
                        LogTime from) {
  try {
    JournalReading reading(files, filter, from);
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
