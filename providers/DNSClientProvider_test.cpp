// The endpoints as a client reads them.

#include "providers/testing/InstanceTest.h"

namespace ZV::Test {
namespace {

class Endpoints : public InstanceTest {
 protected:
  Endpoints() : InstanceTest("DNSClientProvider") {}
};

TEST_F(Endpoints, OfTheServiceProcessorHaveAFixedSystemName) {
  world.host("host1").nic("eth0").bmc().nic("bmc0").install();
  ASSERT_THAT(paths(), SizeIs(2));
  EXPECT_EQ(
      "ZORVA_DNSProtocolEndPoint.SystemCreationClassName=\"ZORVA_SPComputerSystem\","
      "CreationClassName=\"ZORVA_DNSProtocolEndPoint\",SystemName=\"BMC:-1\",Name=\"bmc0\"",
      describe(paths()[0]));
  EXPECT_EQ("host1", paths()[0].host);
  EXPECT_EQ("host1", paths()[1]["SystemName"].text());
}

TEST_F(Endpoints, ComeInTheOrderOfTheirNamesAndNotOfTheTree) {
  world.nic("wlan0").nic("eth10").bmc().nic("bmc0").nic("eth2").install();
  std::vector<std::string> names;
  for (const Path& path : paths()) names.push_back(path["Name"].text());
  EXPECT_THAT(names, ElementsAre("bmc0", "eth10", "eth2", "wlan0"));
}

TEST_F(Endpoints, NameIsThatOfTheInterfaceUnchanged) {
  world.nic("  br/0:1 ").install();
  EXPECT_EQ(chars("  br/0:1 "), instances().at(0)["Name"]);
}

TEST_F(Endpoints, NodeThatGivesNothingIsEnumeratedUnderTheEmptyName) {
  world.nic("x", {.isUnnamed = true}).install();
  EXPECT_EQ(chars(""), instances().at(0)["Name"]);
  EXPECT_THAT(found(classPath().key("Name", "")), SizeIs(1));
}

TEST_F(Endpoints, AreFoundByTheExactName) {
  world.nic("eth0").install();
  EXPECT_THAT(found(endpointPath("eth0")), SizeIs(1));
  EXPECT_THAT(found(endpointPath("eth0", "elsewhere")), SizeIs(1));  // no other key is read
  for (const char* name : {"nobody", "", "ETH0", "eth"}) EXPECT_THAT(found(endpointPath(name)), IsEmpty()) << name;
}

TEST_F(Endpoints, SettingsInFilesAreNotTheirs) {
  world.nic("eth0", {.hostName = "fromTree", .domain = "tree.org"}).install();
  world.file("eth0", "HOSTNAME=fromFile\nDOMAINNAME=file.org\n");
  EXPECT_EQ(chars("fromTree"), instances().at(0)["Hostname"]);
  EXPECT_EQ(chars("tree.org"), instances().at(0)["DomainName"]);
}

TEST_F(Endpoints, AreThoseOfTheMoment) {
  world.nic("eth0").install();
  EXPECT_THAT(instances(), SizeIs(1));
  world.nic("eth1").install();
  EXPECT_THAT(instances(), SizeIs(2));
}

}  // namespace
}  // namespace ZV::Test
