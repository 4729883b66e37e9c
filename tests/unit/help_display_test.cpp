#include "tests/unit/console.h"
#include "tests/unit/plain_node.h"

#include <gtest/gtest.h>

namespace {

std::string helpOf(const std::shared_ptr<PlainNode>& node) {
  const Console console;
  node->displayHelp();
  return console.output();
}

std::string header(const std::string& name) {
  return "\nOptions for command '\x1b[32m" + name + "\x1b[39m':\n\n";
}

constexpr const char* kBuiltIns =
    "\t              cd  -  <sub-command>\n"
    "\t            help\n"
    "\t            back\n"
    "\t            quit\n"
    "\n";

}  // namespace

TEST(HelpDisplay, ShowsHandlersThenSubCommandsThenBuiltIns) {
  const auto node = PlainNode::create("net", {}, [](PlainNode& self) {
    self.addCommandHandler("stat", handlerThatGives(true), "");
    self.addCommandHandler("ping", handlerThatGives(true), "[count] send <probes>|");
    self.addChild("route", [](PlainNode& route) {
      route.addCommandHandler("del", handlerThatGives(true), "not shown");
      route.addCommandHandler("add", handlerThatGives(true), "not shown");
      route.addChild("cache", [](PlainNode& cache) {
        cache.addCommandHandler("flush", handlerThatGives(true), "");
      });
    });
  });
  EXPECT_EQ(helpOf(node), header("net") +
                              "\t            ping  -  [count] send <probes>|\n"
                              "\n"
                              "\t            stat  -  ...\n"
                              "\n"
                              "\t           route  -  [add|del]\n"
                              "\t                     <cache>  -  [flush]\n"
                              "\n" +
                              kBuiltIns);
}

TEST(HelpDisplay, PassesOverNodesWithoutHandlersButNotWhatIsBelow) {
  const auto node = PlainNode::create("top", {}, [](PlainNode& top) {
    top.addChild("mid", [](PlainNode& mid) {
      mid.addChild("leaf", [](PlainNode& leaf) {
        leaf.addCommandHandler("go", handlerThatGives(true), "");
      });
    });
  });
  EXPECT_EQ(helpOf(node), header("top") + "\t                     <leaf>  -  [go]\n\n" + kBuiltIns);
  EXPECT_EQ(helpOf(PlainNode::create("empty", {})), header("empty") + kBuiltIns);
}

TEST(HelpDisplay, SortsByBytesAndCutsNothing) {
  const auto node = PlainNode::create("n", {}, [](PlainNode& self) {
    for (const auto* word : {"telx", "tel", "abc", "Zed", "a_word_of_16_chr", "\xC3\xA4"}) {
      self.addCommandHandler(word, handlerThatGives(true), "text");
    }
    self.addCommandHandler("tel", handlerThatGives(true), "");
    self.addCommandHandler("abc", handlerThatGives(true), "newer");
    self.addChild("a_name_of_more_than_16", [](PlainNode& child) {
      child.addCommandHandler("x|]", handlerThatGives(true), "");
    });
  });
  EXPECT_EQ(helpOf(node), header("n") +
                              "\t             Zed  -  text\n\n"
                              "\ta_word_of_16_chr  -  text\n\n"
                              "\t             abc  -  newer\n\n"
                              "\t             tel  -  text\n\n"
                              "\t            telx  -  text\n\n"
                              "\t              \xC3\xA4  -  text\n\n"
                              "\ta_name_of_more_than_16  -  [x|]]\n"
                              "\n" +
                              kBuiltIns);
}
