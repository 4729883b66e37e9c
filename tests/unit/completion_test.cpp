#include "framework/completion.h"

#include "tests/unit/plain_node.h"

#include <gtest/gtest.h>

TEST(Completion, OffersWhatTheShellKnows) {
  const auto root = PlainNode::create("t", {}, [](PlainNode& top) {
    top.addHandlers({"tel", "two words", "", "--", "both", "a/b", "back"});
    for (const auto* name : {"deep", "a/b", "both"}) {
      top.addChild(name, [](PlainNode& node) {
        node.addHandlers({"telx", "tel", "locked", "g\xff"});
        node.addChild("route", [](PlainNode&) {});
        node.addWordCompleter("tel", [](const auto& before, const std::string& typed) {
          const auto first = before.empty() ? "" : before.front();
          return std::set<std::string>{typed + "x/", first + typed, "two words", "\x1b",
                                       "\u009b2J"};
        });
      });
    }
  });
  const auto deep = root->getSubCommandObj("deep");
  const std::string builtIn = "exit help ", atRoot = "a/b back both cd deep ";
  const struct {
    std::string nodeName, text, words;
    std::size_t typed = 0;
  } cases[] = {
      {"t", "", atRoot + builtIn + "quit tel "},
      {"deep", "", "back cd exit g\xff help locked quit route tel telx "},
      {"deep", " \t te", "tel telx ", 2},
      {"t", "deep ", "cd g\xff help locked route tel telx "},
      {"t", "deep route q", "", 1},
      {"t", "tel ", ""},
      {"t", "both ", ""},
      {"t", "tel -- nosuch -- deep t", "tel telx ", 1},
      {"t", "nosuch deep -- ", atRoot + builtIn + "quit tel "},
      {"t", "cd ", "both/ deep/ "},
      {"deep", "cd ", "route/ "},
      {"deep", "cd .", "../ ", 1},
      {"t", "cd deep/route/", ""},
      {"t", "cd ../", "both/ deep/ "},
      {"t", "cd deep/../b", "both/ ", 1},
      {"t", "cd deep/nosuch/", ""},
      {"t", "deep cd ", "route/ "},
      {"t", "deep tel a-", "a- a-x/ ", 2},
      {"t", "deep tel f/ oo f/o", "ox/ ", 1},
      {"t", "cd deep ", ""},
      {"t", "cd cd ", ""},
  };
  for (const auto& [nodeName, text, words, typed] : cases) {
    const auto completions = completeLine(nodeName == "t" ? root : deep, text);
    std::string offered;
    for (const auto& word : completions.words) {
      offered += word + " ";
    }
    EXPECT_EQ(offered, words) << nodeName << ": " << text;
    EXPECT_TRUE(words.empty() || completions.typed == typed) << nodeName << ": " << text;
  }
}
