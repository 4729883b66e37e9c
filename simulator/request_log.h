#pragma once

#include "platform/linux/file_descriptor.h"
#include "platform/message_dict.h"

#include <string>

namespace simulator {

/// `text` in double quotes, with C escapes for quotes, backslashes and control characters.
std::string quoted(const std::string& text);

/// A dictionary as `{KEY: TYPE VALUE, ...}`, in the order on the wire: the type is the D-Bus one,
/// s, x or b, or a question mark without a value for all others. Never more than one line.
std::string describe(const MessageDict& dict);

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
