#include <gmock/gmock.h>

#include <fstream>
#include <set>

#include "host/SubnetMask.h"
#include "tests/support/Matchers.h"
#include "tests/support/ProviderCall.h"
#include "tests/support/World.h"

extern "C" {
CMPIInstanceMI* HostComputerSystemProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
CMPIInstanceMI* HostIPProtocolEndpointProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
CMPIInstanceMI* HostIPAssignmentSettingDataProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                      CMPIStatus*);
}

namespace ZV::Test {
namespace {

using ::testing::Not;
using zorva::agent::AddressOrigin;

// A host with two interfaces, the first with three addresses, and a service processor with one.
class HostProviders : public ::testing::Test {
 protected:
  HostProviders() {
    world_.host("host1")
        .nic("eth0", {.state = 1,
                      .addresses = {{"192.0.2.10", 24, AddressOrigin::Static},
                                    {"2001:db8::10", 64, AddressOrigin::Slaac},
                                    {"198.51.100.7", 25, AddressOrigin::Dhcp}}})
        .nic("eth1", {.state = 16})
        .bmc()
        .nic("bmc0", {.addresses = {{"fe80::1", 64, AddressOrigin::LinkLocal}}})
        .install();
  }

  std::vector<std::string> names(InstanceProvider& provider, const char* className, const char* key) {
    const Outcome outcome = provider.enumerateInstanceNames(Path(className));
    std::vector<std::string> found;
    for (const Path& path : outcome.paths()) found.push_back(path[key].text());
    return found;
  }

