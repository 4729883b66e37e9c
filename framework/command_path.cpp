#include "framework/command_path.h"

#include <algorithm>
#include <sstream>

std::list<std::string> splitAtWhiteSpace(const std::string& text) {
  std::list<std::string> words;
  std::istringstream stream(text);
  for (std::string word; stream >> word;) {
    words.push_back(word);
  }
  return words;
}

bool followPath(std::shared_ptr<CommandBase>& node, std::string path) {
  std::replace(path.begin(), path.end(), '/', ' ');
  for (const auto& step : splitAtWhiteSpace(path)) {
    if (node->isValidSubCommand(step)) {
      node = node->getSubCommandObj(step);
    } else if (step != "..") {
      return false;
    } else if (const auto parent = node->getParent().lock()) {
      node = parent;
    }
  }
  return true;
}
