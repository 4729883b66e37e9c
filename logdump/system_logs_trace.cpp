#include "logdump/system_logs_trace.h"

#include "logdump/logdump_command.h"
#include "logdump/whole_integer.h"
#include "platform/manager_client.h"
#include "platform/manager_names.h"
#include "platform/text.h"

#include <algorithm>
#include <array>
#include <optional>
#include <string>

namespace {

constexpr int kModeThree = 3;

struct ModeWord {
  const char* word;
  int mode;
};

constexpr std::array kModeWords = {
    ModeWord{"false", 0}, ModeWord{"off", 0}, ModeWord{"no", 0},   ModeWord{"true", 1},
    ModeWord{"on", 1},    ModeWord{"yes", 1}, ModeWord{"full", 1}, ModeWord{"lite", 2},
};

std::optional<int> parseTraceMode(const std::string& text) {
  const auto* const found =
      std::find_if(kModeWords.begin(), kModeWords.end(),
                   [&](const ModeWord& entry) { return equalNoCase(text, entry.word); });
  return found != kModeWords.end() ? found->mode : parseWholeInteger(text);
}

}  // namespace

bool isSystemLogsTraceModeThree(LogdumpCommand& node) {
  MessageDict request;
  request.set(vell::kKeyTraceName, vell::kTraceSystemLogs);
  request.set(vell::kKeyTracePropertyName, vell::kKeyTraceMode);
  MessageDict reply;
  // The result need not be examined: a command that failed leaves no dictionary.
  vell::client::PerformCommand(node.manager, vell::kCommandGetTraceProperty, request, &reply);
  return parseTraceMode(reply.getString(vell::kKeyTracePropertyValue)) == kModeThree;
}
