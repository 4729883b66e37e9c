#pragma once

#include <string>
#include <vector>

/// The export of the system log.
class OsLogStream {
 public:
  OsLogStream() = delete;

  /// Writes the messages of the system log's last `history` seconds to the file at `path`, one line
  /// each: those of a process that has one of the names `process`, or whose image path contains one
  /// of `imagePath`, case and diacritics ignored; all of them when both lists are empty.
  ///
  /// Blocks until the file is open and then until the log is read, 180 seconds each at most,
  /// however long the file takes, and tells the system log what went wrong. False when the log or
  /// the file could not be opened, there was no memory for a group, a line could not be written,
  /// the file could not be closed, or the time ran out; the file keeps the lines written so far.
  static bool putOsLogStreamToFile(std::string path, std::vector<std::string> process,
                                   std::vector<std::string> imagePath, double history);
};
