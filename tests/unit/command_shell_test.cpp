#include "framework/command_shell.h"

#include "tests/unit/console.h"
#include "tests/unit/plain_node.h"

#include <gtest/gtest.h>

namespace {

class ShellWithoutTree : public CommandShell {
  std::shared_ptr<CommandBase> createRootCommand() override { return nullptr; }
};

/// A shell over a tree of two levels with the same handlers everywhere.
class TestShell : public CommandShell {
  std::shared_ptr<CommandBase> createRootCommand() override {
    const auto fill = [](PlainNode& node) { node.addHandlers({"ok", "no", "locked"}); };
    return PlainNode::create("t", {}, [&](PlainNode& root) {
      fill(root);
      root.addChild("deep", fill);
      root.addChild("locked", fill);
      root.addChild("no", fill);
    });
  }
};

/// The help that a node of the tree shows.
std::string helpOf(const std::string& name) {
  return "\nOptions for command '\x1b[32m" + name + "\x1b[39m':\n\n" +
         "\t          locked  -  ...\n\n"
         "\t              no  -  ...\n\n"
         "\t              ok  -  ...\n\n" +
         (name != "t" ? ""
                      : "\t            deep  -  [locked|no|ok]\n\n"
                        "\t          locked  -  [locked|no|ok]\n\n"
                        "\t              no  -  [locked|no|ok]\n\n") +
         "\t              cd  -  <sub-command>\n"
         "\t            help\n\t            back\n\t            quit\n\n";
}

std::string invalid(const std::string& word, const std::string& node) {
  return "\nInvalid command option '\x1b[31m" + word + "\x1b[39m'" + helpOf(node);
}

}  // namespace

// clang-format off

TEST(CommandShell, RunsTheWordsOfACommandLine) {
  const struct {
    std::list<std::string> words;
    std::string output;
    bool result;
  } cases[] = {
      {{"--"}, "", true},
      {{"no"}, "no\n", false},
      {{"deep", "ok", "a", "", "cd", "help"}, "ok,a,,cd,help\n", true},
      {{"--", "ok", "1", "--", "--", "deep", "no", "---", "--", "ok", "3"}, "ok,1\nno,---\n", false},
      {{"help", "--", "ok", "--"}, helpOf("t") + "ok\n", true},
      {{"deep", "help"}, helpOf("deep"), true},
      {{"help", "deep"}, invalid("help", "t"), false},
      {{"deep"}, helpOf("deep"), false},
      {{""}, invalid("", "t"), false},
      {{"deep", "nosuch", "ok"}, invalid("nosuch", "deep"), false},
      {{"deep", "quit"}, invalid("quit", "deep"), false},
      {{"quit", "now"}, invalid("quit", "t"), false},
      {{"quit", "--", "ok"}, "", true},
      {{"ok", "--", "exit", "--", "no"}, "ok\n", true},
      {{"back", "--", "ok"}, "ok\n", true},
      {{"locked", "ok"}, "", false},
      {{"deep", "locked", "--", "ok"}, "", false},
      {{"cd"}, helpOf("t"), false},
      {{"cd", "deep", "ok"}, helpOf("t"), false},
      {{"deep", "cd", "nosuch"}, helpOf("deep"), false},
      {{"cd", "deep", "--", "nosuch"}, invalid("nosuch", "t"), false},
      {{"cd", "deep/nosuch"}, helpOf("deep"), false},
      {{"cd", "//deep//../locked/.././.."}, helpOf("t"), false},
      {{"cd", "..//deep/../../locked/", "--", "cd", "///", "--", "ok"}, "ok\n", true},
  };
  for (auto [words, output, result] : cases) {
    SCOPED_TRACE(testing::PrintToString(words));
    words.push_front("t");
    const Console console;
    EXPECT_EQ(TestShell().run(words), result);
    EXPECT_EQ(console.output(), output);
    EXPECT_EQ(console.errors(), "");
  }
}

TEST(CommandShell, ReadsLinesUntilTheUserLeaves) {
  const std::string p = "(/t)>> ";
  const struct {
    std::string input;
    std::string output;
    bool result;
  } cases[] = {
      {"", p, false},
      {"quit\nok\n", p, true},
      {"\n \t\v\f\r\n--\nexit", p + p + p + p, true},
      {"  ok\ta  \"b c\\ d\"\r\nok last line", p + "ok,a,\"b,c\\,d\"\n" + p + "ok,last,line\n" + p, false},
      {"no -- ok\nok 1 -- quit -- ok\n", p + "no\n" + p + "ok,1\n", true},
      {"cd deep\nok\nback\nback\nquit\n", p + "(/t/deep)>> ok\n(/t/deep)>> " + p + p, true},
      {"cd deep/nosuch\nquit\n", p + helpOf("deep") + p, true},
      {"cd locked\ncd ../deep -- ok x -- cd ..\nquit\n", p + "(/t/locked)>> ok,x\n" + p, true},
      {"deep\ndeep back\nquit\n", p + helpOf("deep") + p + invalid("back", "deep") + p, true},
      {std::string("ok a\0b\n", 7), p + std::string("ok,a\0b\n", 7) + p, false},
  };
  for (const auto& [input, output, result] : cases) {
    SCOPED_TRACE(input);
    const Console console(input);
    EXPECT_EQ(TestShell().run({"t"}), result);
    EXPECT_EQ(console.output(), output);
  }
}

// clang-format on

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
