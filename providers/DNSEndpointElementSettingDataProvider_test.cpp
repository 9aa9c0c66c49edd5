#include "providers/testing/AssociationTest.h"

namespace ZV::Test {
namespace {

class EndpointElementSettingData : public AssociationTest {
 protected:
  EndpointElementSettingData() : AssociationTest("DNSEndPointElementSettingDataProvider") {}

  void installThree() { world.host().nic("eth1").nic("eth0").bmc().nic("bmc0").install(); }
};

TEST_F(EndpointElementSettingData, PairsAnEndpointWithTheSettingOfItsInterface) {
  installThree();
  EXPECT_THAT(enumerated(), ElementsAre("bmc0 > BMC%bmc0", "eth0 > Computer%eth0", "eth1 > Computer%eth1"));
  EXPECT_TRUE(isFound(endpointPath("eth0"), settingPath("Computer%eth0")));
  EXPECT_FALSE(isFound(endpointPath("eth0"), settingPath("Computer%eth1")));
  EXPECT_THAT(associated(endpointPath("eth0")), ElementsAre("Computer%eth0"));
  EXPECT_THAT(associated(settingPath("Computer%eth0")), ElementsAre("eth0"));
  EXPECT_THAT(referred(endpointPath("eth0")), ElementsAre("eth0 > Computer%eth0"));
  EXPECT_THAT(referred(settingPath("Computer%eth0")), ElementsAre("eth0 > Computer%eth0"));
}

TEST_F(EndpointElementSettingData, OneEndpointMeetsTheSettingsOfBothSystems) {
  world.host().nic("eth0").nic("eth1").bmc().nic("eth0").install();
  EXPECT_THAT(enumerated(), ElementsAre("eth0 > Computer%eth0", "eth0 > BMC%eth0", "eth1 > Computer%eth1"));
  EXPECT_THAT(associated(endpointPath("eth0")), ElementsAre("Computer%eth0", "BMC%eth0"));
  EXPECT_THAT(referred(endpointPath("eth0")), ElementsAre("eth0 > Computer%eth0", "eth0 > BMC%eth0"));
}

TEST_F(EndpointElementSettingData, NamesAreComparedWholeAndByCase) {
  world.host().nic("eth").nic("eth0").nic("ETH0").nic("eth01").install();
  EXPECT_THAT(enumerated(), ElementsAre("ETH0 > Computer%ETH0", "eth > Computer%eth", "eth0 > Computer%eth0",
                                        "eth01 > Computer%eth01"));
  EXPECT_THAT(referred(endpointPath("Eth0")), IsEmpty());
  EXPECT_THAT(referred(settingPath("Computer%eth1")), IsEmpty());
}

TEST_F(EndpointElementSettingData, PercentSignInANameCutsIt) {
  world.host().nic("eth0").nic("eth0%x").nic("%y").nic("z%").install();
  EXPECT_THAT(enumerated(), ElementsAre("eth0 > Computer%eth0", "eth0 > Computer%eth0%x"));
}

TEST_F(EndpointElementSettingData, EnumerationsPassOverASettingWithoutASecondToken) {
  world.host().nic("eth0").nic("").nic("x", {.isUnnamed = true}).bmc().nic("eth0").install();
  EXPECT_THAT(enumerated(), ElementsAre("eth0 > Computer%eth0", "eth0 > BMC%eth0"));
}

TEST_F(EndpointElementSettingData, AssociationOperationsEndAtASettingWithoutASecondToken) {
  world.host().nic("eth0").nic("").bmc().nic("eth0").install();
  EXPECT_THAT(associated(endpointPath("eth0")), ElementsAre("Computer%eth0"));
  EXPECT_THAT(referred(endpointPath("eth0")), ElementsAre("eth0 > Computer%eth0"));
}

TEST_F(EndpointElementSettingData, SettingLeadsToTheEndpointOfItsSecondToken) {
  installThree();
  for (const std::string instanceID : {"Computer%eth0", "BMC%eth0", "x%eth0", "Computer%eth0%x", "Computer%%eth0",
                                       "%Computer%eth0", "Computer%eth0%", "%%Computer%%eth0%%x%%"}) {
    SCOPED_TRACE(instanceID);
    EXPECT_THAT(associated(settingPath(instanceID)), ElementsAre("eth0"));
    EXPECT_THAT(referred(settingPath(instanceID)), ElementsAre("eth0 > " + instanceID));
  }
}

TEST_F(EndpointElementSettingData, SettingWithoutASecondTokenLeadsNowhere) {
  installThree();
  for (const char* instanceID : {"", "%", "%%%", "Computereth0", "%eth0", "eth0%", "%%eth0%%", "dnsgen1:host1"}) {
    SCOPED_TRACE(instanceID);
    EXPECT_THAT(associated(settingPath(instanceID)), IsEmpty());
    EXPECT_THAT(referred(settingPath(instanceID)), IsEmpty());
  }
  for (const Path& source :
       {Path(kSettingClass), Path(kSettingClass).key("InstanceID", uint16(7)), Path(kEndpointClass)}) {
    EXPECT_THAT(associated(source), IsEmpty());
    EXPECT_THAT(referred(source), IsEmpty());
  }
}

}  // namespace
}  // namespace ZV::Test
