#pragma once

#include "platform/compression.h"

#include <list>
#include <string>

/// Reads the words that "tel", "core" and "bb" share. Keywords, in any letter case, set `mode` or
/// `nonui`, a later one overriding an earlier one; the first other word becomes the reason and ends
/// the reading. `mode` and `nonui` come in with their defaults; `reason` is always set. `args` is
/// consumed from the front. On the shell thread.
void parseLogdumpArgs(std::list<std::string>& args, CompressionMode& mode, std::string& reason,
                      bool& nonui);
