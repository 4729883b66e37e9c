#include "framework/completion.h"

#include "framework/command_path.h"

#include <algorithm>
#include <set>
#include <utility>

namespace {

enum class Next { firstWord, laterWord, path };

/// Whether `word` can be typed as one word and does nothing to a terminal: no C0 and C1 controls.
bool canBeTyped(const std::string& word) {
  unsigned char last = 0;
  return !word.empty() && std::ranges::none_of(word, [&](unsigned char byte) {
    return byte <= ' ' || byte == 0x7F || (std::exchange(last, byte) == 0xC2 && byte < 0xA0);
  });
}

/// What can follow at `node` where `typed` has been typed.
std::set<std::string> wordsAt(const CommandBase& node, Next next, const std::string& typed) {
  std::set<std::string> words = node.getWords();
  std::erase_if(words, [&](const std::string& word) {
    return word == "--" || (next == Next::path &&
                            (!node.isValidSubCommand(word) || word.find('/') != std::string::npos));
  });
  if (next != Next::path) {
    words.insert({"cd", "help"});
  }
  if (next == Next::firstWord) {
    words.insert({"quit", "exit"});
  }
  // On its own, ".." would lead back to where the path came from.
  if (next != Next::laterWord && !node.getParent().expired() &&
      (next == Next::firstWord || typed.starts_with('.') || words.size() > 1)) {
    words.insert(next == Next::path ? ".." : "back");
  }
  return words;
}

}  // namespace

Completions completeLine(const std::shared_ptr<CommandBase>& promptNode, const std::string& text) {
  auto typed = text.substr(text.find_last_of(" \t\n\v\f\r") + 1);
  auto words = splitAtWhiteSpace(text.substr(0, text.size() - typed.size()));
  words.erase(words.begin(), std::find(words.rbegin(), words.rend(), "--").base());
  auto node = promptNode;  // Null behind a handler, a path, and what is neither.
  auto next = Next::firstWord;
  std::set<std::string> known;
  for (auto word = words.begin(); word != words.end() && node; ++word) {
    if (*word == "cd") {
      next = Next::path;
      node = std::next(word) == words.end() ? node : nullptr;
    } else if (node->isValidCommand(*word)) {
      const auto complete = node->getWordCompleter(*word);
      known = complete ? complete({std::next(word), words.end()}, typed) : known;
      node = nullptr;
    } else {
      node = node->getSubCommandObj(*word);
      next = Next::laterWord;
    }
  }
  const auto pathEnd = typed.rfind('/') + 1;  // 0 without a slash.
  Completions completions{typed.size() - pathEnd, {}};
  if (node && next == Next::path) {
    node = followPath(node, typed.substr(0, pathEnd)) ? node : nullptr;
    typed.erase(0, pathEnd);
  }
  for (const auto& word : node ? wordsAt(*node, next, typed) : known) {
    if (word.starts_with(typed) && canBeTyped(word)) {
      completions.words.push_back(word.substr(typed.size() - completions.typed) +
                                  (next == Next::path ? "/" : ""));
    }
  }
  return completions;
}
