#include "providers/testing/AssociationTest.h"

namespace ZV::Test {
namespace {

class OrderedComponent : public AssociationTest {
 protected:
  OrderedComponent() : AssociationTest("DNSOrderedComponentProvider") {}

  void serve(const Names& instanceIDs) { AssociationTest::serve(kIpAssignmentClass, ipAssignmentPath, instanceIDs); }
};

TEST_F(OrderedComponent, PairsAnAssignmentWithTheSettingOfItsInterface) {
  world.host().nic("eth1").nic("eth0").install();
  serve({"Computer%eth0%ipv4", "Computer%eth1%ipv4", "Computer%eth0%ipv6"});
  EXPECT_THAT(enumerated(), ElementsAre("Computer%eth0%ipv4 > Computer%eth0", "Computer%eth1%ipv4 > Computer%eth1",
                                        "Computer%eth0%ipv6 > Computer%eth0"));
  EXPECT_TRUE(isFound(ipAssignmentPath("Computer%eth0%ipv6"), settingPath("Computer%eth0")));
  EXPECT_THAT(associated(settingPath("Computer%eth0")), ElementsAre("Computer%eth0%ipv4", "Computer%eth0%ipv6"));
  EXPECT_THAT(associated(ipAssignmentPath("Computer%eth1%ipv4")), ElementsAre("Computer%eth1"));
  EXPECT_THAT(referred(ipAssignmentPath("Computer%eth0%ipv4")), ElementsAre("Computer%eth0%ipv4 > Computer%eth0"));
}

TEST_F(OrderedComponent, ReferencesOfASettingNameTheAssignmentsClassAndTheirNamesTheSetting) {
  world.host().nic("eth0").install();
  serve({"Computer%eth1%ipv4", "Computer%eth0%ipv4"});
  EXPECT_THAT(pairsIn(associations.references(settingPath("Computer%eth0"))),
              ElementsAre("Computer%eth0%ipv4 > ZORVA_IPAssignmentSettingData"));
  EXPECT_THAT(pairsIn(associations.referenceNames(settingPath("Computer%eth0"))),
              ElementsAre("Computer%eth0%ipv4 > Computer%eth0"));
}

struct Cut {
  const char* assignment;
  const char* setting;  // that it belongs to; null for none
};

// On a host with the interfaces eth0 and "eth0%".
const Cut kCuts[] = {
    {"Computer%eth0%ipv4", "Computer%eth0"},
    {"Computer%eth0%", "Computer%eth0"},
    {"Computer%eth0%%", "Computer%eth0%"},
    {"Computer%eth0%a%b", nullptr},
    {"Computer%eth0", nullptr},
    {"Computer%ETH0%ipv4", nullptr},
    {"Computer%eth01%ipv4", nullptr},
    {"BMC%eth0%ipv4", nullptr},
    {"%Computer%eth0%ipv4", nullptr},
    {"%", nullptr},
    {"%ipv4", nullptr},
    {"%%", nullptr},
};

TEST_F(OrderedComponent, TextBeforeTheLastPercentSignIsCompared) {
  world.host().nic("eth0").nic("eth0%").install();
  for (const auto& [assignment, setting] : kCuts) {
    SCOPED_TRACE(assignment);
    serve({assignment});
    const Path source = ipAssignmentPath(assignment);
    const Names settings = setting == nullptr ? Names() : Names{setting};
    const Names pairs = setting == nullptr ? Names() : Names{std::string(assignment) + " > " + setting};
    EXPECT_EQ(pairs, enumerated());
    EXPECT_EQ(settings, associated(source));
    EXPECT_EQ(pairs, referred(source));
    if (setting != nullptr) {
      EXPECT_THAT(associated(settingPath(setting)), ElementsAre(assignment));
    }
  }
}

TEST_F(OrderedComponent, EmptyTextBeforeThePercentSignIsThatOfASettingWithoutItsKey) {
  world.host().nic("eth0", {.isUnnamed = true}).install();
  serve({"%ipv4", "%%"});
  EXPECT_THAT(enumerated(), ElementsAre("%ipv4 > ZORVA_DNSSettingData"));
  EXPECT_THAT(associated(ipAssignmentPath("%ipv4")), ElementsAre(kSettingClass));
  serve({"%ipv4"});
  EXPECT_THAT(associated(Path(kSettingClass)), ElementsAre("%ipv4"));
}

TEST_F(OrderedComponent, MatchDoesNotEndTheSearchAmongTheSettings) {
  world.host().nic("eth0").nic("eth0").install();
  serve({"Computer%eth0%ipv4"});
  EXPECT_EQ(2U, enumerated().size());
  EXPECT_EQ(2U, associated(ipAssignmentPath("Computer%eth0%ipv4")).size());
  EXPECT_EQ(2U, referred(ipAssignmentPath("Computer%eth0%ipv4")).size());
}

TEST_F(OrderedComponent, EnumerationsPassOverAnAssignmentWithoutAPercentSignAndTheOthersEndAtIt) {
  world.host().nic("eth0").install();
  serve({"Computer%eth0%ipv4", "malformed", "Computer%eth0%ipv6"});
  EXPECT_THAT(enumerated(), ElementsAre("Computer%eth0%ipv4 > Computer%eth0", "Computer%eth0%ipv6 > Computer%eth0"));
  EXPECT_THAT(associated(settingPath("Computer%eth0")), ElementsAre("Computer%eth0%ipv4"));
  EXPECT_THAT(associated(ipAssignmentPath("malformed")), IsEmpty());
}

TEST_F(OrderedComponent, HostWithoutSettingsHasNoAssociation) {
  world.install();
  serve({"Computer%eth0%ipv4"});
  EXPECT_THAT(enumerated(), IsEmpty());
  EXPECT_THAT(associated(ipAssignmentPath("Computer%eth0%ipv4")), IsEmpty());
}

}  // namespace
}  // namespace ZV::Test
