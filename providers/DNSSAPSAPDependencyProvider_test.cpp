#include "providers/testing/AssociationTest.h"

namespace ZV::Test {
namespace {

class SAPSAPDependency : public AssociationTest {
 protected:
  SAPSAPDependency() : AssociationTest("DNSSAPSAPDependencyProvider") {}

  void serve(const Names& ipEndpoints) { AssociationTest::serve(kIpEndpointClass, ipEndpointPath, ipEndpoints); }
};

TEST_F(SAPSAPDependency, PairsTheEndpointsOfOneName) {
  world.nic("eth0").nic("eth1").install();
  serve({"eth1", "eth2", "eth0"});
  EXPECT_THAT(enumerated(), ElementsAre("eth1 > eth1", "eth0 > eth0"));
  EXPECT_TRUE(isFound(ipEndpointPath("eth0"), endpointPath("eth0")));
  EXPECT_FALSE(isFound(ipEndpointPath("eth0"), endpointPath("eth1")));
  EXPECT_THAT(associated(endpointPath("eth0")), ElementsAre("eth0"));
  EXPECT_THAT(associated(ipEndpointPath("eth0")), ElementsAre("eth0"));
  EXPECT_THAT(referred(endpointPath("eth0")), ElementsAre("eth0 > eth0"));
  EXPECT_THAT(referred(ipEndpointPath("eth0")), ElementsAre("eth0 > eth0"));
}

struct IpName {
  const char* name;
  bool isWhole;       // equals eth0
  bool beginsWithIt;  // its first token equals eth0
};
constexpr IpName kIpNames[] = {
    {"eth0", true, true},     {"eth0_1", false, true},      {"eth0_1_2", false, true}, {"eth0_", false, true},
    {"_eth0", false, true},   {"__eth0__1__", false, true}, {"_", false, false},       {"___", false, false},
    {"", false, false},       {"ETH0", false, false},       {"eth", false, false},     {"eth01", false, false},
    {"1_eth0", false, false}, {"eth0 _1", false, false},    {"eth0:1", false, false},
};

TEST_F(SAPSAPDependency, EnumerationsAndAssociatorsOfAnIpEndpointCompareWholeNames) {
  world.nic("eth0").install();
  for (const IpName& ip : kIpNames) {
    SCOPED_TRACE(ip.name);
    serve({ip.name});
    const Names pairs(ip.isWhole ? 1 : 0, std::string(ip.name) + " > eth0");
    EXPECT_EQ(pairs, enumerated());
    EXPECT_EQ(ip.isWhole, isFound(ipEndpointPath(ip.name), endpointPath("eth0")));
    EXPECT_EQ(Names(pairs.size(), "eth0"), associated(ipEndpointPath(ip.name)));
  }
}

TEST_F(SAPSAPDependency, ReferencesAndAssociatorsOfADnsEndpointCompareTheFirstToken) {
  world.nic("eth0").install();
  for (const IpName& ip : kIpNames) {
    SCOPED_TRACE(ip.name);
    serve({ip.name});
    const Names pairs(ip.beginsWithIt ? 1 : 0, std::string(ip.name) + " > eth0");
    EXPECT_EQ(pairs, referred(endpointPath("eth0")));
    EXPECT_EQ(pairs, referred(ipEndpointPath(ip.name)));
    EXPECT_EQ(Names(pairs.size(), ip.name), associated(endpointPath("eth0")));
  }
}

TEST_F(SAPSAPDependency, OfTwoIpEndpointsWithOneFirstTokenTheFirstIsAssociatedAndBothAreReferred) {
  world.nic("eth0").install();
  serve({"eth1", "eth0_2", "eth0_1"});
  EXPECT_THAT(associated(endpointPath("eth0")), ElementsAre("eth0_2"));
  EXPECT_THAT(referred(endpointPath("eth0")), ElementsAre("eth0_2 > eth0", "eth0_1 > eth0"));
}

TEST_F(SAPSAPDependency, DnsEndpointWithAnUnderscoreInItsNameIsFoundByWholeNameAlone) {
  world.nic("eth0_1").install();
  serve({"eth0_1"});
  EXPECT_THAT(enumerated(), ElementsAre("eth0_1 > eth0_1"));
  EXPECT_THAT(associated(ipEndpointPath("eth0_1")), ElementsAre("eth0_1"));
  EXPECT_THAT(associated(endpointPath("eth0_1")), IsEmpty());
  EXPECT_THAT(referred(endpointPath("eth0_1")), IsEmpty());
  EXPECT_THAT(referred(ipEndpointPath("eth0_1")), IsEmpty());
}

TEST_F(SAPSAPDependency, IpEndpointThatIsNotFoundIsNotPairedWithTheDnsEndpointBeforeIt) {
  world.nic("eth0").nic("eth1").install();
  serve({"eth9", "eth1", "eth9", "eth0", "eth9"});
  EXPECT_THAT(enumerated(), ElementsAre("eth1 > eth1", "eth0 > eth0"));
}

TEST_F(SAPSAPDependency, EndpointWithoutANameMatchesNothing) {
  world.nic("eth0").install();
  broker.serve(kIpEndpointClass, objectsOf({Path(kIpEndpointClass), Path(kIpEndpointClass).key("Name", uint16(0))}));
  EXPECT_THAT(enumerated(), IsEmpty());
  for (const Path& source : {endpointPath("eth0"), Path(kEndpointClass), Path(kIpEndpointClass),
                             Path(kIpEndpointClass).key("Name", uint16(0))}) {
    EXPECT_THAT(associated(source), IsEmpty());
    EXPECT_THAT(referred(source), IsEmpty());
  }
}

}  // namespace
}  // namespace ZV::Test
