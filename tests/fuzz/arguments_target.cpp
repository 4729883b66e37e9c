// The words of the commands and the manager's answers, read by the tool and by a model.
//
// An input is words, one a line; each is also taken for the value of a trace property.

#include "logdump/handlers.h"
#include "logdump/logdump_args.h"
#include "logdump/trace_value.h"
#include "tests/fuzz/fuzz_target.h"
#include "tests/in_process/log_device.h"
#include "tests/unit/console.h"

#include <algorithm>
#include <cctype>
#include <climits>
#include <map>
#include <sstream>

namespace {

std::string lowered(std::string word) {
  std::transform(word.begin(), word.end(), word.begin(),
                 [](unsigned char c) { return std::tolower(c); });
  return word;
}

void checkTraceValue(const std::string& text) {
  static const std::map<std::string, std::string> words = {
      {"false", "0"}, {"off", "0"}, {"no", "0"},   {"true", "1"},
      {"on", "1"},    {"yes", "1"}, {"full", "1"}, {"lite", "2"}};
  const auto word = words.find(lowered(text));
  const auto number = word != words.end() ? word->second : text;
  char* end = nullptr;
  const long mode = std::strtol(number.c_str(), &end, 0);
  const bool known =
      !number.empty() && end == number.c_str() + number.size() && mode == static_cast<int>(mode);
  require(parseTraceMode(text) == (known ? std::optional(mode) : std::nullopt), "another mode");
  for (const bool before : {false, true}) {
    bool flag = before;
    parseTraceFlag(text, flag);
    require(flag == (known ? mode != 0 : before), "another flag");
  }
}

void checkCollection(const std::vector<std::string>& words) {
  static const std::map<std::string, CompressionMode> modes = {
      {"nocompress", 0}, {"tar.gz", 1}, {"tar", 2}, {"nonui", 3}};
  CompressionMode counted[] = {0, 0};
  auto at = words.begin();
  for (; at != words.end() && modes.contains(lowered(*at)); ++at) {
    const auto value = modes.at(lowered(*at));
    counted[value / 3] = value;
  }
  const auto options = readLogdumpOptions({words.begin(), words.end()});
  requireEqual(options.reason, "[velltool] " + (at == words.end() ? "User triggered" : *at));
  require(options.mode == counted[0] && options.nonui == (counted[1] == 3), "another mode or flag");
}

void checkExport(const std::vector<std::string>& words) {
  auto& device = in_process::logDevice = {};
  const Console console;
  const bool exported = makeOsLogHandler()({}, {words.begin(), words.end()});
  require(exported == (words.size() > 1) && exported == device.from.has_value(), "another result");
  requireEqual(console.output(), exported ? "" : "os log collection: Failed\n");
  if (!exported) {
    return;
  }
  static const auto defaults = split(
      "60 out -p Linkward LinkwardMobileHelper LinkwardRootHelper vell-helper Airgroved Tessfield "
      "voltkeeperd -i HaldenBaseband",
      " ");
  const auto& selection = words.size() == 2 ? defaults : words;
  std::map<std::string, std::string> expected, selected;  // By the option that stands before them.
  std::string option;
  for (auto word = selection.begin() + 2; word != selection.end(); ++word) {
    option = word->starts_with('-') ? *word : option;
    expected[option] += word->starts_with('-') ? "" : *word + "\n";
  }
  for (const auto& [kind, text] : device.filter.value_or(LogFilter())) {
    selected[kind == LogComparison::Kind::ProcessEquals ? "-p" : "-i"] += text + "\n";
  }
  requireEqual(selected["-p"] + "--" + selected["-i"], expected["-p"] + "--" + expected["-i"]);
  long long history = 0;
  std::istringstream(words[0]) >> history;
  history = std::clamp<long long>(history, INT_MIN, INT_MAX);
  require(device.from == device.now - std::chrono::seconds(history), "another start");
  require(device.files.contains(words[1]), "another file");
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const auto words = split({reinterpret_cast<const char*>(data), size}, "\n");
  std::for_each(words.begin(), words.end(), checkTraceValue);
  checkCollection(words);
  checkExport(words);
  return 0;
}
