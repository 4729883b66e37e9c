#pragma once

#include "framework/command_base.h"

#include <functional>
#include <memory>
#include <string>
#include <utility>

/// A node for trees of the tests' own: `fill` registers what it holds.
class PlainNode : public CommandBase {
 public:
  using Fill = std::function<void(PlainNode&)>;

  static std::shared_ptr<PlainNode> create(const std::string& nodeName,
                                           const std::weak_ptr<CommandBase>& parentNode,
                                           Fill contents = nullptr) {
    std::shared_ptr<PlainNode> node(new PlainNode(nodeName, parentNode, std::move(contents)));
    node->init();
    return node;
  }

  /// Adds a child of this node, made the way the tool makes its own.
  void addChild(const std::string& childName, Fill childFill = nullptr) {
    addSubCommand(childName, create(childName, weak_from_this(), std::move(childFill)));
  }

  bool isAllowed(std::string word) override { return word != refusedWord; }

  std::string refusedWord;

 private:
  PlainNode(const std::string& nodeName, const std::weak_ptr<CommandBase>& parentNode,
            Fill contents)
      : CommandBase(nodeName, parentNode), fill(std::move(contents)) {}

  void registerCommands() override {
    if (fill) {
      fill(*this);
    }
  }

  const Fill fill;
};

/// A handler that does nothing and has this result.
inline CommandHandler handlerThatGives(bool result) {
  return [result](const WorkGroup&, const std::list<std::string>&) { return result; };
}
