// Reading the endpoints: only what differs from the servers. ReadOperations_test.cpp tests what both share.
#include <ProviderCall.h>
#include <World.h>
#include <gmock/gmock.h>

extern "C" CMPIInstanceMI* DNSClientProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

class Endpoints : public ::testing::Test {
 protected:
  static inline const Path kClass = Path("ZORVA_DNSProtocolEndPoint");

  World world;
  RecordingLogger logger;
  RecordingBroker broker;
  InstanceProvider provider{DNSClientProvider_Create_InstanceMI, broker};
};

TEST_F(Endpoints, NamesAreReadMadeAndReturnedInThisOrder) {
  world.nic("eth0").install();
  EXPECT_THAT(
      provider.enumerateInstanceNames(kClass).story(),
      ElementsAre(
          "log 4000 banner", "log 4000 ENTERING DNSClient_EnumInstanceNames",
          "log 3000 ENTERING getDNSClientInstances, dnsClientMap=ADDR", "log 4000 VARIABLE nodeString = Computer",
          "log 3000 EXITING getDNSClientInstances, dnsClientMap=ADDR",
          "log 3000 ENTERING getDNSServerInstances, dnsServerMap=ADDR",
          "log 3000 EXITING getDNSServerInstances, dnsServerMap=ADDR",
          "log 3000 ENTERING getAllDNSClientCMPIObjPaths, broker=ADDR ref=ADDR objectPaths=ADDR status=ADDR",
          "newObjectPath(\"root/cimv2\", \"ZORVA_DNSProtocolEndPoint\")", "OP1.setNameSpace(\"root/cimv2\")",
          "OP1.setHostname(\"host1\")", "OP1.addKey(\"SystemCreationClassName\", chars \"ZORVA_ComputerSystem\")",
          "OP1.addKey(\"CreationClassName\", chars \"ZORVA_DNSProtocolEndPoint\")",
          "OP1.addKey(\"SystemName\", chars \"host1\")", "OP1.addKey(\"Name\", chars \"eth0\")",
          "returnObjectPath(OP1)", "returnDone()", "log 4000 EXITING DNSClient_EnumInstanceNames", "log 4000 banner"));
}

TEST_F(Endpoints, InstanceIsReadMadeAndReturnedInThisOrder) {
  world.nic("eth0").install();
  const std::string one =
      "OneDNSClientCMPIInstance, broker=ADDR objectPath=ADDR key=ADDR properties=ADDR "
      "instances=ADDR status=ADDR";
  const std::string make = "makeDNSClientInstance, broker=ADDR ref=ADDR dc=ADDR properties=ADDR isObjPath=0 rc=ADDR";
  EXPECT_THAT(provider.getInstance(kClass.key("Name", "eth0"), {"NameFormat"}).story(),
              ElementsAre("log 4000 banner", "log 4000 ENTERING DNSClient_GetInstance",
                          "log 3000 ENTERING getDNSClientInstances, dnsClientMap=ADDR",
                          "log 4000 VARIABLE nodeString = Computer",
                          "log 3000 EXITING getDNSClientInstances, dnsClientMap=ADDR",
                          "log 3000 ENTERING getDNSServerInstances, dnsServerMap=ADDR",
                          "log 3000 EXITING getDNSServerInstances, dnsServerMap=ADDR", "log 3000 ENTERING get" + one,
                          "log 3000 ENTERING " + make, "newObjectPath(\"root/cimv2\", \"ZORVA_DNSProtocolEndPoint\")",
                          "OP1.setNameSpace(\"root/cimv2\")", "OP1.setHostname(\"host1\")", "newInstance(OP1)",
                          "I1.setPropertyFilter({\"NameFormat\"}, {\"SystemCreationClassName\", \"CreationClassName\", "
                          "\"SystemName\", \"Name\"})",
                          "I1.setProperty(\"SystemCreationClassName\", chars \"ZORVA_ComputerSystem\")",
                          "I1.setProperty(\"CreationClassName\", chars \"ZORVA_DNSProtocolEndPoint\")",
                          "I1.setProperty(\"SystemName\", chars \"host1\")", "I1.setProperty(\"Name\", chars \"eth0\")",
                          "I1.setProperty(\"NameFormat\", chars \"NICName\")", "log 3000 EXITING " + make,
                          "log 3000 EXITING get" + one, "returnInstance(I1)", "returnDone()",
                          "log 4000 EXITING DNSClient_GetInstance", "log 4000 banner"));
}

