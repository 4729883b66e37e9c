#include "logdump/trace_value.h"

#include "platform/text.h"

#include <stdexcept>
#include <utility>

namespace {

constexpr std::pair<const char*, int> kModeWords[] = {
    {"false", 0}, {"off", 0}, {"no", 0},   {"true", 1},
    {"on", 1},    {"yes", 1}, {"full", 1}, {"lite", 2},
};

}  // namespace

std::optional<int> parseTraceMode(const std::string& text) {
  for (const auto& [word, mode] : kModeWords) {
    if (equalNoCase(text, word)) {
      return mode;
    }
  }
  try {
    std::size_t consumed = 0;
    const int number = std::stoi(text, &consumed, 0);
    return consumed == text.size() ? std::optional(number) : std::nullopt;
  } catch (const std::logic_error&) {
    // No number, or one that is too large.
    return std::nullopt;
  }
}

void parseTraceFlag(const std::string& text, bool& flag) {
  if (const auto mode = parseTraceMode(text)) {
    flag = *mode != 0;
  }
}
