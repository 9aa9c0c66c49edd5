#include "agent/tree/TreeSnapshot.h"

#include <gtest/gtest.h>

#include <stdexcept>

#include "agent/testing/Trees.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;

std::vector<std::string> pathsOf(const TreeSnapshot& tree) {
  std::vector<std::string> paths;
  for (const Node& node : tree.nodes()) paths.push_back(node.path());
  return paths;
}

TEST(TreeSnapshot, ATreeHasARootAtLeast) {
  const auto tree = TreeBuilder("host1").finish();
  EXPECT_EQ(tree->systemName(), "host1");
  EXPECT_EQ(tree->root().path(), "/");
  EXPECT_EQ(tree->root().type(), NodeType::Root);
  EXPECT_EQ(&tree->parent(tree->root()), &tree->root());
  EXPECT_EQ(tree->find("/"), &tree->root());
}

class SmallTree : public ::testing::Test {
 protected:
  SmallTree() {
    TreeBuilder builder("host1");
    const std::size_t system = builder.add(0, NodeType::System, "system", "Computer");
    for (const char* name : {"eth1", "eth0"}) {
      const std::size_t port = builder.add(system, NodeType::Port, name);
      const std::size_t node = builder.add(port, NodeType::NetworkIPConfig, "ip");
      builder.set(node, PROP_NAME, name);
    }
    builder.add(0, NodeType::System, "bmc", "BMC");
    tree_ = builder.finish();
  }

  std::shared_ptr<const TreeSnapshot> tree_;
};

TEST_F(SmallTree, NodesAreInTreeOrder) {
  EXPECT_EQ(pathsOf(*tree_), (std::vector<std::string>{"/", "/system", "/system/eth1", "/system/eth1/ip",
                                                       "/system/eth0", "/system/eth0/ip", "/bmc"}));
}

TEST_F(SmallTree, ANodeIsFoundByItsPathAndKnowsItsParent) {
  const Node* node = tree_->find("/system/eth0/ip");
  ASSERT_NE(node, nullptr);
  EXPECT_EQ(node->name(), "ip");
  EXPECT_EQ(tree_->parent(*node).path(), "/system/eth0");
  EXPECT_EQ(tree_->parent(tree_->parent(*node)).description(), "Computer");
}

TEST_F(SmallTree, APathThatIsNotThereFindsNothing) {
  for (const char* path : {"", "/system/", "system", "/system/eth0/ip/", "/system/eth2", "//"}) {
    EXPECT_EQ(tree_->find(path), nullptr) << path;
  }
}

TEST_F(SmallTree, ChildrenAreThoseOfTheNodeAlone) {
  const auto names = [this](const std::string& path) {
    std::vector<std::string> result;
    for (const Node* child : tree_->children(*tree_->find(path))) result.push_back(child->name());
    return result;
  };
  EXPECT_EQ(names("/"), (std::vector<std::string>{"system", "bmc"}));
  EXPECT_EQ(names("/system"), (std::vector<std::string>{"eth1", "eth0"}));
  EXPECT_EQ(names("/system/eth0"), (std::vector<std::string>{"ip"}));
  EXPECT_TRUE(names("/bmc").empty());
}

TEST_F(SmallTree, NodesOfATypeAreFoundOneAfterTheOther) {
  const Node* first = tree_->nextOfType(NodeType::NetworkIPConfig, 0);
  ASSERT_NE(first, nullptr);
  EXPECT_EQ(first->path(), "/system/eth1/ip");
  const Node* second = tree_->nextOfType(NodeType::NetworkIPConfig, first->index() + 1);
  ASSERT_NE(second, nullptr);
  EXPECT_EQ(second->path(), "/system/eth0/ip");
  EXPECT_EQ(tree_->nextOfType(NodeType::NetworkIPConfig, second->index() + 1), nullptr);
}

TEST(TreeSnapshot, TheOwnSystemIsTheFirstThatIsNoServiceProcessor) {
  TreeBuilder alone("host1");
  alone.add(0, NodeType::System, "bmc", "BMC");
  EXPECT_EQ(alone.finish()->ownSystem(), nullptr);
  TreeBuilder builder("host1");
  builder.add(0, NodeType::System, "bmc", "BMC");
  builder.add(0, NodeType::System, "system", "Computer");
  builder.add(0, NodeType::System, "other", "Computer");
  const auto tree = builder.finish();
  ASSERT_NE(tree->ownSystem(), nullptr);
  EXPECT_EQ(tree->ownSystem()->path(), "/system");
}

