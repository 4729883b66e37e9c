#pragma once

#include "platform/work_group.h"

#include <functional>
#include <list>
#include <map>
#include <memory>
#include <set>
#include <string>

/// What a handler word runs. It receives the group that was made for this one call, to enter for
/// each piece of asynchronous work it starts, and its own copy of the words that followed its own.
/// Its result is the command's result. It runs on the shell thread.
using CommandHandler = std::function<bool(WorkGroup group, std::list<std::string> args)>;

/// Gives the words that can stand behind a handler's where one has been begun with `typed`,
/// `before` being those in between. A word that ends with a slash may go on behind it. On the shell
/// thread.
using WordCompleter = std::function<std::set<std::string>(const std::list<std::string>& before,
                                                          const std::string& typed)>;

/// A node of the command tree: a named group of handlers and of deeper nodes.
///
/// A node is made in two steps by its class's static `create`: constructed and handed to a
/// std::shared_ptr first, then initialised with `init`. A parent owns its children; a child refers
/// to its parent weakly. Words are matched whole and exactly. All operations run on the shell
/// thread, and none throws anything of its own.
class CommandBase : public std::enable_shared_from_this<CommandBase> {
 public:
  CommandBase(const CommandBase&) = delete;
  CommandBase& operator=(const CommandBase&) = delete;
  virtual ~CommandBase();

  /// Sets the hierarchy path from the parent's, then calls `registerCommands`. Called once, when a
  /// std::shared_ptr owns the node. A parent that is gone counts as none.
  virtual void init();

  /// Prints to standard output what can be typed at this node.
  virtual void displayHelp();

  /// Whether the handler or sub-command word `word` of this node may be used now. An override that
  /// says no has told the user why.
  virtual bool isAllowed(std::string word);

  /// Runs the handler registered under `word` with `args`, and waits without a time limit for the
  /// work that it started. Returns the handler's result; false, calling nothing, for a word that
  /// has no handler or when there is no memory for a group.
  bool execCommand(std::string word, std::list<std::string> args);

  /// Registers `handler` under `word`, in place of an earlier one, with `help` as its help text.
  /// An empty help text leaves an earlier one as it is. An empty handler registers nothing.
  void addCommandHandler(std::string word, CommandHandler handler, std::string help);

  /// Registers what completes the words behind the handler's word `word`, in place of an earlier
  /// one.
  void addWordCompleter(std::string word, WordCompleter completer);

  /// Registers `child`, which is initialised already, under `word`, in place of an earlier one. An
  /// empty child registers nothing.
  void addSubCommand(std::string word, std::shared_ptr<CommandBase> child);

  /// The child registered under `word`; empty when there is none.
  std::shared_ptr<CommandBase> getSubCommandObj(std::string word) const;

  /// Whether a child is registered under `word`.
  bool isValidSubCommand(std::string word) const;

  /// Whether a handler is registered under `word`.
  bool isValidCommand(std::string word) const;

  /// The words of all handlers and children.
  std::set<std::string> getWords() const;

  /// The completer registered under `word`; empty when there is none.
  WordCompleter getWordCompleter(std::string word) const;

  /// The names from the root to this node, each after a "/"; empty before `init`.
  std::string getHierarchy() const;

  /// The parent; empty for the root.
  std::weak_ptr<CommandBase> getParent() const;

 protected:
  /// A node that is not initialised yet.
  CommandBase(std::string nodeName, std::weak_ptr<CommandBase> parentNode);

 private:
  /// Registers the node's handlers, and creates and registers its children. Called by `init`.
  virtual void registerCommands() = 0;

  /// Prints the summary lines of `node` and of all nodes below it; `level` counts from 0 for a
  /// child of the node whose help is shown.
  static void displaySubCommand(const std::shared_ptr<CommandBase>& node, int level);

  std::weak_ptr<CommandBase> parent;
  std::string name;
  std::string hierarchyPath;
  std::map<std::string, CommandHandler> handlers;
  std::map<std::string, std::string> helpTexts;
  std::map<std::string, WordCompleter> completers;
  std::map<std::string, std::shared_ptr<CommandBase>> subCommands;
};
