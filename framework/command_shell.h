#pragma once

#include "framework/command_base.h"

#include <list>
#include <memory>
#include <string>
#include <vector>

/// Turns words into calls on a command tree: those of the process's command line, once, or those of
/// the lines of standard input, until the user leaves. All operations run on the thread that calls
/// `run`.
class CommandShell {
 public:
  CommandShell() = default;
  CommandShell(const CommandShell&) = delete;
  CommandShell& operator=(const CommandShell&) = delete;
  virtual ~CommandShell();

  /// The `count` words of an argument vector, the program's name first, each copied whole. A count
  /// below 1 gives none.
  static std::list<std::string> convertCmdArgsToList(int count, char* const* words);

  /// Runs the command line `words`, the program's name first. With more words than that they are
  /// executed as commands separated by "--", up to the first that fails; the result tells whether
  /// none did. Otherwise reads commands from standard input with a prompt on standard output; the
  /// result tells whether the user left with "quit" or "exit". False when there is no tree, and
  /// when standard output fails: nothing more is executed then.
  bool run(std::list<std::string> words);

 private:
  enum class GroupEnd { succeeded, failed, leave };

  /// Builds the whole tree and gives its root; empty when there is no tree. Called once by `run`.
  virtual std::shared_ptr<CommandBase> createRootCommand() = 0;

  static std::vector<std::list<std::string>> splitCommandGroups(
      const std::list<std::string>& words);
  GroupEnd executeGroups(const std::vector<std::list<std::string>>& groups);
  GroupEnd executeGroup(std::list<std::string> words);
  bool changeNode(const std::list<std::string>& operands);
  void goBack();
  void showInvalidWord(const std::string& word);
  bool readInteractively();

  std::shared_ptr<CommandBase> rootNode;
  std::shared_ptr<CommandBase> promptNode;
  std::shared_ptr<CommandBase> currentNode;
};
