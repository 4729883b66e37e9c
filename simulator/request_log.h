#pragma once

#include "platform/posix/file_descriptor.h"

#include <string>

namespace simulator {

/// Where a service says what it does, one line each. Every line is out when `write` returns.
class RequestLog {
 public:
  /// Appends to the file at `path`, or writes to standard output when that is empty. Complains and
  /// writes nothing when the file cannot be opened.
  explicit RequestLog(const std::string& path);

  void write(const std::string& line) const;

 private:
  FileDescriptor file;  ///< A duplicate of standard output when there is no path.
};

}  // namespace simulator
