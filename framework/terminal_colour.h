#pragma once

/// The colours of the tool's output, as the control sequences of ECMA-48 (see console_codes(4)).
/// They are written whether or not standard output is a terminal.
inline constexpr const char* kGreen = "\x1b[32m";
inline constexpr const char* kRed = "\x1b[31m";
inline constexpr const char* kDefaultColour = "\x1b[39m";
