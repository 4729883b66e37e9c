#pragma once

#include "framework/command_base.h"

#include <functional>
#include <initializer_list>
#include <iostream>
#include <list>
#include <memory>
#include <string>

/// A node for trees of the tests' own: `fill` registers what it holds, once it is initialised.
class PlainNode : public CommandBase {
 public:
  using Fill = std::function<void(PlainNode&)>;

  static auto create(const std::string& nodeName, const std::weak_ptr<CommandBase>& parentNode,
                     const Fill& fill) {
    std::shared_ptr<PlainNode> node(new PlainNode(nodeName, parentNode));
    node->init();
    fill(*node);
    return node;
  }

  /// Adds a child of this node, made the way the tool makes its own.
  void addChild(const std::string& childName, const Fill& fill) {
    addSubCommand(childName, create(childName, weak_from_this(), fill));
  }

  /// Adds handlers that write their own word and what they were called with; only "no" fails.
  void addHandlers(std::initializer_list<std::string> words, const std::string& help = "") {
    for (const auto& word : words) {
      const auto handler = [word](const WorkGroup&, const std::list<std::string>& args) {
        std::cout << word;
        for (const auto& argument : args) {
          std::cout << "," << argument;
        }
        std::cout << std::endl;
        return word != "no";
      };
      addCommandHandler(word, handler, help);
    }
  }

  bool isAllowed(std::string word) override { return word != "locked"; }

 private:
  using CommandBase::CommandBase;

  void registerCommands() override {}
};
