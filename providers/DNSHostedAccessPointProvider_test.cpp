#include "providers/testing/AssociationTest.h"

namespace ZV::Test {
namespace {

class HostedAccessPoint : public AssociationTest {
 protected:
  HostedAccessPoint() : AssociationTest("DNSHostedAccessPointProvider") {}

  void serve(const Names& systems) { AssociationTest::serve(kSystemClass, systemPath, systems); }
};

TEST_F(HostedAccessPoint, PairsASystemWithTheEndpointsThatHaveItsName) {
  world.nic("eth1").nic("eth0").install();
  serve({"host1"});
  EXPECT_THAT(enumerated(), ElementsAre("host1 > eth0", "host1 > eth1"));
  EXPECT_TRUE(isFound(systemPath("host1"), endpointPath("eth1")));
  EXPECT_THAT(associated(systemPath("host1")), ElementsAre("eth0", "eth1"));
  EXPECT_THAT(associated(endpointPath("eth0")), ElementsAre("host1"));
  EXPECT_THAT(referred(systemPath("host1")), ElementsAre("host1 > eth0", "host1 > eth1"));
  EXPECT_THAT(referred(endpointPath("eth1")), ElementsAre("host1 > eth1"));
}

TEST_F(HostedAccessPoint, SystemWhoseNameHasTheHostsAsAPartIsPairedByTheInstancesAlone) {
  world.nic("eth0").install();
  for (const std::string system : {"host1.example.org", "myhost1", "myhost10"}) {
    SCOPED_TRACE(system);
    serve({system});
    EXPECT_THAT(built(), ElementsAre(system + " > eth0"));
    EXPECT_TRUE(isFound(systemPath(system), endpointPath("eth0")));
    EXPECT_THAT(named(), IsEmpty());
    for (const Path& source : {systemPath(system), endpointPath("eth0")}) {
      EXPECT_THAT(associated(source), IsEmpty());
      EXPECT_THAT(referred(source), IsEmpty());
    }
  }
}

TEST_F(HostedAccessPoint, SystemOfAnotherNameIsPairedWithNothing) {
  world.nic("eth0").install();
  for (const char* system : {"host2", "HOST1", "host", ""}) {
    SCOPED_TRACE(system);
    serve({system});
    EXPECT_THAT(enumerated(), IsEmpty());
    for (const Path& source : {systemPath(system), endpointPath("eth0")}) {
      EXPECT_THAT(associated(source), IsEmpty());
      EXPECT_THAT(referred(source), IsEmpty());
    }
  }
}

TEST_F(HostedAccessPoint, ServiceProcessorIsPairedWithItsEndpointsButTheyAreNotItsAssociators) {
  world.host("host1").nic("eth0").bmc().nic("bmc0").install();
  serve({"host1", "BMC:-1"});
  EXPECT_THAT(enumerated(), ElementsAre("host1 > eth0", "BMC:-1 > bmc0"));
  EXPECT_THAT(associated(systemPath("BMC:-1")), IsEmpty());
  EXPECT_THAT(referred(systemPath("BMC:-1")), ElementsAre("BMC:-1 > bmc0"));
  EXPECT_THAT(associated(endpointPath("bmc0", "BMC:-1")), ElementsAre("BMC:-1"));
}

TEST_F(HostedAccessPoint, EverySystemOfTheNameIsPaired) {
  world.nic("eth0").install();
  serve({"host1", "host2", "host1"});
  EXPECT_THAT(enumerated(), ElementsAre("host1 > eth0", "host1 > eth0"));
  EXPECT_THAT(associated(endpointPath("eth0")), ElementsAre("host1", "host1"));
  EXPECT_THAT(referred(endpointPath("eth0")), ElementsAre("host1 > eth0", "host1 > eth0"));
}

TEST_F(HostedAccessPoint, SourceWithoutTheKeyThatIsComparedMatchesWhatHasNone) {
  world.nic("eth0").install();
  serve({"host1"});
  for (const Path& source :
       {Path(kSystemClass), Path(kEndpointClass), Path(kEndpointClass).key("SystemName", uint16(1))}) {
    EXPECT_THAT(associated(source), IsEmpty());
    EXPECT_THAT(referred(source), IsEmpty());
  }
  broker.serve(kSystemClass, {Instance(kSystemClass)});
  EXPECT_THAT(associated(Path(kEndpointClass)), ElementsAre(kSystemClass));
}

}  // namespace
}  // namespace ZV::Test
