#pragma once

#include "platform/message_dict.h"

#include <string>

namespace simulator {

/// `text` in double quotes, with C escapes for quotes, backslashes and control characters.
std::string quoted(const std::string& text);

/// A dictionary as `{KEY: TYPE VALUE, ...}`, in the order on the wire: the type is the D-Bus one,
/// s, x or b, or a question mark without a value for all others. Never more than one line.
std::string describe(const MessageDict& dict);

}  // namespace simulator
