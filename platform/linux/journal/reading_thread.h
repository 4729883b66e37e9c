#pragma once

#include "platform/clock.h"
#include "platform/linux/journal/entry_pipe.h"
#include "platform/linux/journal/journal_file_queue.h"
#include "platform/log_filter.h"

#include <optional>
#include <thread>

/// Reads journal files on a thread of its own, from which the selected entries come through a pipe,
/// oldest first.
class ReadingThread {
 public:
  /// Starts to read what it gets of `files`. They and the pipe must last longer. Throws
  /// std::system_error when there is no thread to be had.
  ReadingThread(JournalFileQueue& files, std::optional<LogFilter> filter, LogTime from,
                EntryPipe& into);
  ReadingThread(const ReadingThread&) = delete;
  ReadingThread& operator=(const ReadingThread&) = delete;

  /// Closes the pipe and waits until the thread has noticed.
  ~ReadingThread();

  /// Waits until everything is read, or the pipe is closed. Returns whether nothing is missing. To
  /// be called once.
  bool finish();

 private:
  void run(JournalFileQueue& files, const std::optional<LogFilter>& filter, LogTime from);

  EntryPipe& pipe;
  bool complete = false;  ///< Belongs to the thread until it has ended.
  std::thread thread;
};
