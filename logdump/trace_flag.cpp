#include "logdump/trace_flag.h"

#include "logdump/whole_integer.h"
#include "platform/text.h"

#include <algorithm>
#include <array>

namespace {

constexpr std::array kOffWords = {"false", "off", "no"};
constexpr std::array kOnWords = {"true", "on", "yes", "full", "lite"};

template <typename Words>
bool isOneOf(const Words& words, const std::string& text) {
  return std::any_of(words.begin(), words.end(),
                     [&](const char* word) { return equalNoCase(text, word); });
}

}  // namespace

void parseTraceFlag(const std::string& text, bool& flag) {
  if (isOneOf(kOffWords, text)) {
    flag = false;
  } else if (isOneOf(kOnWords, text)) {
    flag = true;
  } else if (const auto number = parseWholeInteger(text)) {
    flag = *number != 0;
  }
}
