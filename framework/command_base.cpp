#include "framework/command_base.h"

#include <algorithm>
#include <utility>

CommandBase::CommandBase(std::string nodeName, std::weak_ptr<CommandBase> parentNode)
    : parent(std::move(parentNode)), name(std::move(nodeName)) {}

CommandBase::~CommandBase() = default;

void CommandBase::init() {
  // Held to the end: the children that are registered below find their grandparents alive.
  const auto liveParent = parent.lock();
  if (liveParent) {
    hierarchyPath = liveParent->getHierarchy();
  }
  hierarchyPath += "/" + name;
  registerCommands();
}

bool CommandBase::isAllowed(std::string /*word*/) {
  return true;
}

bool CommandBase::execCommand(std::string word, std::list<std::string> args) {
  const auto found = handlers.find(word);
  const auto group = WorkGroup::create();
  if (found == handlers.end() || !group) {
    return false;
  }
  const bool result = found->second(group, std::move(args));
  group.wait();
  return result;
}

void CommandBase::addCommandHandler(std::string word, CommandHandler handler, std::string help) {
  if (!handler) {
    return;
  }
  handlers[word] = std::move(handler);
  if (!help.empty()) {
    helpTexts[word] = std::move(help);
  }
}

void CommandBase::addWordCompleter(std::string word, WordCompleter completer) {
  completers[word] = std::move(completer);
}

void CommandBase::addSubCommand(std::string word, std::shared_ptr<CommandBase> child) {
  if (child) {
    subCommands[word] = std::move(child);
  }
}

std::shared_ptr<CommandBase> CommandBase::getSubCommandObj(std::string word) const {
  const auto found = subCommands.find(word);
  return found == subCommands.end() ? nullptr : found->second;
}

bool CommandBase::isValidSubCommand(std::string word) const {
  return subCommands.contains(word);
}

bool CommandBase::isValidCommand(std::string word) const {
  return handlers.contains(word);
}

std::set<std::string> CommandBase::getWords() const {
  std::set<std::string> words;
  const auto add = [&](const auto& entry) { words.insert(entry.first); };
  std::for_each(handlers.begin(), handlers.end(), add);
  std::for_each(subCommands.begin(), subCommands.end(), add);
  return words;
}

WordCompleter CommandBase::getWordCompleter(std::string word) const {
  return completers.contains(word) ? completers.at(word) : nullptr;
}

std::string CommandBase::getHierarchy() const {
  return hierarchyPath;
}

std::weak_ptr<CommandBase> CommandBase::getParent() const {
  return parent;
}
