#include "framework/completion.h"

#include "framework/command_path.h"

#include <algorithm>
#include <set>

namespace {

enum class Next { firstWord, laterWord, path };

/// Whether `word` can be typed as one word and does nothing to a terminal: no C0 and C1 controls.
bool canBeTyped(const std::string& word) {
  const auto isControl = [](unsigned char byte) { return byte <= ' ' || byte == 0x7F; };
  const auto beginsC1 = [](unsigned char byte, unsigned char next) {
    return byte == 0xC2 && next < 0xA0;
  };
  return !word.empty() && std::ranges::none_of(word, isControl) &&
         std::ranges::adjacent_find(word, beginsC1) == word.end();
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
  const bool hasParent = !node.getParent().expired();
  if (next == Next::firstWord && hasParent) {
    words.insert("back");
  }
  // On its own it would lead back to where the path came from.
  if (next == Next::path && hasParent && (typed.starts_with('.') || words.size() > 1)) {
    words.insert("..");
  }
  return words;
}

/// Those of `words` that `typed` begins, behind its last slash; `end` ends those that do not go on.
Completions offer(const std::set<std::string>& words, const std::string& typed, char end) {
  const auto pathEnd = typed.rfind('/') + 1;  // 0 without a slash.
  Completions completions{typed.size() - pathEnd, {}};
  for (const auto& word : words) {
    if (word.starts_with(typed) && canBeTyped(word)) {
      completions.words.push_back(word.substr(pathEnd) +
                                  std::string(word.ends_with('/') ? 0 : 1, end));
    }
  }
  return completions;
}

}  // namespace

Completions completeLine(const std::shared_ptr<CommandBase>& promptNode, const std::string& text) {
  auto typed = text.substr(text.find_last_of(" \t\n\v\f\r") + 1);
  auto words = splitAtWhiteSpace(text.substr(0, text.size() - typed.size()));
  words.erase(words.begin(), std::find(words.rbegin(), words.rend(), "--").base());
  auto node = promptNode;  // Null behind a path, and behind what is none.
  auto next = Next::firstWord;
  for (auto word = words.begin(); word != words.end() && node; ++word) {
    if (next == Next::path) {
      node = nullptr;
    } else if (*word == "cd") {
      next = Next::path;
    } else if (node->isValidCommand(*word)) {
      return offer(node->completeWord(*word, {std::next(word), words.end()}, typed), typed, ' ');
    } else {
      node = node->getSubCommandObj(*word);
      next = Next::laterWord;
    }
  }
  if (node && next == Next::path) {
    const auto pathEnd = typed.rfind('/') + 1;
    node = followPath(node, typed.substr(0, pathEnd)) ? node : nullptr;
    typed.erase(0, pathEnd);
  }
  return node ? offer(wordsAt(*node, next, typed), typed, next == Next::path ? '/' : ' ')
              : Completions{typed.size(), {}};
}
