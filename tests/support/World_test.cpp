#include "tests/support/World.h"

#include <filesystem>

#include "agent/interface/Instrumentation.h"
#include "agent/interface/PlatformUtilities.h"
#include "agent/interface/ZALogger.h"
#include "tests/support/Matchers.h"
#include "tests/support/RecordingLogger.h"

namespace ZV::Test {
namespace {

std::string textAt(const Instrumentation& cursor, NodeLexicon::Properties property) {
  std::string value = "absent";
  cursor.getProperty(property, value);
  return value;
}

TEST(World, IsWhatTheAgentSees) {
  World world;
  world.host("myhost").nic("eth0", {.domain = "example.org", .servers = {"192.0.2.53", "2001:db8::53"}}).install();
  Instrumentation cursor;
  cursor.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG);
  ASSERT_TRUE(static_cast<bool>(cursor));
  EXPECT_EQ("eth0", textAt(cursor, NodeLexicon::PROP_NAME));
  EXPECT_EQ("example.org", textAt(cursor, NodeLexicon::PROP_DOMAIN_NAME));
  EXPECT_EQ("absent", textAt(cursor, NodeLexicon::PROP_HOST_NAME));
  std::vector<std::string> servers;
  EXPECT_TRUE(cursor.getProperty(NodeLexicon::PROP_DNS_SERVER_ADDRESSES, servers));
  EXPECT_THAT(servers, ElementsAre("192.0.2.53", "2001:db8::53"));
  EXPECT_FALSE(cursor.getProperty(NodeLexicon::PROP_DNS_SUFFIXES, servers));
  unsigned int state = 0;
  EXPECT_FALSE(cursor.getProperty(NodeLexicon::PROP_ENABLED_STATE, state));
  ++cursor;
  EXPECT_FALSE(static_cast<bool>(cursor));
  EXPECT_EQ("myhost", getSystemName());
}

TEST(World, InterfacesAreBelowTheirSystem) {
  World world;
  world.host().nic("eth0").bmc().nic("bmc0", usualNic()).install();
  Instrumentation cursor;
  std::vector<std::string> found;
  for (cursor.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG); cursor; ++cursor) {
    Instrumentation above;
    above.selectNode(cursor.getPathToParentNode());
    above.selectNode(above.getPathToParentNode());
    found.push_back(textAt(cursor, NodeLexicon::PROP_NAME) + " of " + above.getNodeDescription());
  }
  EXPECT_THAT(found, ElementsAre("eth0 of Computer", "bmc0 of BMC"));
}

TEST(World, InterfacesMayShareANameOrHaveNoneOrAnEmptyOne) {
  World world;
  world.nic("eth0", {.domain = "a"}).nic("eth0", {.domain = "b"}).nic("x", {.isUnnamed = true}).nic("").nic("a/b");
  world.nic("y", {.name = "other", .suffixes = noTexts()}).install();
  EXPECT_THAT(world.text(0, NodeLexicon::PROP_NAME), Optional(std::string("eth0")));
  EXPECT_THAT(world.text(1, NodeLexicon::PROP_NAME), Optional(std::string("eth0")));
  EXPECT_THAT(world.text(1, NodeLexicon::PROP_DOMAIN_NAME), Optional(std::string("b")));
  EXPECT_EQ(std::nullopt, world.text(2, NodeLexicon::PROP_NAME));
  EXPECT_THAT(world.text(3, NodeLexicon::PROP_NAME), Optional(std::string()));
  EXPECT_THAT(world.text(4, NodeLexicon::PROP_NAME), Optional(std::string("a/b")));
  EXPECT_THAT(world.text(5, NodeLexicon::PROP_NAME), Optional(std::string("other")));
  EXPECT_THAT(world.list(5, NodeLexicon::PROP_DNS_SUFFIXES), Optional(IsEmpty()));
  EXPECT_EQ(std::nullopt, world.list(0, NodeLexicon::PROP_DNS_SUFFIXES));
}

TEST(World, ShowsWhatWasSetThroughTheAgent) {
  World world;
  world.nic("eth0", {.domain = "before"}).install();
  Instrumentation cursor;
  cursor.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG);
  std::string domain = "after";
  ASSERT_TRUE(cursor.setProperty(NodeLexicon::PROP_DOMAIN_NAME, domain));
  EXPECT_THAT(world.text(0, NodeLexicon::PROP_DOMAIN_NAME), Optional(std::string("after")));
}

TEST(World, CanBeAddedToAndInstalledAgain) {
  World world;
  world.install();
  Instrumentation cursor;
  cursor.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG);
  EXPECT_FALSE(static_cast<bool>(cursor));
  world.nic("eth0").install();
  cursor.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG);
  EXPECT_TRUE(static_cast<bool>(cursor));
}

TEST(World, HasItsOwnDataDirectoryAndRemovesIt) {
  std::string directory;
  {
    World world;
    world.nic("eth0").install().file("eth0", "DOMAINNAME=x\n");
    directory = world.dataDir();
    EXPECT_EQ(directory, PlatformUtilities::getMaroviaDataDir());
    EXPECT_EQ("DOMAINNAME=x\n", world.fileContent("eth0"));
    EXPECT_EQ(std::nullopt, world.fileContent("eth1"));
    EXPECT_TRUE(std::filesystem::exists(directory + "ifcfg-eth0"));
  }
  EXPECT_FALSE(std::filesystem::exists(directory));
}

TEST(World, ComesAndGoesUnderALoggerThatGoesOn) {
  RecordingLogger logger;
  { World().nic("eth0").install(); }
  ZALog::ZALogger::logLevelMessage("f", "x", 1, "c", 4000, nullptr, 0, 0, "a");
  EXPECT_EQ(1U, logger.size());
}

TEST(World, UnreadableTreeThrowsItsReason) {
  World world;
  world.installUnreadable("no such host");
  Instrumentation cursor;
  try {
    cursor.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG);
    FAIL() << "nothing was thrown";
  } catch (const std::exception& error) {
    EXPECT_STREQ("no such host", error.what());
  }
}

TEST(FailingTree, ThrowsAtTheCallThatWasAsked) {
  World world;
  world.nic("eth0").install();
  FailingTree failing(2);
  Instrumentation cursor;
  EXPECT_THROW(cursor.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG), std::runtime_error);
  EXPECT_TRUE(failing.hasThrown());
  cursor.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG);
  EXPECT_THAT(failing.calls(), ElementsAre(zorva::agent::TreeCall::Construct, zorva::agent::TreeCall::SelectByType,
                                           zorva::agent::TreeCall::SelectByType));
}

TEST(FailingTree, EachCallFailsInBothWays) {
  World world;
  world.nic("eth0").install();
  int exceptions = 0;
  int ints = 0;
  const std::size_t tried = forEachTreeFailure([&](std::size_t, Thrown) {
    try {
      Instrumentation cursor;
      cursor.selectNode(NodeLexicon::NODE_NETWORK_IP_CONFIG);
    } catch (const std::exception&) {
      ++exceptions;
    } catch (int) {
      ++ints;
    }
  });
  EXPECT_EQ(4U, tried);
  EXPECT_EQ(2, exceptions);
  EXPECT_EQ(2, ints);
}

}  // namespace
}  // namespace ZV::Test
