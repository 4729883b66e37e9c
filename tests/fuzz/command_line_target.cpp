// The shell on a tree of any shape, beside a model of its rules.
//
// The first line of an input is the tree: "ok" is a handler, and "a( ok )" a node that has one;
// there is none when it is empty. With a "!" before it, each further line is a word of a command
// line; else it is typed at the prompt.

#include "framework/command_shell.h"
#include "tests/fuzz/fuzz_target.h"
#include "tests/unit/console.h"
#include "tests/unit/plain_node.h"

#include <algorithm>
#include <optional>
#include <sstream>

namespace {

using Node = std::shared_ptr<CommandBase>;
using Words = std::vector<std::string>;
using End = std::optional<bool>;  // Of a group of words: its result, or none when it leaves.

struct Shell : CommandShell {
  Node createRootCommand() override { return root; }

  Node root;
};

void grow(PlainNode& node, std::istream& plan) {
  for (std::string word; plan >> word && word != ")";) {
    if (word.ends_with('(')) {
      word.pop_back();
      node.addChild(word, [&](PlainNode& child) { grow(child, plan); });
    } else {
      node.addHandlers({word});
    }
  }
}

Node above(const Node& node) {
  const auto parent = node->getParent().lock();
  return parent ? parent : node;
}

bool fail(const Node& node) {
  node->displayHelp();
  return false;
}

// The model. What is done goes on from `place`, which it may change.

bool runCd(Node& place, Node node, const std::list<std::string>& operands) {
  if (operands.size() != 1) {
    return fail(node);
  }
  for (const auto& step : split(operands.front(), "/ \t\n\v\f\r")) {
    const auto child = node->getSubCommandObj(step);
    if (!child && step != ".." && !step.empty()) {
      return fail(node);
    }
    node = step.empty() ? node : child ? child : above(node);
  }
  place = node;
  return true;
}

End runGroup(Node& place, const Words& words) {
  Node node = place;
  for (auto at = words.begin(); at != words.end(); ++at) {
    const std::list<std::string> rest(at + 1, words.end());
    const auto child = node->getSubCommandObj(*at);
    if (*at == "cd") {
      return runCd(place, node, rest);
    }
    if (node->isValidCommand(*at)) {
      return *at != "locked" && node->execCommand(*at, rest);
    }
    if (child && *at != "locked") {
      node = child;
    } else if (child) {
      return false;
    } else if (*at == "help" && rest.empty()) {
      return !fail(node);
    } else if (*at == "back" && words.size() == 1) {
      node = place = above(place);
    } else if ((*at == "quit" || *at == "exit") && words.size() == 1) {
      return std::nullopt;
    } else {
      std::cout << std::endl << "Invalid command option '\x1b[31m" << *at << "\x1b[39m'";
      return fail(node);
    }
  }
  return node == place || fail(node);
}

/// Only at a prompt does `place` stay where a group has gone.
End runGroups(Node& place, const Words& words, bool prompt) {
  End end = true;
  for (auto at = words.begin(); end == End(true) && at != words.end();) {
    const auto groupEnd = std::find(at, words.end(), "--");
    Node root = place;
    end = runGroup(prompt ? place : root, {at, groupEnd});
    at = groupEnd + (groupEnd == words.end() ? 0 : 1);
  }
  return end;
}

bool runLines(Node place) {
  End end = true;
  const auto prompt = [&] { return "(" + place->getHierarchy() + ")>> "; };
  for (std::string line; end && std::cout << prompt() && std::getline(std::cin, line);) {
    auto words = split(line, " \t\v\f\r");
    std::erase(words, "");
    end = runGroups(place, words, true);
  }
  return !end;
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string input(data, data + size);
  const auto first = split(input, "\n").front();
  const auto rest = input.substr(std::min(first.size() + 1, input.size()));
  const bool typed = !first.starts_with('!');
  std::istringstream plan(first.substr(typed ? 0 : 1));
  Shell shell;
  shell.root = PlainNode::create("t", {}, [&](PlainNode& root) { grow(root, plan); });
  const auto words = split(rest, "\n");
  auto arguments = CommandShell::convertCmdArgsToList(-1, nullptr);
  if (!typed) {
    arguments.assign(words.begin(), words.end());
    arguments.emplace_front("t");
  }

  const auto output = [&](auto run) {
    const Console console(rest);
    const bool result = run();
    return console.output() + (result ? "true" : "false");
  };
  const auto runModel = [&, place = shell.root]() mutable {
    return typed ? runLines(place) : runGroups(place, words, false).value_or(true);
  };
  requireEqual(output([&] { return shell.run(arguments); }), output(runModel));
  return 0;
}
