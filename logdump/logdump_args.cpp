#include "logdump/logdump_args.h"

#include "platform/text.h"

#include <utility>

namespace {

const char* const kReasonPrefix = "[velltool] ";
const char* const kDefaultReason = "User triggered";

}  // namespace

void parseLogdumpArgs(std::list<std::string>& args, CompressionMode& mode, std::string& reason,
                      bool& nonui) {
  reason = std::string(kReasonPrefix) + kDefaultReason;
  while (!args.empty()) {
    const auto word = std::move(args.front());
    args.pop_front();
    if (equalNoCase(word, "nocompress")) {
      mode = kCompressionNone;
    } else if (equalNoCase(word, "tar.gz")) {
      mode = kCompressionTarGz;
    } else if (equalNoCase(word, "tar")) {
      mode = kCompressionTar;
    } else if (equalNoCase(word, "nonui")) {
      nonui = true;
    } else {
      reason = kReasonPrefix + word;
      return;
    }
  }
}

LogdumpOptions readLogdumpOptions(std::list<std::string> args) {
  LogdumpOptions options;
  options.mode = defaultCompressionMode();
  parseLogdumpArgs(args, options.mode, options.reason, options.nonui);
  return options;
}
