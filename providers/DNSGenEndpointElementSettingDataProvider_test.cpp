#include "providers/testing/AssociationTest.h"

namespace ZV::Test {
namespace {

class GenEndpointElementSettingData : public AssociationTest {
 protected:
  GenEndpointElementSettingData() : AssociationTest("DNSGenEndPointElementSettingDataProvider") {}
};

TEST_F(GenEndpointElementSettingData, PairsEveryEndpointWithTheGeneralSetting) {
  world.host().nic("eth1").nic("eth0").bmc().nic("bmc0").install();
  EXPECT_THAT(enumerated(), ElementsAre("bmc0 > dnsgen1:host1", "eth0 > dnsgen1:host1", "eth1 > dnsgen1:host1"));
  EXPECT_TRUE(isFound(endpointPath("eth0"), generalSettingPath()));
  EXPECT_THAT(associated(generalSettingPath()), ElementsAre("bmc0", "eth0", "eth1"));
  EXPECT_THAT(associated(endpointPath("eth0")), ElementsAre("dnsgen1:host1"));
  EXPECT_THAT(referred(generalSettingPath()),
              ElementsAre("bmc0 > dnsgen1:host1", "eth0 > dnsgen1:host1", "eth1 > dnsgen1:host1"));
  EXPECT_THAT(referred(endpointPath("eth0")), ElementsAre("eth0 > dnsgen1:host1"));
}

TEST_F(GenEndpointElementSettingData, NoKeyOfASourceIsCompared) {
  world.host().nic("eth0").install();
  for (const Path& source : {endpointPath("nobody"), Path(kEndpointClass)}) {
    EXPECT_THAT(associated(source), ElementsAre("dnsgen1:host1"));
    EXPECT_THAT(referred(source), ElementsAre(nameOf(source) + " > dnsgen1:host1"));
  }
  EXPECT_THAT(associated(generalSettingPath("another")), ElementsAre("eth0"));
  EXPECT_THAT(referred(generalSettingPath("another")), ElementsAre("eth0 > another"));
}

TEST_F(GenEndpointElementSettingData, ReferencesAreOfThisClassAndTheirNamesOfTheSister) {
  world.host().nic("eth0").install();
  for (const Path& source : {endpointPath("eth0"), generalSettingPath()}) {
    EXPECT_EQ(under.className, associations.references(source).instances().at(0).path.className);
    EXPECT_EQ("ZORVA_DNSEndPointElementSettingData", associations.referenceNames(source).paths().at(0).className);
  }
}

TEST_F(GenEndpointElementSettingData, HostWithoutInterfacesOfItsOwnHasNoSettingToPair) {
  world.bmc().nic("bmc0").install();
  EXPECT_THAT(enumerated(), IsEmpty());
  EXPECT_THAT(associated(endpointPath("bmc0")), IsEmpty());
  EXPECT_THAT(referred(endpointPath("bmc0")), IsEmpty());
}

}  // namespace
}  // namespace ZV::Test
