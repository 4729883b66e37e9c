#include "framework/command_shell.h"

#include "framework/command_path.h"
#include "framework/completion.h"
#include "framework/terminal_colour.h"
#include "platform/line_reader.h"

#include <iostream>
#include <utility>

CommandShell::~CommandShell() = default;

std::list<std::string> CommandShell::convertCmdArgsToList(int count, char* const* words) {
  return count < 1 ? std::list<std::string>() : std::list<std::string>(words, words + count);
}

bool CommandShell::run(std::list<std::string> words) {
  rootNode = createRootCommand();
  if (!rootNode) {
    return false;
  }
  currentNode = rootNode;
  if (!words.empty()) {
    words.pop_front();
  }
  if (words.empty()) {
    promptNode = rootNode;
    return readInteractively();
  }
  return executeGroups(splitCommandGroups(words)) != GroupEnd::failed;
}

bool CommandShell::readInteractively() {
  const auto complete = [this](const std::string& text) { return completeLine(promptNode, text); };
  while (const auto line = readLine("(" + promptNode->getHierarchy() + ")>> ", complete)) {
    if (executeGroups(splitCommandGroups(splitAtWhiteSpace(*line))) == GroupEnd::leave) {
      return true;
    }
  }
  return false;
}

std::vector<std::list<std::string>> CommandShell::splitCommandGroups(
    const std::list<std::string>& words) {
  std::vector<std::list<std::string>> groups;
  std::list<std::string> group;
  const auto closeGroup = [&] {
    if (!group.empty()) {
      groups.push_back(std::exchange(group, {}));
    }
  };
  for (const auto& word : words) {
    if (word == "--") {
      closeGroup();
    } else {
      group.push_back(word);
    }
  }
  closeGroup();
  return groups;
}

CommandShell::GroupEnd CommandShell::executeGroups(
    const std::vector<std::list<std::string>>& groups) {
  for (const auto& group : groups) {
    const auto end = executeGroup(group);
    currentNode = promptNode ? promptNode : rootNode;
    if (end != GroupEnd::succeeded) {
      return end;
    }
    // Nobody has seen what it did, nor would see what the next one does.
    if (!std::cout) {
      return GroupEnd::failed;
    }
  }
  return GroupEnd::succeeded;
}

CommandShell::GroupEnd CommandShell::executeGroup(std::list<std::string> words) {
  const auto endWith = [](bool result) { return result ? GroupEnd::succeeded : GroupEnd::failed; };
  const bool oneWord = words.size() == 1;
  while (!words.empty()) {
    const auto word = std::move(words.front());
    words.pop_front();
    const bool lastWord = words.empty();
    if (word == "cd") {
      return endWith(changeNode(words));
    }
    const bool isHandler = currentNode->isValidCommand(word);
    const auto child = currentNode->getSubCommandObj(word);
    if ((isHandler || child) && !currentNode->isAllowed(word)) {
      return GroupEnd::failed;
    }
    if (isHandler) {
      return endWith(currentNode->execCommand(word, std::move(words)));
    }
    if (child) {
      currentNode = child;
      if (lastWord) {
        currentNode->displayHelp();
        return GroupEnd::failed;
      }
      continue;
    }
    if (word == "help" && lastWord) {
      currentNode->displayHelp();
      return GroupEnd::succeeded;
    }
    if (word == "back" && oneWord) {
      goBack();
      return GroupEnd::succeeded;
    }
    if ((word == "quit" || word == "exit") && oneWord) {
      return GroupEnd::leave;
    }
    showInvalidWord(word);
    return GroupEnd::failed;
  }
  return GroupEnd::succeeded;
}

bool CommandShell::changeNode(const std::list<std::string>& operands) {
  if (operands.size() != 1 || !followPath(currentNode, operands.front())) {
    currentNode->displayHelp();
    return false;
  }
  if (promptNode) {
    promptNode = currentNode;
  }
  return true;
}

void CommandShell::goBack() {
  const auto parent = promptNode ? promptNode->getParent().lock() : nullptr;
  if (parent) {
    promptNode = parent;
  }
}

void CommandShell::showInvalidWord(const std::string& word) {
  std::cout << std::endl;
  std::cout << "Invalid command option '" << kRed << word << kDefaultColour << "'";
  currentNode->displayHelp();
}
