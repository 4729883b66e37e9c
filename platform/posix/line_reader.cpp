#include "platform/line_reader.h"

#include "platform/posix/plain_line.h"

std::optional<std::string> readLine(const std::string& prompt, const Completer& /*complete*/) {
  return readPlainLine(prompt);
}