  World world_;
  RecordingBroker broker_;
  InstanceProvider systems_{HostComputerSystemProvider_Create_InstanceMI, broker_};
  InstanceProvider endpoints_{HostIPProtocolEndpointProvider_Create_InstanceMI, broker_};
  InstanceProvider assignments_{HostIPAssignmentSettingDataProvider_Create_InstanceMI, broker_};
};

TEST_F(HostProviders, TheHostIsTheOneComputerSystem) {
  const Outcome outcome = systems_.enumerateInstances(Path("ZORVA_ComputerSystem"));
  ASSERT_THAT(outcome.instances(), SizeIs(1));
  const Instance& system = outcome.instances()[0];
  EXPECT_EQ(system["Name"].text(), "host1");
  EXPECT_EQ(system["CreationClassName"].text(), "ZORVA_ComputerSystem");
  EXPECT_EQ(system["EnabledState"].number(), 2U);
  EXPECT_EQ(system["OtherIdentifyingInfo"].elements().size(), system["IdentifyingDescriptions"].elements().size());
  EXPECT_TRUE(outcome.done());
}

TEST_F(HostProviders, TheMachineIdNeverLeavesTheHost) {
  const Outcome outcome = systems_.enumerateInstances(Path("ZORVA_ComputerSystem"));
  ASSERT_THAT(outcome.instances(), SizeIs(1));
  std::ifstream file("/etc/machine-id");
  std::string id;
  if (!std::getline(file, id) || id.empty()) GTEST_SKIP() << "this machine has no id";
  EXPECT_THAT(describe(outcome.instances()[0]), Not(HasSubstr(id)));
}

TEST_F(HostProviders, AServiceProcessorIsASystemOfItsOwnClass) {
  EXPECT_THAT(names(systems_, "ZORVA_ComputerSystem", "Name"), ElementsAre("host1"));
  EXPECT_THAT(names(systems_, "ZORVA_SPComputerSystem", "Name"), ElementsAre("BMC:-1"));
  World plain;
  plain.host("host2").nic("eth0").install();
  EXPECT_THAT(names(systems_, "ZORVA_SPComputerSystem", "Name"), IsEmpty());
}

TEST_F(HostProviders, FurtherAddressesAreNamedByTheirOrdinal) {
  EXPECT_THAT(names(endpoints_, "ZORVA_IPProtocolEndpoint", "Name"), ElementsAre("eth0", "eth0_2", "eth0_3", "bmc0"));
}

TEST_F(HostProviders, NoAddressGetsANameThatAnInterfaceHas) {
  World world;
  world.host()
      .nic("eth0", {.addresses = {{"192.0.2.1", 24}, {"192.0.2.2", 24}}})
      .nic("eth0_2", {.addresses = {{"192.0.2.3", 24}}})
      .install();
  EXPECT_THAT(names(endpoints_, "ZORVA_IPProtocolEndpoint", "Name"), ElementsAre("eth0", "eth0_3", "eth0_2"));
}

TEST_F(HostProviders, AnEndpointHasItsAddressByVersion) {
  const std::vector<Instance> all = endpoints_.enumerateInstances(Path("ZORVA_IPProtocolEndpoint")).instances();
  ASSERT_THAT(all, SizeIs(4));
  EXPECT_EQ(all[0]["IPv4Address"].text(), "192.0.2.10");
  EXPECT_EQ(all[0]["SubnetMask"].text(), "255.255.255.0");
  EXPECT_EQ(all[0]["ProtocolIFType"].number(), 4096U);
  EXPECT_EQ(all[0]["AddressOrigin"].number(), 3U);
  EXPECT_EQ(all[0]["EnabledState"].number(), 2U);
  EXPECT_FALSE(all[0].has("IPv6Address"));
  EXPECT_EQ(all[1]["IPv6Address"].text(), "2001:db8::10");
  EXPECT_EQ(all[1]["IPv6SubnetPrefixLength"].number(), 64U);
  EXPECT_EQ(all[1]["ProtocolIFType"].number(), 4097U);
  EXPECT_EQ(all[1]["AddressOrigin"].number(), 8U);
  EXPECT_EQ(all[2]["AddressOrigin"].number(), 4U);
  EXPECT_EQ(all[3]["SystemName"].text(), "BMC:-1");
  EXPECT_EQ(all[3]["SystemCreationClassName"].text(), "ZORVA_SPComputerSystem");
  EXPECT_EQ(all[3]["AddressOrigin"].number(), 10U);
}

TEST_F(HostProviders, AnAssignmentBelongsToAnInterfaceAndAVersion) {
  EXPECT_THAT(names(assignments_, "ZORVA_IPAssignmentSettingData", "InstanceID"),
              ElementsAre("Computer%eth0%ipv4", "Computer%eth0%ipv6", "BMC%bmc0%ipv6"));
}

TEST_F(HostProviders, KeysMatchAsCimDoes) {
  const Path path = Path("ZORVA_ComputerSystem").key("Name", "host1").key("CreationClassName", "zorva_COMPUTERSYSTEM");
  EXPECT_THAT(systems_.getInstance(path).instances(), SizeIs(1));
  EXPECT_EQ(systems_.getInstance(path.key("Name", "HOST1")).rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(systems_.getInstance(path.key("Other", "x")).rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(systems_.getInstance(Path("ZORVA_ComputerSystem").key("Name", "host1")).rc, CMPI_RC_ERR_NOT_FOUND);
  EXPECT_EQ(systems_.getInstance(path.key("Name", uint16(1))).rc, CMPI_RC_ERR_NOT_FOUND);
}

TEST_F(HostProviders, AKeyIsThereByItsValueWhateverItsStateSays) {
  const Path path = Path("ZORVA_ComputerSystem").key("Name", "host1").key("CreationClassName", "ZORVA_ComputerSystem");
  for (const auto state : std::initializer_list<CMPIValueState>{CMPI_nullValue, CMPI_keyValue, CMPI_badValue}) {
    broker_.addToAllStates(state);
    EXPECT_THAT(systems_.getInstance(path).instances(), SizeIs(1)) << state;
    EXPECT_EQ(systems_.getInstance(path.key("Name", null(CMPI_string))).rc, CMPI_RC_ERR_NOT_FOUND) << state;
  }
}

TEST_F(HostProviders, APropertyListIsHonoured) {
  const Outcome outcome = systems_.enumerateInstances(Path("ZORVA_ComputerSystem"), {"enabledstate"});
  ASSERT_THAT(outcome.instances(), SizeIs(1));
  EXPECT_THAT(outcome.instances()[0].names(), ElementsAre("CreationClassName", "Name", "EnabledState"));
}

TEST_F(HostProviders, ChangesAreRefusedWithAText) {
  const Path path("ZORVA_ComputerSystem");
  for (const Outcome& outcome :
       {systems_.createInstance(path, Instance("ZORVA_ComputerSystem")),
        systems_.modifyInstance(path, Instance("ZORVA_ComputerSystem")), systems_.deleteInstance(path)}) {
    EXPECT_EQ(outcome.rc, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_THAT(outcome.message.value_or(""), HasSubstr("not supported"));
  }
}

TEST_F(HostProviders, AHostThatCannotBeReadFailsTheOperationWithTheReason) {
  World unreadable;
  unreadable.installUnreadable("the disk is on fire");
  const Outcome outcome = endpoints_.enumerateInstances(Path("ZORVA_IPProtocolEndpoint"));
  EXPECT_EQ(outcome.rc, CMPI_RC_ERR_FAILED);
  EXPECT_THAT(outcome.message.value_or(""), HasSubstr("the disk is on fire"));
  EXPECT_FALSE(outcome.done());
}

TEST_F(HostProviders, AThousandAddressesOnOneInterfaceHaveAThousandNames) {
  NicProperties many;
  for (int i = 0; i < 1000; ++i) {
    many.addresses.push_back({"10.0." + std::to_string(i / 250) + "." + std::to_string(i % 250 + 1), 16});
  }
  World world;
  world.host().nic("eth0", many).install();
  const std::vector<std::string> all = names(endpoints_, "ZORVA_IPProtocolEndpoint", "Name");
  EXPECT_EQ(std::set<std::string>(all.begin(), all.end()).size(), 1000U);
}

TEST_F(HostProviders, NoFailureOfTheBrokerEndsTheProcess) {
  const Path path = Path("ZORVA_ComputerSystem").key("Name", "host1").key("CreationClassName", "ZORVA_ComputerSystem");
  EXPECT_GT(
      forEachFailure(broker_, [&](std::size_t, Mode) { systems_.enumerateInstances(Path("ZORVA_ComputerSystem")); }),
      0U);
  EXPECT_GT(forEachFailure(broker_,
                           [&](std::size_t, Mode) { systems_.enumerateInstanceNames(Path("ZORVA_ComputerSystem")); }),
            0U);
  EXPECT_GT(forEachFailure(broker_, [&](std::size_t, Mode) { systems_.getInstance(path); }), 0U);
}

TEST(SubnetMask, FollowsThePrefix) {
  EXPECT_EQ(zorva::host::subnetMask(0), "0.0.0.0");
  EXPECT_EQ(zorva::host::subnetMask(1), "128.0.0.0");
  EXPECT_EQ(zorva::host::subnetMask(25), "255.255.255.128");
  EXPECT_EQ(zorva::host::subnetMask(32), "255.255.255.255");
  EXPECT_EQ(zorva::host::subnetMask(33), "255.255.255.255");
}

}  // namespace
}  // namespace ZV::Test
