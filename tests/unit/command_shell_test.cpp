#include "framework/command_shell.h"

#include "tests/unit/console.h"
#include "tests/unit/plain_node.h"

#include <gtest/gtest.h>

namespace {

/// A tree of two levels whose handlers write what they were called with: `ok`, `no` and `args` on
/// every level, `deep` below the root, `locked` refused everywhere.
void addHandlers(PlainNode& node) {
  for (const bool result : {true, false}) {
    node.addCommandHandler(
        result ? "ok" : "no",
        [result](const WorkGroup&, const std::list<std::string>& args) {
          std::cout << (result ? "ok" : "no");
          for (const auto& word : args) {
            std::cout << "," << word;
          }
          std::cout << std::endl;
          return result;
        },
        "");
  }
  node.addCommandHandler("locked", handlerThatGives(true), "");
  node.refusedWord = "locked";
}

class TestShell : public CommandShell {
  std::shared_ptr<CommandBase> createRootCommand() override {
    return PlainNode::create("t", {}, [](PlainNode& root) {
      addHandlers(root);
      root.addChild("deep", [](PlainNode& deep) { addHandlers(deep); });
      root.addChild("locked", [](PlainNode& locked) { addHandlers(locked); });
      root.addCommandHandler("locked", nullptr, "");
    });
  }
};

class ShellWithoutTree : public CommandShell {
  std::shared_ptr<CommandBase> createRootCommand() override { return nullptr; }
};

/// The help that a node of the tree shows.
std::string helpOf(const std::string& name) {
  const bool root = name == "t";
  return "\nOptions for command '\x1b[32m" + name +
         "\x1b[39m':\n\n"
         "\t          locked  -  ...\n\n"
         "\t              no  -  ...\n\n"
         "\t              ok  -  ...\n\n" +
         (root ? "\t            deep  -  [locked|no|ok]\n\n"
                 "\t          locked  -  [locked|no|ok]\n\n"
               : "") +
         "\t              cd  -  <sub-command>\n"
         "\t            help\n"
         "\t            back\n"
         "\t            quit\n\n";
}

std::string invalid(const std::string& word, const std::string& node) {
  return "\nInvalid command option '\x1b[31m" + word + "\x1b[39m'" + helpOf(node);
}

struct Case {
  std::list<std::string> words;
  std::string output;
  bool result;
};

}  // namespace

TEST(CommandShell, RunsTheWordsOfACommandLine) {
  const Case cases[] = {
      {{"--"}, "", true},
      {{"ok"}, "ok\n", true},
      {{"no"}, "no\n", false},
      {{"deep", "ok", "a", "", "cd", "help"}, "ok,a,,cd,help\n", true},
      {{"ok", "1", "--", "no", "2", "--", "ok", "3"}, "ok,1\nno,2\n", false},
      {{"--", "ok", "--", "--", "deep", "ok", "--"}, "ok\nok\n", true},
      {{"ok", "---"}, "ok,---\n", true},
      {{"help"}, helpOf("t"), true},
      {{"deep", "help"}, helpOf("deep"), true},
      {{"help", "deep"}, invalid("help", "t"), false},
      {{"deep"}, helpOf("deep"), false},
      {{"nosuch"}, invalid("nosuch", "t"), false},
      {{"OK"}, invalid("OK", "t"), false},
      {{""}, invalid("", "t"), false},
      {{"deep", "nosuch", "ok"}, invalid("nosuch", "deep"), false},
      {{"deep", "quit"}, invalid("quit", "deep"), false},
      {{"quit", "now"}, invalid("quit", "t"), false},
      {{"quit", "--", "ok"}, "", true},
      {{"ok", "--", "exit", "--", "no"}, "ok\n", true},
      {{"back", "--", "ok"}, "ok\n", true},
      {{"locked"}, "", false},
      {{"deep", "locked", "--", "ok"}, "", false},
      {{"cd"}, helpOf("t"), false},
      {{"cd", "deep", "ok"}, helpOf("t"), false},
      {{"deep", "cd", "nosuch"}, helpOf("deep"), false},
      {{"cd", "deep", "--", "nosuch"}, invalid("nosuch", "t"), false},
      {{"cd", "deep/nosuch"}, helpOf("deep"), false},
      {{"cd", "//deep//../locked/.././.."}, helpOf("t"), false},
      {{"cd", "..//deep/../../locked/", "--", "cd", "///", "--", "ok"}, "ok\n", true},
  };
  for (auto testCase : cases) {
    std::string line;
    for (const auto& word : testCase.words) {
      line += "'" + word + "' ";
    }
    SCOPED_TRACE(line);
    testCase.words.push_front("t");
    const Console console;
    EXPECT_EQ(TestShell().run(testCase.words), testCase.result);
    EXPECT_EQ(console.output(), testCase.output);
    EXPECT_EQ(console.errors(), "");
  }
}

