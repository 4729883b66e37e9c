#pragma once

#include <string>

/// Reads the value of a trace's on/off property: one of the words for on or off in any letter case,
/// or a number, of which 0 is off. `flag` stays as it is when `text` is neither. From any thread.
void parseTraceFlag(const std::string& text, bool& flag);
