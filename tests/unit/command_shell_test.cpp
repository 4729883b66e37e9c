#include "framework/command_shell.h"

#include "tests/help_text.h"
#include "tests/unit/console.h"
#include "tests/unit/plain_node.h"

#include <gtest/gtest.h>

namespace {

class ShellWithoutTree : public CommandShell {
  std::shared_ptr<CommandBase> createRootCommand() override { return nullptr; }
};

/// A shell over a tree of two levels; "locked" is not allowed, and "odd" has built-in words.
class TestShell : public CommandShell {
  std::shared_ptr<CommandBase> createRootCommand() override {
    return PlainNode::create("t", {}, [](PlainNode& root) {
      root.addHandlers({"ok", "no"});
      for (const auto* name : {"deep", "locked", "no"}) {
        root.addChild(name, [](PlainNode& node) { node.addHandlers({"ok", "no", "locked"}); });
      }
      root.addChild("odd", [](PlainNode& node) { node.addHandlers({"cd", "help", "back"}); });
    });
  }
};

/// The help that a node of the tree shows.
std::string helpOf(const std::string& name) {
  const std::string both = "\t              no  -  ...\n\n\t              ok  -  ...\n\n";
  return helpText(name, name != "t" ? "\t          locked  -  ...\n\n" + both
                                    : both +
                                          "\t            deep  -  [locked|no|ok]\n\n"
                                          "\t          locked  -  [locked|no|ok]\n\n"
                                          "\t              no  -  [locked|no|ok]\n\n"
                                          "\t             odd  -  [back|cd|help]\n\n");
}

std::string invalid(const std::string& word, const std::string& node) {
  return "\nInvalid command option '\x1b[31m" + word + "\x1b[39m'" + helpOf(node);
}

void expectRun(std::list<std::string> words, const std::string& input, const std::string& output,
               bool result) {
  SCOPED_TRACE(testing::PrintToString(words) + input);
  words.push_front("t");
  const Console console(input);
  EXPECT_EQ(TestShell().run(words), result);
  EXPECT_EQ(console.output(), output);
  EXPECT_EQ(console.errors(), "");
}

}  // namespace

TEST(CommandShell, RunsTheWordsOfACommandLine) {
  // clang-format off
  expectRun({"--"}, "", "", true);
  expectRun({"no"}, "", "no\n", false);
  expectRun({"deep", "ok", "a", "", "cd", "help"}, "", "ok,a,,cd,help\n", true);
  expectRun({"--", "ok", "1", "--", "--", "deep", "no", "---", "--", "ok"}, "",
            "ok,1\nno,---\n", false);
  expectRun({"help", "--", "ok", "--"}, "", helpOf("t") + "ok\n", true);
  expectRun({"deep", "help"}, "", helpOf("deep"), true);
  expectRun({"help", "deep"}, "", invalid("help", "t"), false);
  expectRun({"deep"}, "", helpOf("deep"), false);
  expectRun({""}, "", invalid("", "t"), false);
  expectRun({"deep", "nosuch", "ok"}, "", invalid("nosuch", "deep"), false);
  expectRun({"deep", "quit"}, "", invalid("quit", "deep"), false);
  expectRun({"quit", "now"}, "", invalid("quit", "t"), false);
  expectRun({"quit", "--", "ok"}, "", "", true);
  expectRun({"ok", "--", "exit", "--", "no"}, "", "ok\n", true);
  expectRun({"back", "--", "ok"}, "", "ok\n", true);
  expectRun({"locked", "ok"}, "", "", false);
  expectRun({"deep", "locked", "--", "ok"}, "", "", false);
  expectRun({"cd"}, "", helpOf("t"), false);
  expectRun({"cd", "deep", "ok"}, "", helpOf("t"), false);
  expectRun({"deep", "cd", "nosuch"}, "", helpOf("deep"), false);
  expectRun({"cd", "deep", "--", "nosuch"}, "", invalid("nosuch", "t"), false);
  expectRun({"cd", "deep/nosuch"}, "", helpOf("deep"), false);
  expectRun({"cd", "//deep//../locked/.././.."}, "", helpOf("t"), false);
  expectRun({"cd", "..//deep/../../locked/", "--", "cd", "///", "--", "ok"}, "", "ok\n", true);
  // A handler wins over the built-in word, but for "cd".
  expectRun({"odd", "help", "--", "odd", "back"}, "", "help\nback\n", true);
  expectRun({"odd", "cd", "..", "--", "ok"}, "", "ok\n", true);
  // clang-format on
}

TEST(CommandShell, ReadsLinesUntilTheUserLeaves) {
  // clang-format off
  const std::string p = "(/t)>> ";
  expectRun({}, "", p, false);
  expectRun({}, "quit\nok\n", p, true);
  expectRun({}, "\n \t\v\f\r\n--\nexit", p + p + p + p, true);
  expectRun({}, "  ok\ta  \"b c\\ d\"\r\nok last line",
            p + "ok,a,\"b,c\\,d\"\n" + p + "ok,last,line\n" + p, false);
  expectRun({}, "no -- ok\nok 1 -- quit -- ok\n", p + "no\n" + p + "ok,1\n", true);
  expectRun({}, "cd deep\nok\nback\nback\nquit\n",
            p + "(/t/deep)>> ok\n(/t/deep)>> " + p + p, true);
  expectRun({}, "cd deep/nosuch\nquit\n", p + helpOf("deep") + p, true);
  expectRun({}, "cd locked\ncd ../deep -- ok x -- cd ..\nquit\n",
            p + "(/t/locked)>> ok,x\n" + p, true);
  expectRun({}, "deep\ndeep back\nquit\n",
            p + helpOf("deep") + p + invalid("back", "deep") + p, true);
  expectRun({}, std::string("ok a\0b\n", 7), p + std::string("ok,a\0b\n", 7) + p, false);
  // clang-format on
}

TEST(CommandShell, ReadsLinesForAnEmptyArgumentListButNoneWithoutATree) {
  const Console console("quit\n");
  EXPECT_FALSE(ShellWithoutTree().run({}));
  EXPECT_EQ(console.output(), "");
  EXPECT_TRUE(TestShell().run({}));
  EXPECT_EQ(console.output(), "(/t)>> ");
}

TEST(CommandShell, TakesTheArgumentVectorAsItIs) {
  const std::list<std::string> words = {"/usr/bin/t", "", " a b ", "--"};
  std::vector<char*> vector;
  for (const auto& word : words) {
    vector.push_back(const_cast<char*>(word.c_str()));
  }
  EXPECT_EQ(CommandShell::convertCmdArgsToList(4, vector.data()), words);
  EXPECT_TRUE(CommandShell::convertCmdArgsToList(0, nullptr).empty());
  EXPECT_TRUE(CommandShell::convertCmdArgsToList(-1, nullptr).empty());
}
