#include "framework/command_base.h"
#include "framework/terminal_colour.h"

#include <iomanip>
#include <iostream>

namespace {

constexpr int kFieldWidth = 16;
constexpr const char* kSeparator = "  -  ";
constexpr const char* kNoHelpText = "...";

/// Writes the start of a line: a tab and `word`, right-aligned in its field.
std::ostream& startLine(const std::string& word) {
  return std::cout << '\t' << std::right << std::setfill(' ') << std::setw(kFieldWidth) << word;
}

template <typename Handlers>
std::string listOfWords(const Handlers& handlers) {
  std::string list;
  for (const auto& [word, handler] : handlers) {
    list += (list.empty() ? "[" : "|") + word;
  }
  return list + "]";
}

}  // namespace

void CommandBase::displayHelp() {
  std::cout << std::endl;
  std::cout << "Options for command '" << kGreen << name << kDefaultColour << "':" << std::endl;
  std::cout << std::endl;
  for (const auto& [word, handler] : handlers) {
    const auto help = helpTexts.find(word);
    startLine(word) << kSeparator << (help == helpTexts.end() ? kNoHelpText : help->second)
                    << std::endl;
    std::cout << std::endl;
  }
  for (const auto& [word, child] : subCommands) {
    displaySubCommand(child, 0);
    std::cout << std::endl;
  }
  startLine("cd") << kSeparator << "<sub-command>" << std::endl;
  for (const auto* builtIn : {"help", "back", "quit"}) {
    startLine(builtIn) << std::endl;
  }
  std::cout << std::endl;
}

void CommandBase::displaySubCommand(const std::shared_ptr<CommandBase>& node, int level) {
  if (!node->handlers.empty()) {
    if (level == 0) {
      startLine(node->name);
    } else {
      const auto indent = static_cast<std::size_t>(level) * kFieldWidth;
      std::cout << '\t' << std::string(indent, ' ') << "     <" << node->name << '>';
    }
    std::cout << kSeparator << listOfWords(node->handlers) << std::endl;
  }
  for (const auto& [word, child] : node->subCommands) {
    displaySubCommand(child, level + 1);
  }
}