TEST(CommandShell, ReadsLinesUntilTheUserLeaves) {
  const struct {
    std::string input;
    std::string output;
    bool result;
  } cases[] = {
      {"", "(/t)>> ", false},
      {"quit\nok\n", "(/t)>> ", true},
      {"\n \t\v\f\r\n--\nexit", "(/t)>> (/t)>> (/t)>> (/t)>> ", true},
      {"ok last line", "(/t)>> ok,last,line\n(/t)>> ", false},
      {"  ok\ta  b\r\n", "(/t)>> ok,a,b\n(/t)>> ", false},
      {"ok \"a b\" c\\ d\n", "(/t)>> ok,\"a,b\",c\\,d\n(/t)>> ", false},
      {"no -- ok\nok 1 -- ok 2\n", "(/t)>> no\n(/t)>> ok,1\nok,2\n(/t)>> ", false},
      {"ok -- quit -- ok\n", "(/t)>> ok\n", true},
      {"cd deep\nok\nback\nback\nquit\n", "(/t)>> (/t/deep)>> ok\n(/t/deep)>> (/t)>> (/t)>> ",
       true},
      {"cd deep/nosuch\nquit\n", "(/t)>> " + helpOf("deep") + "(/t)>> ", true},
      {"cd locked\ncd ../deep -- ok x -- cd ..\nquit\n", "(/t)>> (/t/locked)>> ok,x\n(/t)>> ",
       true},
      {"deep\ndeep back\nquit\n",
       "(/t)>> " + helpOf("deep") + "(/t)>> " + invalid("back", "deep") + "(/t)>> ", true},
      {std::string("ok a\0b\n", 7), std::string("(/t)>> ok,a\0b\n(/t)>> ", 21), false},
  };
  for (const auto& [input, output, result] : cases) {
    SCOPED_TRACE(input);
    const Console console(input);
    EXPECT_EQ(TestShell().run({"t"}), result);
    EXPECT_EQ(console.output(), output);
  }
}

TEST(CommandShell, ReadsLinesForAnEmptyArgumentList) {
  const Console console("quit\n");
  EXPECT_TRUE(TestShell().run({}));
  EXPECT_EQ(console.output(), "(/t)>> ");
}

TEST(CommandShell, FailsSilentlyWithoutATree) {
  const Console console("ok\n");
  EXPECT_FALSE(ShellWithoutTree().run({"t"}));
  EXPECT_EQ(console.output(), "");
}

TEST(CommandShell, TakesTheArgumentVectorAsItIs) {
  std::string words[] = {"/usr/bin/t", "", " a b ", "--"};
  char* vector[] = {words[0].data(), words[1].data(), words[2].data(), words[3].data(), nullptr};
  EXPECT_EQ(CommandShell::convertCmdArgsToList(4, vector),
            (std::list<std::string>{"/usr/bin/t", "", " a b ", "--"}));
  EXPECT_TRUE(CommandShell::convertCmdArgsToList(0, vector).empty());
  EXPECT_TRUE(CommandShell::convertCmdArgsToList(-1, nullptr).empty());
}
