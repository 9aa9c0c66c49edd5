#include "providers/testing/AssociationTest.h"

namespace ZV::Test {
namespace {

class GeneralElementSettingData : public AssociationTest {
 protected:
  GeneralElementSettingData() : AssociationTest("DNSGeneralElementSettingDataProvider") { world.nic("eth0").install(); }

  void serve(const Names& systems) {
    std::vector<Path> paths;
    for (const std::string& name : systems) paths.push_back(systemPath(name));
    broker.serve(kSystemClass, objectsOf(paths));
  }
};

TEST_F(GeneralElementSettingData, EnumerationsPairASystemWhoseNameOccursInTheInstanceID) {
  for (const std::string name : {"host1", "host", "1", "dnsgen1", ":", "dnsgen1:host1", ""}) {
    SCOPED_TRACE(name);
    serve({name});
    EXPECT_THAT(enumerated(), ElementsAre(name + " > dnsgen1:host1"));
    EXPECT_TRUE(isFound(systemPath(name), generalSettingPath()));
  }
  for (const char* name : {"host2", "HOST1", "host1.example.org", "host1 "}) {
    SCOPED_TRACE(name);
    serve({name});
    EXPECT_THAT(enumerated(), IsEmpty());
    EXPECT_FALSE(isFound(systemPath(name), generalSettingPath()));
  }
}

TEST_F(GeneralElementSettingData, AssociatorsCompareNothing) {
  serve({"host1", "host2"});
  for (const Path& source : {generalSettingPath(), generalSettingPath("other"), Path(kGeneralSettingClass)}) {
    EXPECT_THAT(associated(source), ElementsAre("host1", "host2"));
  }
  for (const Path& source : {systemPath("host1"), systemPath("host9"), Path(kSystemClass)}) {
    EXPECT_THAT(associated(source), ElementsAre("dnsgen1:host1"));
  }
}

TEST_F(GeneralElementSettingData, ReferencesOfTheSettingAreOneForEachSystemAndNameItsClassAlone) {
  serve({"host1", "host2"});
  EXPECT_THAT(referred(generalSettingPath()),
              ElementsAre("ZORVA_ComputerSystem > dnsgen1:host1", "ZORVA_ComputerSystem > dnsgen1:host1"));
  EXPECT_THAT(referred(systemPath("host9")), ElementsAre("host9 > dnsgen1:host1"));
}

TEST_F(GeneralElementSettingData, HostWithoutInterfacesOfItsOwnHasNoSettingToPair) {
  World other;
  other.bmc().nic("bmc0").install();
  serve({"host1"});
  EXPECT_THAT(enumerated(), IsEmpty());
  EXPECT_THAT(associated(systemPath("host1")), IsEmpty());
  EXPECT_THAT(referred(systemPath("host1")), IsEmpty());
}

}  // namespace
}  // namespace ZV::Test