TEST_F(Endpoints, OfTheServiceProcessorHaveASystemWithAFixedName) {
  world.host("host1").nic("eth0").bmc().nic("bmc0").install();
  const Outcome outcome = provider.enumerateInstanceNames(kClass);
  ASSERT_EQ(2U, outcome.paths().size());
  EXPECT_EQ(
      "ZORVA_DNSProtocolEndPoint.SystemCreationClassName=\"ZORVA_SPComputerSystem\","
      "CreationClassName=\"ZORVA_DNSProtocolEndPoint\",SystemName=\"BMC:-1\",Name=\"bmc0\"",
      describe(outcome.paths()[0]));
  EXPECT_EQ("host1", outcome.paths()[0].host);
  EXPECT_EQ("host1", outcome.paths()[1]["SystemName"].text());
}

TEST_F(Endpoints, ComeInTheOrderOfTheirNamesAndNotOfTheTree) {
  world.nic("wlan0").nic("eth10").bmc().nic("bmc0").nic("eth2").install();
  const Outcome outcome = provider.enumerateInstanceNames(kClass);
  std::vector<std::string> names;
  for (const Path& path : outcome.paths()) names.push_back(path["Name"].text());
  EXPECT_THAT(names, ElementsAre("bmc0", "eth10", "eth2", "wlan0"));
}

TEST_F(Endpoints, NameIsExactlyThatOfTheInterface) {
  world.nic("  br/0:1 ").install();
  EXPECT_EQ(chars("  br/0:1 "), provider.enumerateInstances(kClass).instances().at(0)["Name"]);
}

TEST_F(Endpoints, NodeThatGivesNothingIsEnumeratedUnderTheEmptyName) {
  world.nic("x", {.isUnnamed = true}).install();
  const Outcome outcome = provider.enumerateInstances(kClass);
  ASSERT_EQ(1U, outcome.instances().size());
  EXPECT_EQ(chars(""), outcome.instances()[0]["Name"]);
  EXPECT_THAT(outcome.errors(), IsEmpty());
  EXPECT_EQ(1U, provider.getInstance(kClass.key("Name", "")).instances().size());
}

TEST_F(Endpoints, ArrayThatIsNotMadeIsNoFailureOfTheOperation) {
  world.nic("eth0", usualNic()).install();
  broker.failNext("newArray", Mode::ReturnNull);
  const Outcome outcome = provider.enumerateInstances(kClass);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_TRUE(outcome.done());
  EXPECT_TRUE(outcome.markedExit());
  ASSERT_EQ(1U, outcome.instances().size());
  EXPECT_EQ("DomainName", outcome.instances()[0].names().back());
  EXPECT_THAT(outcome.errors(), ElementsAre("Create Array for Property DNSSuffixesToAppend failed."));
}

TEST_F(Endpoints, StatusOfTheArrayGoesToTheClient) {
  world.nic("eth0", usualNic()).install();
  broker.failNext("newArray", Mode::RcAndNull);
  const Outcome outcome = provider.enumerateInstances(kClass);
  EXPECT_EQ(CMPI_RC_ERR_FAILED, outcome.rc);
  EXPECT_TRUE(outcome.done());
}

TEST_F(Endpoints, SettingsInFilesAreNotTheirs) {
  world.nic("eth0", {.hostName = "fromTree", .domain = "tree.org"}).install();
  world.file("eth0", "HOSTNAME=fromFile\nDOMAINNAME=file.org\n");
  const Instance instance = provider.enumerateInstances(kClass).instances().at(0);
  EXPECT_EQ(chars("fromTree"), instance["Hostname"]);
  EXPECT_EQ(chars("tree.org"), instance["DomainName"]);
}

TEST_F(Endpoints, AreThoseOfTheMoment) {
  world.nic("eth0").install();
  EXPECT_EQ(1U, provider.enumerateInstances(kClass).instances().size());
  world.nic("eth1").install();
  EXPECT_EQ(2U, provider.enumerateInstances(kClass).instances().size());
}

}  // namespace
}  // namespace ZV::Test
