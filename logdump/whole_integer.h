#pragma once

#include <optional>
#include <string>

/// The number that the whole of `text` spells, in the notation that std::stoi reads with base 0:
/// leading white space and a sign, then decimal, 0x for hexadecimal or 0 for octal. Empty when
/// anything is left over, there is no number, or it does not fit an int. From any thread.
std::optional<int> parseWholeInteger(const std::string& text);
