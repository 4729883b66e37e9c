#include "tests/help_text.h"
#include "tests/unit/console.h"
#include "tests/unit/plain_node.h"

#include <gtest/gtest.h>

namespace {

/// That these are the entries in the help of a node of that content.
void expectHelp(const PlainNode::Fill& content, const std::string& entries) {
  const Console console;
  PlainNode::create("n", {}, content)->displayHelp();
  EXPECT_EQ(console.output(), helpText("n", entries));
}

}  // namespace

TEST(HelpDisplay, ShowsHandlersThenSubCommandsThenBuiltIns) {
  expectHelp([](PlainNode&) {}, "");
  expectHelp(
      [](PlainNode& node) {
        node.addHandlers({"stat"});
        node.addHandlers({"ping"}, "[count] send <probes>|");
        node.addChild("route", [](PlainNode& route) {
          route.addHandlers({"del", "add"}, "not shown");
          route.addChild("cache", [](PlainNode& cache) { cache.addHandlers({"flush"}); });
        });
        // A node without handlers is passed over, but not what is below.
        node.addChild("top", [](PlainNode& top) {
          top.addChild("leaf", [](PlainNode& leaf) { leaf.addHandlers({"go"}); });
        });
      },
      "\t            ping  -  [count] send <probes>|\n\n"
      "\t            stat  -  ...\n\n"
      "\t           route  -  [add|del]\n"
      "\t                     <cache>  -  [flush]\n\n"
      "\t                     <leaf>  -  [go]\n\n");
}

TEST(HelpDisplay, SortsByBytesAndCutsNothing) {
  expectHelp(
      [](PlainNode& node) {
        node.addHandlers({"telx", "tel", "abc", "Zed", "a_word_of_16_chr", "\xC3\xA4"}, "text");
        node.addHandlers({"tel"});
        node.addHandlers({"abc"}, "newer");
        node.addChild("a_name_of_more_than_16",
                      [](PlainNode& child) { child.addHandlers({"x|]"}); });
      },
      "\t             Zed  -  text\n\n"
      "\ta_word_of_16_chr  -  text\n\n"
      "\t             abc  -  newer\n\n"
      "\t             tel  -  text\n\n"
      "\t            telx  -  text\n\n"
      "\t              \xC3\xA4  -  text\n\n"
      "\ta_name_of_more_than_16  -  [x|]]\n\n");
}
