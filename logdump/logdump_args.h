#pragma once

#include "framework/command_base.h"
#include "platform/compression.h"

#include <list>
#include <string>

/// Reads the words that "tel", "core" and "bb" share. Keywords, in any letter case, set `mode` or
/// `nonui`; a later one overrides an earlier one. The first other word becomes the reason, and the
/// words behind it are ignored. The caller sets `mode` and `nonui` to their defaults; `reason` is
/// always set. `args` is consumed from the front. On the shell thread.
void parseLogdumpArgs(std::list<std::string>& args, CompressionMode& mode, std::string& reason,
                      bool& nonui);

/// Completes those words: with keywords, "nonui" among them where it counts, and with "--". On the
/// shell thread.
WordCompleter completeLogdumpArgs(bool nonui);

/// What the user asked of a collection.
struct LogdumpOptions {
  CompressionMode mode = kCompressionNone;
  std::string reason;
  bool nonui = false;
};

/// Reads the words of a handler, with the device's default compression mode. On the shell thread.
LogdumpOptions readLogdumpOptions(std::list<std::string> args);
