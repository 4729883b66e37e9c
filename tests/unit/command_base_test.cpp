#include "framework/command_base.h"

#include "tests/unit/plain_node.h"

#include <gtest/gtest.h>

#include <future>
#include <thread>

TEST(CommandBase, FindsWholeWordsOnly) {
  const auto node = PlainNode::create("root", {}, [](PlainNode& self) {
    self.addCommandHandler("tel", handlerThatGives(true), "");
    self.addChild("sub");
  });
  EXPECT_TRUE(node->isValidCommand("tel"));
  EXPECT_TRUE(node->isValidSubCommand("sub"));
  for (const auto* word : {"Tel", "te", "telx", "tel ", "", "sub"}) {
    EXPECT_FALSE(node->isValidCommand(word)) << word;
  }
  for (const auto* word : {"Sub", "su", "subs", "", "tel"}) {
    EXPECT_EQ(node->getSubCommandObj(word), nullptr) << word;
    EXPECT_FALSE(node->isValidSubCommand(word)) << word;
  }
}

TEST(CommandBase, RegistersNothingForAnEmptyHandlerOrChild) {
  const auto node = PlainNode::create("root", {});
  node->addCommandHandler("tel", nullptr, "help that must not show");
  node->addSubCommand("sub", nullptr);
  EXPECT_FALSE(node->isValidCommand("tel"));
  EXPECT_FALSE(node->isValidSubCommand("sub"));
}

TEST(CommandBase, ReplacesAHandlerOfTheSameWordAndReleasesIt) {
  const auto node = PlainNode::create("root", {});
  const auto token = std::make_shared<int>();
  node->addCommandHandler(
      "tel", [token](auto&&...) { return false; }, "");
  node->addCommandHandler("tel", handlerThatGives(true), "");
  EXPECT_TRUE(node->execCommand("tel", {}));
  EXPECT_EQ(token.use_count(), 1);
}

TEST(CommandBase, BuildsHierarchyPathsFromLiveParents) {
  std::string pathSeenByChild;
  const auto root = PlainNode::create("velltool", {}, [&](PlainNode& self) {
    self.addChild("logdump", [&](PlainNode& child) {
      pathSeenByChild = child.getHierarchy() + " below " + child.getParent().lock()->getHierarchy();
    });
  });
  EXPECT_EQ(root->getHierarchy(), "/velltool");
  EXPECT_EQ(pathSeenByChild, "/velltool/logdump below /velltool");
  EXPECT_EQ(root->getParent().lock(), nullptr);
  EXPECT_EQ(root->getSubCommandObj("logdump")->getParent().lock(), root);

  std::weak_ptr<CommandBase> gone = PlainNode::create("gone", {});
  EXPECT_EQ(PlainNode::create("orphan", gone)->getHierarchy(), "/orphan");
}

TEST(CommandBase, ReturnsTheHandlersResultAfterItsWorkIsDone) {
  const auto node = PlainNode::create("root", {});
  std::promise<void> handlerReturned;
  std::string log;
  std::thread worker;
  node->addCommandHandler(
      "slow",
      [&](const WorkGroup& group, const std::list<std::string>& args) {
        log = args.front() + args.back();
        worker = std::thread([&, membership = WorkGroup::Membership(group)] {
          handlerReturned.get_future().wait();
          log += " done";
        });
        handlerReturned.set_value();
        return true;
      },
      "");
  EXPECT_TRUE(node->execCommand("slow", {"a", "b"}));
  EXPECT_EQ(log, "ab done");
  worker.join();
  EXPECT_FALSE(node->execCommand("unknown", {}));
}
