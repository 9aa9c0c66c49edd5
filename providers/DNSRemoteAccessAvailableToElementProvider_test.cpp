#include "providers/testing/AssociationTest.h"

namespace ZV::Test {
namespace {

class RemoteAccessAvailableToElement : public AssociationTest {
 protected:
  RemoteAccessAvailableToElement() : AssociationTest("DNSRemoteAccessAvailableToElementProvider") {}

  // Addresses sort as text; eth1 asks 192.0.2.1 second.
  void installTwoOfEach() {
    world.nic("eth1", {.servers = {"192.0.2.2", "192.0.2.1"}}).nic("eth0", {.servers = {"192.0.2.2"}}).install();
  }
  std::vector<std::uint64_t> orders() {
    std::vector<std::uint64_t> all;
    const Outcome outcome = instances.enumerateInstances(associationClass());
    for (const Instance& one : outcome.instances()) all.push_back(one["OrderOfAccess"].number());
    return all;
  }
};

TEST_F(RemoteAccessAvailableToElement, PairsEveryServerWithEveryEndpoint) {
  installTwoOfEach();
  EXPECT_THAT(enumerated(),
              ElementsAre("192.0.2.1 > eth0", "192.0.2.1 > eth1", "192.0.2.2 > eth0", "192.0.2.2 > eth1"));
  EXPECT_TRUE(isFound(serverPath("192.0.2.1"), endpointPath("eth1")));
  EXPECT_THAT(associated(endpointPath("eth0")), ElementsAre("192.0.2.1", "192.0.2.2"));
  EXPECT_THAT(associated(serverPath("192.0.2.1")), ElementsAre("eth0", "eth1"));
  EXPECT_THAT(referred(endpointPath("eth0")), ElementsAre("192.0.2.1 > eth0", "192.0.2.2 > eth0"));
  EXPECT_THAT(referred(serverPath("192.0.2.1")), ElementsAre("192.0.2.1 > eth0", "192.0.2.1 > eth1"));
}

TEST_F(RemoteAccessAvailableToElement, OrderOfAccessIsTheServersPlaceInTheListOfAnInterface) {
  installTwoOfEach();
  EXPECT_THAT(orders(), ElementsAre(2, 2, 1, 1));
}

TEST_F(RemoteAccessAvailableToElement, EndpointWithoutServersHasTheOrderOfTheServer) {
  world.nic("eth0", {.servers = {"192.0.2.9"}}).nic("eth1").install();
  EXPECT_THAT(orders(), ElementsAre(1, 1));
}

TEST_F(RemoteAccessAvailableToElement, OnlyObjectsOfTheSourcesSystemAreAssociated) {
  world.host("host1").nic("eth0", {.servers = {"192.0.2.1"}}).bmc().nic("bmc0").install();
  EXPECT_THAT(associated(serverPath("192.0.2.1")), ElementsAre("eth0"));
  EXPECT_THAT(associated(serverPath("192.0.2.1", "BMC:-1")), ElementsAre("bmc0"));
  EXPECT_THAT(associated(serverPath("192.0.2.1", "host2")), IsEmpty());
  EXPECT_THAT(associated(serverPath("192.0.2.1", "HOST1")), IsEmpty());
  EXPECT_THAT(associated(endpointPath("bmc0", "BMC:-1")), IsEmpty());
  EXPECT_THAT(associated(Path(kServerClass)), IsEmpty());  // without the key SystemName
  EXPECT_THAT(associated(Path(kServerClass).key("SystemName", uint16(1))), IsEmpty());
}

TEST_F(RemoteAccessAvailableToElement, SourceThatDoesNotExistIsReferredToAllTheSame) {
  installTwoOfEach();
  for (const Path& source : {endpointPath("eth9"), endpointPath("eth9", "host2")}) {
    EXPECT_THAT(referred(source), ElementsAre("192.0.2.1 > eth9", "192.0.2.2 > eth9"));
  }
  EXPECT_THAT(referred(serverPath("192.0.2.9")), ElementsAre("192.0.2.9 > eth0", "192.0.2.9 > eth1"));
  EXPECT_THAT(referred(Path(kServerClass)),
              ElementsAre("ZORVA_RemoteServiceAccessPoint > eth0", "ZORVA_RemoteServiceAccessPoint > eth1"));
}

}  // namespace
}  // namespace ZV::Test
