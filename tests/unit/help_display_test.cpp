#include "tests/unit/console.h"
#include "tests/unit/plain_node.h"

#include <gtest/gtest.h>

TEST(HelpDisplay, ShowsHandlersThenSubCommandsThenBuiltIns) {
  const auto node = PlainNode::create("n", {}, [](PlainNode& top) {
    top.addHandlers({"tel", "abc", "Zed", "\xC3\xA4"}, "[text] <|");
    top.addHandlers({"tel", "stat"});
    top.addHandlers({"abc"}, "newer");
    top.addChild("route", [](PlainNode& route) {
      route.addHandlers({"del", "add"}, "not shown");
      route.addChild("cache", [](PlainNode& cache) { cache.addHandlers({"flush"}); });
      // A node without handlers is passed over, but not what is below.
      route.addChild("top", [](PlainNode& passedOver) {
        passedOver.addChild("page", [](PlainNode& page) { page.addHandlers({"drop"}); });
      });
    });
    top.addChild("a_name_of_more_than_16", [](PlainNode& child) { child.addHandlers({"x|]"}); });
  });
  const Console console;
  node->displayHelp();
  EXPECT_EQ(console.output(),
            "\nOptions for command '\x1b[32mn\x1b[39m':\n\n"
            "\t             Zed  -  [text] <|\n\n"
            "\t             abc  -  newer\n\n"
            "\t            stat  -  ...\n\n"
            "\t             tel  -  [text] <|\n\n"
            "\t              \xC3\xA4  -  [text] <|\n\n"
            "\ta_name_of_more_than_16  -  [x|]]\n\n"
            "\t           route  -  [add|del]\n"
            "\t                     <cache>  -  [flush]\n"
            "\t                                     <page>  -  [drop]\n\n"
            "\t              cd  -  <sub-command>\n"
            "\t            help\n\t            back\n\t            quit\n\n");
}
