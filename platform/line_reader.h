#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <vector>

/// What can be typed to complete a line.
struct Completions {
  std::size_t typed = 0;           ///< Bytes at the end of the line that all `words` begin with.
  std::vector<std::string> words;  ///< Sorted; each with the blank or slash that ends it.
};

/// Completes a line of which the text up to the cursor is given.
using Completer = std::function<Completions(const std::string& text)>;

/// Writes `prompt` to standard output and reads a line from standard input, without its line break.
/// A line that ends with the input counts. nullopt at the end of input, after an error and when the
/// prompt cannot be written.
///
/// Where both are terminals that can do it, the line can be edited, the Tab key asks `complete`,
/// and the process's earlier lines come back: a letter with its accents counts as one, and what is
/// no UTF-8 is passed over. What is typed between two calls waits unseen for the next. The terminal
/// is then set as it was found when the process exits (std::exit, std::quick_exit), is stopped from
/// the keyboard, or ends by a signal that can be caught. All calls are from the same thread.
std::optional<std::string> readLine(const std::string& prompt, const Completer& complete);
