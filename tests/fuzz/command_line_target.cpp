// The shell on a tree of any shape, beside a model of its rules.
//
// The first line of an input is the tree: "a/b/" is a node and "a/ok" a handler. Behind a "!"
// there, each further line is a word of a command line; else it is typed at the prompt.

#include "framework/command_shell.h"
#include "tests/fuzz/fuzz_target.h"
#include "tests/unit/console.h"
#include "tests/unit/plain_node.h"

#include <algorithm>

namespace {

using Node = std::shared_ptr<CommandBase>;
using Words = std::vector<std::string>;

enum class End { succeeded, failed, leave };

Node growTree(const Words& paths) {
  const auto root = PlainNode::create("t", {}, [](PlainNode&) {});
  for (const auto& path : paths) {
    auto node = root;
    auto names = split(path, "/");
    const auto handler = names.back();
    names.pop_back();
    for (const auto& name : names) {
      if (!node->isValidSubCommand(name)) {
        node->addChild(name, [](PlainNode&) {});
      }
      node = std::dynamic_pointer_cast<PlainNode>(node->getSubCommandObj(name));
    }
    if (!handler.empty()) {
      node->addHandlers({handler});
    }
  }
  return root;
}

class Shell : public CommandShell {
 public:
  explicit Shell(Node tree) : root(std::move(tree)) {}

 private:
  Node createRootCommand() override { return root; }

  Node root;
};

Node above(const Node& node) {
  const auto parent = node->getParent().lock();
  return parent ? parent : node;
}

// The model: each function does at `place` what the words say, and prints what the shell prints.

End runCd(Node& place, Node node, const Words& operands) {
  auto steps = split(operands.size() == 1 ? operands[0] : "?/?", "/ \t\n\v\f\r");
  std::erase(steps, "");
  for (const auto& step : steps) {
    const auto child = node->getSubCommandObj(step);
    if (operands.size() != 1 || (!child && step != "..")) {
      return node->displayHelp(), End::failed;
    }
    node = child ? child : above(node);
  }
  return place = node, End::succeeded;
}

End runGroup(Node& place, const Words& words) {
  Node node = place;
  for (auto at = words.begin(); at != words.end(); ++at) {
    const Words rest(at + 1, words.end());
    if (*at == "cd") {
      return runCd(place, node, rest);
    }
    const auto child = node->getSubCommandObj(*at);
    const bool locked = *at == "locked" && (child || node->isValidCommand(*at));
    if (locked || node->isValidCommand(*at)) {
      const bool result = !locked && node->execCommand(*at, {rest.begin(), rest.end()});
      return result ? End::succeeded : End::failed;
    }
    if (child && !rest.empty()) {
      node = child;
    } else if (child || (*at == "help" && rest.empty())) {
      (child ? child : node)->displayHelp();
      return child ? End::failed : End::succeeded;
    } else if (words.size() == 1 && (*at == "back" || *at == "quit" || *at == "exit")) {
      place = *at == "back" ? above(place) : place;
      return *at == "back" ? End::succeeded : End::leave;
    } else {
      std::cout << std::endl << "Invalid command option '\x1b[31m" << *at << "\x1b[39m'";
      return node->displayHelp(), End::failed;
    }
  }
  return End::succeeded;
}

/// With a prompt, `place` stays where a group has gone to.
End runGroups(Node& place, const Words& words, bool prompt) {
  auto end = End::succeeded;
  for (auto at = words.begin(); end == End::succeeded && at != words.end();) {
    const auto groupEnd = std::find(at, words.end(), "--");
    Node start = place;
    end = runGroup(prompt ? place : start, {at, groupEnd});
    at = groupEnd + (groupEnd == words.end() ? 0 : 1);
  }
  return end;
}

bool runLines(Node place, Words lines) {
  lines.resize(lines.size() + (lines.back().empty() ? 0 : 1));
  for (const auto& line : lines) {
    std::cout << "(" << place->getHierarchy() << ")>> ";
    auto words = split(line, " \t\v\f\r");
    std::erase(words, "");
    if (runGroups(place, words, true) == End::leave) {
      return true;
    }
  }
  return false;
}

}  // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string input(data, data + size);
  const auto end = std::min(input.find('\n'), input.size());
  const auto rest = input.substr(std::min(end + 1, input.size()));
  auto tree = growTree(split(input.substr(0, end), " !"));
  const bool typed = input.find('!') > end;
  auto lines = split(rest, "\n");

  const auto tell = [](bool result) { return result ? " true" : " false"; };
  const auto expected = [&] {
    const Console console;
    const bool result =
        typed ? runLines(tree, lines) : runGroups(tree, lines, false) != End::failed;
    return console.output() + tell(result);
  }();
  const Console console(rest);
  lines.insert(lines.begin(), "t");
  const bool result =
      Shell(tree).run(typed ? std::list<std::string>() : std::list(lines.begin(), lines.end()));
  requireEqual(console.output() + tell(result), expected);
  return 0;
}
