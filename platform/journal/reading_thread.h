#pragma once

#include "platform/clock.h"
#include "platform/journal/entry_pipe.h"
#include "platform/journal/journal_file_queue.h"
#include "platform/log_filter.h"

#include <optional>
#include <thread>
#include <vector>

/// Reads journal files on a thread of its own, from which the selected entries come through a pipe,
/// oldest first.
class ReadingThread {
 public:
  /// Starts to read the files `own`, in which are all that grow, and those of `others` that it
  /// comes to first. These and the pipe must last longer. Throws std::system_error when there is no
  /// thread to be had.
  ReadingThread(std::vector<JournalFile> own, JournalFileQueue& others,
                std::optional<LogFilter> filter, LogTime from, EntryPipe& into);
  ReadingThread(const ReadingThread&) = delete;
  ReadingThread& operator=(const ReadingThread&) = delete;

  /// Closes the pipe and waits until the thread has noticed.
  ~ReadingThread();

  /// Waits until everything is read, or the pipe is closed. Returns whether nothing is missing. To
  /// be called once.
  bool finish();

 private:
  void run(std::vector<JournalFile> own, JournalFileQueue& others,
           const std::optional<LogFilter>& filter, LogTime from);

  EntryPipe& pipe;
  bool complete = false;  ///< Belongs to the thread until it has ended.
  std::thread thread;
};
