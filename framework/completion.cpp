#include "framework/completion.h"

#include "framework/command_path.h"

#include <algorithm>
#include <set>

namespace {

enum class Next { firstWord, laterWord, path };

/// What can follow at `node`. Not all words of a tree can be typed.
std::set<std::string> wordsAt(const CommandBase& node, Next next) {
  std::set<std::string> words = node.getWords();
  std::erase_if(words, [&](const std::string& word) {
    return word == "--" || splitAtWhiteSpace(word) != std::list<std::string>{word} ||
           (next == Next::path &&
            (!node.isValidSubCommand(word) || word.find('/') != std::string::npos));
  });
  if (next != Next::path) {
    words.insert({"cd", "help"});
  }
  if (next == Next::firstWord) {
    words.insert({"quit", "exit"});
  }
  if (next != Next::laterWord && !node.getParent().expired()) {
    words.insert(next == Next::path ? ".." : "back");
  }
  return words;
}

}  // namespace

Completions completeLine(const std::shared_ptr<CommandBase>& promptNode, const std::string& text) {
  auto typed = text.substr(text.find_last_of(" \t\n\v\f\r") + 1);
  auto words = splitAtWhiteSpace(text.substr(0, text.size() - typed.size()));
  words.erase(words.begin(), std::find(words.rbegin(), words.rend(), "--").base());
  auto node = promptNode;  // Null behind the words of a handler, and of nothing.
  auto next = Next::firstWord;
  for (const auto& word : words) {
    if (next != Next::path && word == "cd") {
      next = Next::path;
    } else {
      const bool ends = !node || next == Next::path || node->isValidCommand(word);
      node = ends ? nullptr : node->getSubCommandObj(word);
      next = Next::laterWord;
    }
  }
  if (node && next == Next::path) {
    const auto pathEnd = typed.rfind('/') + 1;  // 0 without a slash.
    node = followPath(node, typed.substr(0, pathEnd)) ? node : nullptr;
    typed.erase(0, pathEnd);
  }
  Completions completions{typed.size(), {}};
  for (const auto& word : node ? wordsAt(*node, next) : std::set<std::string>()) {
    if (word.starts_with(typed)) {
      completions.words.push_back(word + (next == Next::path ? "/" : " "));
    }
  }
  return completions;
}
