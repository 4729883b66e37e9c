#pragma once

#include "platform/clock.h"
#include "platform/linux/journal/entry_pipe.h"
#include "platform/linux/journal/journal_files.h"
#include "platform/log_filter.h"

#include <optional>
#include <thread>
#include <vector>

/// Reads some of the journal files on a thread of its own, from which the selected entries come
/// through a pipe, oldest first.
class ReadingThread {
 public:
  /// Starts to read. The pipe must last longer. Throws std::system_error when there is no thread to
  /// be had.
  ReadingThread(std::vector<JournalFile> files, std::optional<LogFilter> filter, LogTime from,
                EntryPipe& into);
  ReadingThread(const ReadingThread&) = delete;
  ReadingThread& operator=(const ReadingThread&) = delete;

  /// Closes the pipe and waits until the thread has noticed.
  ~ReadingThread();

  /// Waits until everything is read, or the pipe is closed. Returns whether nothing is missing. To
  /// be called once.
  bool finish();

 private:
  void run(std::vector<JournalFile> files, const std::optional<LogFilter>& filter, LogTime from);

  EntryPipe& pipe;
  bool complete = false;  ///< Belongs to the thread until it has ended.
  std::thread thread;
};
