#include "agent/interface/Instrumentation.h"

#include <gmock/gmock.h>

#include <sstream>
#include <stdexcept>

#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/interface/PlatformUtilities.h"
#include "agent/testing/TemporaryDirectory.h"
#include "agent/testing/Trees.h"

namespace {

using namespace ZV::NodeLexicon;
using ::testing::ElementsAre;
using ::testing::SizeIs;
using zorva::agent::TreeCall;
using ZV::Instrumentation;

static_assert(sizeof(Instrumentation) == sizeof(void*), "its size never changes with the agent");

constexpr const char* kTwoInterfaces = R"({"system_name": "host1", "nodes": [
  {"type": "System", "name": "system", "description": "Computer", "children": [
    {"type": "Port", "name": "eth0", "children": [{"type": "NetworkIPConfig", "name": "ip", "properties":
      {"name": "eth0", "enabled_state": 1, "dns_suffixes": ["a.org", "b.org"]}}]},
    {"type": "Port", "name": "eth1", "children": [{"type": "NetworkIPConfig", "name": "ip", "properties":
      {"name": "eth1"}}]}]},
  {"type": "System", "name": "bmc", "description": "BMC"}]})";

class InstrumentationTest : public ::testing::Test {
 protected:
  InstrumentationTest() {
    zorva::agent::Config config;
    config.dataDir = directory_.path();
    config.logTarget = directory_ / "log";
    zorva::agent::setConfig(config);
    install(kTwoInterfaces);
  }
  ~InstrumentationTest() override { zorva::agent::reset(); }

  static void install(const std::string& json) {
    zorva::agent::setTreeSource(
        std::make_shared<zorva::agent::testing::FixedSource>(zorva::agent::testing::treeFromJson(json, "tree")));
  }

  static std::string nameAt(const Instrumentation& cursor) {
    std::string name;
    return cursor.getProperty(PROP_NAME, name) ? name : "none";
  }

  zorva::agent::testing::TemporaryDirectory directory_;
};

TEST_F(InstrumentationTest, ANewCursorIsOnNoNode) {
  const Instrumentation cursor;
  EXPECT_FALSE(cursor);
  EXPECT_EQ(nameAt(cursor), "none");
  EXPECT_EQ(cursor.getPathToParentNode(), "");
  EXPECT_EQ(cursor.getNodeDescription(), "");
}

TEST_F(InstrumentationTest, WalksTheNodesOfATypeInTreeOrder) {
  Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  ASSERT_TRUE(cursor);
  EXPECT_EQ(nameAt(cursor), "eth0");
  ++cursor;
  EXPECT_EQ(nameAt(cursor), "eth1");
  ++cursor;
  EXPECT_FALSE(cursor);
  ++cursor;
  EXPECT_FALSE(cursor);
}

TEST_F(InstrumentationTest, ATreeWithoutSuchNodesPlacesTheCursorOnNone) {
  install("{}");
  Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  EXPECT_FALSE(cursor);
}

TEST_F(InstrumentationTest, ANumberThatIsNoNodeTypeIsTheTypeOfNoNode) {
  Instrumentation cursor;
  for (const unsigned int number : {0U, 1U, 2U, 28U, 30U, 4294967295U}) {
    cursor.selectNode(static_cast<NodeType>(number));
    EXPECT_FALSE(cursor) << number;
  }
}

TEST_F(InstrumentationTest, TheGrandparentIsReachedByPaths) {
  Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  EXPECT_EQ(cursor.getPathToParentNode(), "/system/eth0");
  Instrumentation other;
  other.selectNode(cursor.getPathToParentNode());
  ASSERT_TRUE(other);
  EXPECT_EQ(other.getNodeDescription(), "");
  other.selectNode(other.getPathToParentNode());
  EXPECT_EQ(other.getNodeDescription(), "Computer");
  other.selectNode(other.getPathToParentNode());
  ASSERT_TRUE(other) << "the root";
  EXPECT_EQ(other.getPathToParentNode(), "");
}

TEST_F(InstrumentationTest, APathThatIsNotThereAndTheEmptyPathPlaceTheCursorOnNone) {
  Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  cursor.selectNode("/system/eth7");
  EXPECT_FALSE(cursor);
  cursor.selectNode("");
  EXPECT_FALSE(cursor);
}

TEST_F(InstrumentationTest, ACursorThatWasPlacedByPathHasNoNextNode) {
  Instrumentation cursor;
  cursor.selectNode("/system/eth0/ip");
  EXPECT_EQ(nameAt(cursor), "eth0");
  ++cursor;
  EXPECT_FALSE(cursor);
}

TEST_F(InstrumentationTest, PropertiesComeInTheirOwnTypeOnlyAndOtherwiseLeaveTheOutputAlone) {
  Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  std::string text = "before";
  unsigned int number = 77;
  std::vector<std::string> list{"before"};
  EXPECT_FALSE(cursor.getProperty(PROP_ENABLED_STATE, text));
  EXPECT_FALSE(cursor.getProperty(PROP_HOST_NAME, text));
  EXPECT_FALSE(cursor.getProperty(PROP_NAME, number));
  EXPECT_FALSE(cursor.getProperty(PROP_DNS_SERVER_ADDRESSES, list));
  EXPECT_FALSE(cursor.getProperty(static_cast<Properties>(1), text));
  EXPECT_EQ(text, "before");
  EXPECT_EQ(number, 77U);
  EXPECT_EQ(list, (std::vector<std::string>{"before"}));
}

