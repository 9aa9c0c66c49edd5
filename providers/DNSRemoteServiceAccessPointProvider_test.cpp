// Reading the servers: only what differs from the endpoints. ReadOperations_test.cpp tests what both share.
#include <ProviderCall.h>
#include <World.h>
#include <gmock/gmock.h>

extern "C" CMPIInstanceMI* DNSRemoteServiceAccessPointProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                                 CMPIStatus*);

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;

class Servers : public ::testing::Test {
 protected:
  static inline const Path kClass = Path("ZORVA_RemoteServiceAccessPoint");

  World world;
  RecordingLogger logger;
  RecordingBroker broker;
  InstanceProvider provider{DNSRemoteServiceAccessPointProvider_Create_InstanceMI, broker};
};

TEST_F(Servers, NamesAreReadMadeAndReturnedInThisOrder) {
  world.nic("eth0", {.servers = {"192.0.2.53"}}).install();
  EXPECT_THAT(
      provider.enumerateInstanceNames(kClass).story(),
      ElementsAre(
          "log 4000 banner", "log 4000 ENTERING DNSRemoteServiceAccessPoint_EnumInstanceNames",
          "log 3000 ENTERING getDNSClientInstances, dnsClientMap=ADDR", "log 4000 VARIABLE nodeString = Computer",
          "log 3000 EXITING getDNSClientInstances, dnsClientMap=ADDR",
          "log 3000 ENTERING getDNSServerInstances, dnsServerMap=ADDR", "log 4000 VARIABLE name = 192.0.2.53",
          "log 3000 EXITING getDNSServerInstances, dnsServerMap=ADDR",
          "log 3000 ENTERING getAllDNSServerCMPIObjPaths, broker=ADDR ref=ADDR objectPaths=ADDR status=ADDR",
          "newObjectPath(\"root/cimv2\", \"ZORVA_RemoteServiceAccessPoint\")", "OP1.setNameSpace(\"root/cimv2\")",
          "OP1.setHostname(\"host1\")", "OP1.addKey(\"SystemCreationClassName\", chars \"ZORVA_ComputerSystem\")",
          "OP1.addKey(\"CreationClassName\", chars \"ZORVA_RemoteServiceAccessPoint\")",
          "OP1.addKey(\"SystemName\", chars \"host1\")", "OP1.addKey(\"Name\", chars \"192.0.2.53\")",
          "log 3000 EXITING getAllDNSServerCMPIObjPaths, broker=ADDR ref=ADDR objectPaths=ADDR status=ADDR",
          "returnObjectPath(OP1)", "returnDone()", "log 4000 EXITING DNSRemoteServiceAccessPoint_EnumInstanceNames",
          "log 4000 banner"));
}

TEST_F(Servers, ComeInTheOrderOfTheAddressAndNotOfTheirPlace) {
  world.nic("eth0", {.servers = {"192.0.2.9", "192.0.2.1", "10.0.0.1"}}).install();
  const Outcome outcome = provider.enumerateInstances(kClass);
  std::vector<std::pair<std::string, std::uint64_t>> places;
  for (const Instance& instance : outcome.instances()) {
    places.emplace_back(instance["Name"].text(), instance["OrderOfAccess"].number());
  }
  EXPECT_THAT(places, ElementsAre(std::pair("10.0.0.1", 3U), std::pair("192.0.2.1", 2U), std::pair("192.0.2.9", 1U)));
}

TEST_F(Servers, OfAHostWithEndpointsAloneAreNone) {
  world.nic("eth0").nic("eth1", {.servers = noTexts()}).install();
  const Outcome outcome = provider.enumerateInstances(kClass);
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_FALSE(outcome.done());
  EXPECT_THAT(outcome.errors(), ElementsAre("***No instance found***", "getAllDNSServerCMPIInstances Failed"));
}

TEST_F(Servers, OfTheServiceProcessorBelongToTheHostToo) {
  world.host("host1").bmc().nic("bmc0", {.servers = {"198.51.100.1"}}).install();
  const Outcome outcome = provider.enumerateInstances(kClass);
  ASSERT_EQ(1U, outcome.instances().size());
  EXPECT_EQ(chars("ZORVA_ComputerSystem"), outcome.instances()[0]["SystemCreationClassName"]);
  EXPECT_EQ(chars("host1"), outcome.instances()[0]["SystemName"]);
}

// A name is compared as text, not as the address that it means.
TEST_F(Servers, AddressIsFoundInItsOwnSpellingAlone) {
  world.nic("eth0", {.servers = {"2001:db8::1"}}).install();
  EXPECT_EQ(1U, provider.getInstance(kClass.key("Name", "2001:db8::1")).instances().size());
  EXPECT_EQ(0U, provider.getInstance(kClass.key("Name", "2001:DB8::1")).instances().size());
  EXPECT_EQ(0U, provider.getInstance(kClass.key("Name", "2001:db8:0::1")).instances().size());
}

TEST_F(Servers, AreThoseOfTheMoment) {
  world.nic("eth0", {.servers = {"192.0.2.1"}}).install();
  EXPECT_EQ(1U, provider.enumerateInstances(kClass).instances().size());
  world.nic("eth1", {.servers = {"192.0.2.2"}}).install();
  EXPECT_EQ(2U, provider.enumerateInstances(kClass).instances().size());
}

}  // namespace
}  // namespace ZV::Test
