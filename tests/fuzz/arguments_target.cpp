// The words of the commands and the manager's answers, read by the tool and by a model.
//
// An input is words, one a line; the first is also the value of a trace property.

#include "logdump/logdump_args.h"
#include "logdump/logdump_command.h"
#include "logdump/os_log_handler.h"
#include "logdump/system_logs_trace.h"
#include "logdump/trace_flag.h"
#include "tests/fuzz/fuzz_target.h"
#include "tests/in_process/device.h"
#include "tests/in_process/log_device.h"
#include "tests/unit/console.h"

#include <algorithm>
#include <climits>
#include <map>
#include <optional>
#include <regex>
#include <sstream>

namespace {

using in_process::logDevice;
using Words = std::vector<std::string>;

std::string lowered(std::string word) {
  for (auto& character : word) {
    character =
        static_cast<char>(character >= 'A' && character <= 'Z' ? character + 32 : character);
  }
  return word;
}

/// What a trace property says as a mode.
std::optional<long> modeOf(const std::string& text) {
  static const std::map<std::string, int> words = {{"false", 0}, {"off", 0}, {"no", 0},
                                                   {"true", 1},  {"on", 1},  {"yes", 1},
                                                   {"full", 1},  {"lite", 2}};
  static const std::regex number("[ \t\n\v\f\r]*[-+]?(0[xX][0-9a-fA-F]+|0[0-7]*|[1-9][0-9]*)");
  if (const auto word = words.find(lowered(text)); word != words.end()) {
    return word->second;
  }
  const auto value =
      std::regex_match(text, number) ? std::strtol(text.c_str(), nullptr, 0) : LONG_MAX;
  return value == static_cast<int>(value) ? std::optional(value) : std::nullopt;
}

void checkTraceValue(const std::string& text) {
  static const auto node = LogdumpCommand::create("logdump", {}, nullptr, {});
  const auto mode = modeOf(text);
  for (const bool before : {false, true}) {
    bool flag = before;
    parseTraceFlag(text, flag);
    require(flag == (mode ? *mode != 0 : before), "another flag");
  }
  in_process::device.traceProperty = text;
  require(isSystemLogsTraceModeThree(dynamic_cast<LogdumpCommand&>(*node)) == (mode == 3),
          "another mode");
}

void checkCollection(const Words& words) {
  // Everything up to the first word that is no keyword counts, the last of a kind.
  static const std::map<std::string, CompressionMode> modes = {
      {"nocompress", 0}, {"tar.gz", 1}, {"tar", 2}};
  CompressionMode expected = 7;
  bool expectedNonui = false;
  auto at = words.begin();
  for (; at != words.end() && (modes.contains(lowered(*at)) || lowered(*at) == "nonui"); ++at) {
    const auto mode = modes.find(lowered(*at));
    expected = mode == modes.end() ? expected : mode->second;
    expectedNonui |= mode == modes.end();
  }
  CompressionMode mode = 7;
  bool nonui = false;
  std::string reason;
  std::list<std::string> args(words.begin(), words.end());
  parseLogdumpArgs(args, mode, reason, nonui);
  requireEqual(reason, "[velltool] " + (at == words.end() ? "User triggered" : *at));
  require(mode == expected && nonui == expectedNonui, "another mode or flag");
}

void checkExport(const Words& words) {
  std::string lists[3];  // Processes, image paths, and what is dropped.
  std::string* list = &lists[2];
  for (std::size_t at = 2; at < words.size(); ++at) {
    const auto& word = words[at];
    const bool option = word.starts_with('-');
    list = option ? &lists[word == "-p" ? 0 : word == "-i" ? 1 : 2] : list;
    *list += option ? "" : word + "\n";
  }
  logDevice = {};
  const Console console;
  const bool result = makeOsLogHandler()(WorkGroup::create(), {words.begin(), words.end()});
  require(result == (words.size() > 1), "another result");
  requireEqual(console.output(), result ? "" : "os log collection: Failed\n");
  std::string selected[2];
  for (const auto& [kind, text] : logDevice.filter.value_or(LogFilter())) {
    selected[kind == LogComparison::Kind::ProcessEquals ? 0 : 1] += text + "\n";
  }
  if (words.size() > 2) {
    requireEqual(selected[0] + "--" + selected[1], lists[0] + "--" + lists[1]);
  }
  if (result) {
    long long history = 0;
    std::istringstream(words[0]) >> history;
    history = std::clamp<long long>(history, INT_MIN, INT_MAX);
    require(logDevice.from == logDevice.now - std::chrono::seconds(history), "another start");
    require(logDevice.files.size() == 1 && logDevice.files.contains(words[1]), "another file");
  }
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const auto words = split({reinterpret_cast<const char*>(data), size}, "\n");
  checkTraceValue(words.front());
  checkCollection(words);
  checkExport(words);
  return 0;
}
