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

#include <algorithm>
#include <cctype>
#include <climits>
#include <map>
#include <optional>
#include <sstream>

namespace {

using Words = std::vector<std::string>;

std::string lowered(std::string word) {
  for (auto& character : word) {
    character = static_cast<char>(std::tolower(static_cast<unsigned char>(character)));
  }
  return word;
}

/// What a trace property says as a mode.
std::optional<long> modeOf(const std::string& text) {
  static const std::map<std::string, long> words = {{"false", 0}, {"off", 0}, {"no", 0},
                                                    {"true", 1},  {"on", 1},  {"yes", 1},
                                                    {"full", 1},  {"lite", 2}};
  char* end = nullptr;
  const long number = std::strtol(text.c_str(), &end, 0);
  if (const auto word = words.find(lowered(text)); word != words.end()) {
    return word->second;
  }
  const bool whole = end != text.c_str() && end == text.c_str() + text.size();
  return whole && number == static_cast<int>(number) ? std::optional(number) : std::nullopt;
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
  static const std::map<std::string, CompressionMode> modes = {
      {"nocompress", 0}, {"tar.gz", 1}, {"tar", 2}, {"nonui", 3}};
  CompressionMode counted[] = {7, 7};
  auto at = words.begin();
  for (; at != words.end() && modes.contains(lowered(*at)); ++at) {
    const auto value = modes.at(lowered(*at));
    counted[value / 3] = value;
  }
  CompressionMode mode = 7;
  bool nonui = false;
  std::string reason;
  std::list<std::string> args(words.begin(), words.end());
  parseLogdumpArgs(args, mode, reason, nonui);
  requireEqual(reason, "[velltool] " + (at == words.end() ? "User triggered" : *at));
  require(mode == counted[0] && nonui == (counted[1] == 3), "another mode or flag");
}

void checkExport(const Words& words) {
  std::string lists[3];  // Of processes, of image paths, and of what is dropped.
  int list = 2;
  for (std::size_t at = 2; at < words.size(); ++at) {
    const bool option = words[at].starts_with('-');
    list = !option ? list : words[at] == "-p" ? 0 : words[at] == "-i" ? 1 : 2;
    lists[list] += option ? "" : words[at] + "\n";
  }
  auto& device = in_process::logDevice = {};
  require(makeOsLogHandler()(WorkGroup::create(), {words.begin(), words.end()}), "no export");
  std::string selected[2];
  for (const auto& [kind, text] : device.filter.value_or(LogFilter())) {
    selected[kind == LogComparison::Kind::ProcessEquals ? 0 : 1] += text + "\n";
  }
  requireEqual(selected[0] + "--" + selected[1], lists[0] + "--" + lists[1]);
  long long history = 0;
  std::istringstream(words[0]) >> history;
  history = std::clamp<long long>(history, INT_MIN, INT_MAX);
  require(device.from == device.now - std::chrono::seconds(history), "another start");
  require(device.files.contains(words[1]), "another file");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const auto words = split({reinterpret_cast<const char*>(data), size}, "\n");
  checkTraceValue(words.front());
  checkCollection(words);
  if (words.size() > 2) {
    checkExport(words);
  }
  return 0;
}
