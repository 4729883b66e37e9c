#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <vector>

/// What can be typed to complete a line.
struct Completions {
  std::size_t typed = 0;           ///< Bytes at the end of the line that all `words` begin with.
  std::vector<std::string> words;  ///< Sorted. A blank goes behind those that end in no slash.
};

/// Completes a line of which the text up to the cursor is given.
using Completer = std::function<Completions(const std::string& text)>;

/// Writes `prompt` to standard output and reads a line from standard input, without its line break.
/// A line that ends with the input counts. nullopt at the end of input, after an error and when the
/// prompt cannot be written.
///
/// Where both are terminals that can do it, the line is edited with readline(3), as the person's
/// inputrc says for "velltool": Tab asks `complete`, the process's earlier lines come back, Ctrl-C
/// gives up the line and begins another, and what is no UTF-8 is taken for U+FFFD. Several lines
/// that were entered at once come one by one. During the call the terminal is set for editing; it
/// is as it was found after std::quick_exit, and when a signal that people send (readline catches
/// INT, TERM, HUP, QUIT, ALRM and those of job control) stops or ends the process. Other threads
/// have to block signals. SIGCONT stays caught between calls. All calls are from the same thread.
std::optional<std::string> readLine(const std::string& prompt, const Completer& complete);
