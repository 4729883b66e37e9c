#include "tests/help_text.h"
#include "tests/unit/console.h"
#include "tests/unit/plain_node.h"

#include <gtest/gtest.h>

TEST(HelpDisplay, ShowsHandlersThenSubCommandsThenBuiltIns) {
  const auto fill = [](PlainNode& node) {
    node.addHandlers({"telx", "tel", "abc", "Zed", "a_word_of_16_chr", "\xC3\xA4"}, "[text] <|");
    node.addHandlers({"tel"});
    node.addHandlers({"abc"}, "newer");
    node.addHandlers({"stat"});
    node.addChild("route", [](PlainNode& route) {
      route.addHandlers({"del", "add"}, "not shown");
      route.addChild("cache", [](PlainNode& cache) {
        cache.addHandlers({"flush"});
        cache.addChild("page", [](PlainNode& page) { page.addHandlers({"drop"}); });
      });
    });
    // A node without handlers is passed over, but not what is below.
    node.addChild("top", [](PlainNode& top) {
      top.addChild("leaf", [](PlainNode& leaf) { leaf.addHandlers({"go"}); });
    });
    node.addChild("a_name_of_more_than_16", [](PlainNode& child) { child.addHandlers({"x|]"}); });
  };
  const Console console;
  PlainNode::create("n", {}, fill)->displayHelp();
  PlainNode::create("empty", {}, [](PlainNode&) {})->displayHelp();
  const auto* entries =
      "\t             Zed  -  [text] <|\n\n"
      "\ta_word_of_16_chr  -  [text] <|\n\n"
      "\t             abc  -  newer\n\n"
      "\t            stat  -  ...\n\n"
      "\t             tel  -  [text] <|\n\n"
      "\t            telx  -  [text] <|\n\n"
      "\t              \xC3\xA4  -  [text] <|\n\n"
      "\ta_name_of_more_than_16  -  [x|]]\n\n"
      "\t           route  -  [add|del]\n"
      "\t                     <cache>  -  [flush]\n"
      "\t                                     <page>  -  [drop]\n\n"
      "\t                     <leaf>  -  [go]\n\n";
  EXPECT_EQ(console.output(), helpText("n", entries) + helpText("empty", ""));
}