TEST_F(SmallTree, OnlyASystemThatIsCalledBmcIsAServiceProcessor) {
  EXPECT_TRUE(tree_->find("/bmc")->isServiceProcessor());
  EXPECT_FALSE(tree_->find("/system")->isServiceProcessor());
}

TEST_F(SmallTree, ACopyIsChangedWithoutTheOriginal) {
  TreeBuilder builder(*tree_);
  builder.set(tree_->find("/system/eth0/ip")->index(), PROP_NAME, "other", true);
  const auto changed = builder.finish();
  EXPECT_EQ(*changed->find("/system/eth0/ip")->text(PROP_NAME), "other");
  EXPECT_TRUE(testing::isOverlaid(*changed->find("/system/eth0/ip"), PROP_NAME));
  EXPECT_EQ(*tree_->find("/system/eth0/ip")->text(PROP_NAME), "eth0");
  EXPECT_FALSE(testing::isOverlaid(*tree_->find("/system/eth0/ip"), PROP_NAME));
  EXPECT_EQ(pathsOf(*changed), pathsOf(*tree_));
}

TEST(TreeBuilder, NamesThatCouldNotBeInAPathAreRefused) {
  TreeBuilder builder("host1");
  for (const std::string& name : {std::string(), std::string("a/b"), std::string("/"), std::string("a\0b", 3)}) {
    EXPECT_THROW(builder.add(0, NodeType::System, name), std::invalid_argument);
  }
  EXPECT_NO_THROW(builder.add(0, NodeType::System, "\xFF ..\n\"%"));
}

TEST(TreeBuilder, TwoSiblingsOfOneNameAreRefused) {
  TreeBuilder builder("host1");
  builder.add(0, NodeType::System, "a");
  builder.add(0, NodeType::System, "a");
  EXPECT_THROW(builder.finish(), std::invalid_argument);
}

TEST(TreeBuilder, OneNameUnderTwoParentsIsFine) {
  TreeBuilder builder("host1");
  builder.add(builder.add(0, NodeType::System, "a"), NodeType::Port, "x");
  builder.add(builder.add(0, NodeType::System, "b"), NodeType::Port, "x");
  EXPECT_NO_THROW(builder.finish());
}

TEST(TreeBuilder, ANodeCannotBeAddedAfterALaterBranch) {
  TreeBuilder builder("host1");
  const std::size_t first = builder.add(0, NodeType::System, "a");
  builder.add(0, NodeType::System, "b");
  EXPECT_THROW(builder.add(first, NodeType::Port, "x"), std::invalid_argument);
  EXPECT_THROW(builder.add(77, NodeType::Port, "x"), std::invalid_argument);
}

TEST(Node, AValueIsGivenInItsOwnTypeOnly) {
  TreeBuilder builder("host1");
  const std::size_t node = builder.add(0, NodeType::NetworkIPConfig, "ip");
  builder.set(node, PROP_NAME, "eth0");
  builder.set(node, PROP_ENABLED_STATE, 12U);
  builder.set(node, PROP_DNS_SUFFIXES, std::make_shared<const StringList>(StringList{"a.org"}));
  const auto tree = builder.finish();
  const Node& ip = tree->nodes().at(node);
  EXPECT_EQ(*ip.text(PROP_NAME), "eth0");
  EXPECT_EQ(ip.number(PROP_NAME), nullptr);
  EXPECT_EQ(*ip.number(PROP_ENABLED_STATE), 12U);
  EXPECT_EQ(ip.text(PROP_ENABLED_STATE), nullptr);
  EXPECT_EQ(*ip.list(PROP_DNS_SUFFIXES), (StringList{"a.org"}));
  EXPECT_EQ(ip.list(PROP_DNS_SERVER_ADDRESSES), nullptr);
  EXPECT_TRUE(ip.addresses().empty());
}

TEST(Node, ListsAreEqualByTheirElements) {
  const auto list = [](StringList texts) {
    return PropertyValue(std::make_shared<const StringList>(std::move(texts)));
  };
  EXPECT_TRUE(equalValues(list({"a", "b"}), list({"a", "b"})));
  EXPECT_FALSE(equalValues(list({"a", "b"}), list({"b", "a"})));
  EXPECT_FALSE(equalValues(list({}), std::string()));
  EXPECT_TRUE(equalValues(std::string("a"), std::string("a")));
  EXPECT_FALSE(equalValues(1U, 2U));
}

}  // namespace
}  // namespace zorva::agent
