#include "logdump/logdump_args.h"

#include "platform/text.h"

#include <algorithm>
#include <iterator>
#include <optional>
#include <utility>

namespace {

const char* const kReasonPrefix = "[velltool] ";
const char* const kDefaultReason = "User triggered";

struct Keyword {
  const char* word = nullptr;
  std::optional<CompressionMode> mode;  ///< Without one: the user is not asked.
};

const Keyword kKeywords[] = {{"nocompress", kCompressionNone},
                             {"tar.gz", kCompressionTarGz},
                             {"tar", kCompressionTar},
                             {"nonui", std::nullopt}};

/// The keyword that `word` is; null for a reason.
const Keyword* findKeyword(const std::string& word) {
  const auto* const found = std::ranges::find_if(
      kKeywords, [&](const Keyword& keyword) { return equalNoCase(word, keyword.word); });
  return found == std::end(kKeywords) ? nullptr : found;
}

}  // namespace

void parseLogdumpArgs(std::list<std::string>& args, CompressionMode& mode, std::string& reason,
                      bool& nonui) {
  reason = std::string(kReasonPrefix) + kDefaultReason;
  while (!args.empty()) {
    const auto word = std::move(args.front());
    args.pop_front();
    const auto* const keyword = findKeyword(word);
    if (keyword == nullptr) {
      reason = kReasonPrefix + word;
      return;
    }
    mode = keyword->mode.value_or(mode);
    nonui = nonui || !keyword->mode;
  }
}

WordCompleter completeLogdumpArgs(bool nonui) {
  return [nonui](const std::list<std::string>& before, const std::string& /*typed*/) {
    std::set<std::string> words{"--"};
    const bool hasReason = !std::ranges::all_of(before, findKeyword);
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
