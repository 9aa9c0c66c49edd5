#include <stdexcept>

#include "providers/testing/AssociationTest.h"

namespace ZV::Test {
namespace {

class GeneralOrderedComponent : public AssociationTest {
 protected:
  GeneralOrderedComponent() : AssociationTest("DNSGeneralOrderedComponentProvider") {
    broker.serve(kIpAssignmentClass, objectsOf({ipAssignmentPath("second"), ipAssignmentPath("first")}));
  }
};

TEST_F(GeneralOrderedComponent, PairsEveryAssignmentWithTheGeneralSetting) {
  world.host().nic("eth0").install();
  EXPECT_THAT(enumerated(), ElementsAre("second > dnsgen1:host1", "first > dnsgen1:host1"));
  EXPECT_TRUE(isFound(ipAssignmentPath("first"), generalSettingPath()));
  EXPECT_THAT(associated(generalSettingPath()), ElementsAre("second", "first"));
  EXPECT_THAT(associated(ipAssignmentPath("first")), ElementsAre("dnsgen1:host1"));
  EXPECT_THAT(referred(ipAssignmentPath("first")), ElementsAre("first > dnsgen1:host1"));
}

TEST_F(GeneralOrderedComponent, ReferencesOfTheSettingAreReversedAndNameTheAssignmentsClassAlone) {
  world.host().nic("eth0").install();
  EXPECT_THAT(referred(generalSettingPath()), ElementsAre("dnsgen1:host1 > ZORVA_IPAssignmentSettingData",
                                                          "dnsgen1:host1 > ZORVA_IPAssignmentSettingData"));
}

TEST_F(GeneralOrderedComponent, NoKeyIsCompared) {
  world.host().nic("eth0").install();
  for (const Path& source : {ipAssignmentPath("nobody"), Path(kIpAssignmentClass)}) {
    EXPECT_THAT(associated(source), ElementsAre("dnsgen1:host1"));
    EXPECT_THAT(referred(source), ElementsAre(nameOf(source) + " > dnsgen1:host1"));
  }
  EXPECT_THAT(associated(Path(kGeneralSettingClass)), ElementsAre("second", "first"));
  broker.serve(kIpAssignmentClass, objectsOf({Path(kIpAssignmentClass), ipAssignmentPath("%")}));
  EXPECT_THAT(built(), ElementsAre("ZORVA_IPAssignmentSettingData > dnsgen1:host1", "% > dnsgen1:host1"));
}

TEST_F(GeneralOrderedComponent, WithoutAGeneralSettingAnAssignmentEndsTheInstanceOperationsInAnException) {
  world.bmc().nic("bmc0").install();
  EXPECT_THROW(built(), std::out_of_range);
  EXPECT_THROW(named(), std::out_of_range);
  EXPECT_THAT(associated(ipAssignmentPath("first")), IsEmpty());
  EXPECT_THAT(associated(generalSettingPath()), ElementsAre("second", "first"));
  broker.serve(kIpAssignmentClass);
  EXPECT_THAT(enumerated(), IsEmpty());
}

}  // namespace
}  // namespace ZV::Test