TEST_F(InstrumentationTest, AListIsPutInThePlaceOfWhatTheVectorHeld) {
  Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  std::vector<std::string> list{"before"};
  EXPECT_TRUE(cursor.getProperty(PROP_DNS_SUFFIXES, list));
  EXPECT_EQ(list, (std::vector<std::string>{"a.org", "b.org"}));
}

TEST_F(InstrumentationTest, ACopyIsOnTheSameNodeAndMovesIndependently) {
  Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  Instrumentation copy(cursor);
  ++cursor;
  EXPECT_EQ(nameAt(copy), "eth0");
  EXPECT_EQ(nameAt(cursor), "eth1");
  ++copy;
  EXPECT_EQ(nameAt(copy), "eth1") << "a copy knows the type that is walked";
  Instrumentation empty;
  copy = empty;
  EXPECT_FALSE(copy);
  Instrumentation& self = cursor;
  cursor = self;
  EXPECT_EQ(nameAt(cursor), "eth1");
}

TEST_F(InstrumentationTest, ACursorStaysInItsSnapshotWhenTheTreeChanges) {
  Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  install("{}");
  Instrumentation other;
  other.selectNode(NODE_NETWORK_IP_CONFIG);
  EXPECT_FALSE(other);
  EXPECT_EQ(nameAt(cursor), "eth0");
  cursor.selectNode("/system/eth1/ip");
  EXPECT_EQ(nameAt(cursor), "eth1");
  Instrumentation fresh;
  fresh.selectNode("/system/eth1/ip");
  EXPECT_FALSE(fresh) << "a cursor without a snapshot uses the latest one";
}

struct FailingSource : zorva::agent::TreeSource {
  bool changed() override { return true; }
  std::shared_ptr<const zorva::agent::TreeSnapshot> read() override {
    if (problem.empty()) throw 42;
    throw std::runtime_error(problem);
  }
  std::string problem = "no kernel";
};

TEST_F(InstrumentationTest, ASourceThatThrowsDoesNotMoveTheCursorIfAProgramAskedForThat) {
  zorva::agent::askForExceptions();
  Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  zorva::agent::setTreeSource(std::make_shared<FailingSource>());
  EXPECT_THROW(cursor.selectNode(NODE_NETWORK_IP_CONFIG), std::runtime_error);
  EXPECT_EQ(nameAt(cursor), "eth0");
  EXPECT_NE(zorva::agent::testing::contentsOf(directory_ / "log").find("the tree cannot be read: no kernel"),
            std::string::npos);
}

TEST_F(InstrumentationTest, ASourceThatThrowsElsePlacesTheCursorOnNoNodeAndLogsEachReasonOnce) {
  const auto source = std::make_shared<FailingSource>();
  Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  const auto expectNone = [&] {
    cursor.selectNode(NODE_NETWORK_IP_CONFIG);
    EXPECT_FALSE(cursor);
    cursor.selectNode("/system/eth0/ip");
    EXPECT_FALSE(cursor);
    EXPECT_NE(ZV::getSystemName(), "");
  };
  const auto logged = [this] {
    std::vector<std::string> reasons;
    std::istringstream log(zorva::agent::testing::contentsOf(directory_ / "log"));
    for (std::string line; std::getline(log, line);) reasons.push_back(line.substr(line.find("cannot be read")));
    return reasons;
  };
  zorva::agent::setTreeSource(source);
  expectNone();
  expectNone();
  EXPECT_THAT(logged(), ElementsAre("cannot be read: no kernel"));
  source->problem = "";
  expectNone();
  EXPECT_THAT(logged(), ElementsAre("cannot be read: no kernel", "cannot be read"));

  install(kTwoInterfaces);
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  EXPECT_EQ(nameAt(cursor), "eth0");
  zorva::agent::setTreeSource(source);
  expectNone();
  EXPECT_THAT(logged(), SizeIs(3)) << "after it went well once the same reason is news";
}

TEST_F(InstrumentationTest, AHookIsAskedAtEveryCallAndWhatItThrowsLeavesTheCall) {
  struct Hook : zorva::agent::TreeCallHook {
    void before(TreeCall call) override {
      calls.push_back(call);
      if (call == failing) throw 42;
    }
    std::vector<TreeCall> calls;
    TreeCall failing = TreeCall::GetText;
  } hook;
  zorva::agent::setTreeCallHook(&hook);
  Instrumentation cursor;
  cursor.selectNode(NODE_NETWORK_IP_CONFIG);
  EXPECT_TRUE(static_cast<bool>(cursor));
  std::string text;
  EXPECT_THROW(cursor.getProperty(PROP_NAME, text), int);
  hook.failing = TreeCall::SelectByType;
  EXPECT_THROW(cursor.selectNode(NODE_NETWORK_IP_CONFIG), int);
  zorva::agent::setTreeCallHook(nullptr);
  EXPECT_EQ(hook.calls, (std::vector<TreeCall>{TreeCall::Construct, TreeCall::SelectByType, TreeCall::Test,
                                               TreeCall::GetText, TreeCall::SelectByType}));
  EXPECT_EQ(nameAt(cursor), "eth0");
}

}  // namespace
