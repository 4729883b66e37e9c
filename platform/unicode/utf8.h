#pragma once

#include <string>
#include <string_view>

/// Whether `bytes` are valid UTF-8 (RFC 3629).
bool isValidUtf8(std::string_view bytes);

/// `bytes` as valid UTF-8 (RFC 3629): each broken sequence, as long as it can be read as one,
/// becomes U+FFFD; well-formed text comes back as it is.
std::string validUtf8(std::string_view bytes);

/// Takes from `bytes`, which more may follow, what no more can change, as `validUtf8` gives it. A
/// sequence that is begun at the end is left. From any thread.
std::string takeUtf8(std::string& bytes);

/// As `validUtf8`, and U+FFFD in place of each NUL and each noncharacter too (Unicode Standard,
/// chapter 23.7), which not every program takes as text.
std::string interchangeText(std::string_view bytes);
