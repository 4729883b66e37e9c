#include "logdump/trace_value.h"

#include "logdump/logdump_command.h"
#include "platform/manager_client.h"
#include "platform/manager_names.h"
#include "platform/text.h"

#include <stdexcept>
#include <utility>

namespace {

constexpr int kModeThree = 3;

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

bool isSystemLogsTraceModeThree(LogdumpCommand& node) {
  MessageDict request;
  request.set(vell::kKeyTraceName, vell::kTraceSystemLogs);
  request.set(vell::kKeyTracePropertyName, vell::kKeyTraceMode);
  MessageDict reply;
  // The result need not be examined: a command that failed leaves no dictionary.
  vell::client::PerformCommand(node.manager, vell::kCommandGetTraceProperty, request, &reply);
  return parseTraceMode(reply.getString(vell::kKeyTracePropertyValue)) == kModeThree;
}
