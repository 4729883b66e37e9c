#pragma once

#include <optional>
#include <string>

class LogdumpCommand;

/// The mode that the value of a trace property stands for. A word, in any letter case: off is 0, on
/// or full is 1, lite is 2. Else the number that the whole of `text` spells, as std::stoi reads it
/// with base 0: leading white space and a sign, then decimal, 0x for hexadecimal or 0 for octal.
/// nullopt when `text` is neither, or does not fit an int.
std::optional<int> parseTraceMode(const std::string& text);

/// Sets `flag` to whether `text` stands for another mode than 0. `flag` stays as it is when `text`
/// stands for none.
void parseTraceFlag(const std::string& text, bool& flag);

/// Asks the manager whether the system-logs trace is in mode 3, in which collections are not to be
/// packed. False when the manager does not say so, for whatever reason. Blocks until the manager
/// has answered; on the shell thread.
bool isSystemLogsTraceModeThree(LogdumpCommand& node);
