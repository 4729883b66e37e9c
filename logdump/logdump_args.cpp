#include "logdump/logdump_args.h"

#include "platform/text.h"

#include <algorithm>
#include <iterator>
#include <optional>
#include <utility>

namespace {

const char* const kReasonPrefix = "[velltool] ";
const char* const kDefaultReason = "User triggered";

/// The words that are no reason, with the mode that they ask for.
const std::pair<const char*, std::optional<CompressionMode>> kKeywords[] = {
    {"nocompress", kCompressionNone},
    {"tar.gz", kCompressionTarGz},
    {"tar", kCompressionTar},
    {"nonui", std::nullopt}};

}  // namespace

void parseLogdumpArgs(std::list<std::string>& args, CompressionMode& mode, std::string& reason,
                      bool& nonui) {
  reason = std::string(kReasonPrefix) + kDefaultReason;
  while (!args.empty()) {
    const auto word = std::move(args.front());
    args.pop_front();
    const auto* const keyword = std::ranges::find_if(
        kKeywords, [&](const auto& known) { return equalNoCase(word, known.first); });
    if (keyword == std::end(kKeywords)) {
      reason = kReasonPrefix + word;
      return;
    }
    mode = keyword->second.value_or(mode);
    nonui = nonui || !keyword->second;
  }
}

WordCompleter completeLogdumpArgs(bool nonui) {
  return [nonui](const std::list<std::string>& before, const std::string& /*typed*/) {
    std::set<std::string> words{"--"};
    const bool hasReason = readLogdumpOptions(before).reason != readLogdumpOptions({}).reason;
    for (const auto& [word, mode] : kKeywords) {
      if (!hasReason && (nonui || mode)) {
        words.insert(word);
      }
    }
    return words;
  };
}

LogdumpOptions readLogdumpOptions(std::list<std::string> args) {
  LogdumpOptions options;
  options.mode = defaultCompressionMode();
  parseLogdumpArgs(args, options.mode, options.reason, options.nonui);
  return options;
}
