// The servers as a client reads them.

#include "providers/testing/InstanceTest.h"

namespace ZV::Test {
namespace {

class Servers : public InstanceTest {
 protected:
  Servers() : InstanceTest("DNSRemoteServiceAccessPointProvider") {}
};

TEST_F(Servers, ComeInTheOrderOfTheAddressAndNotOfTheirPlace) {
  world.nic("eth0", {.servers = {"192.0.2.9", "192.0.2.1", "10.0.0.1"}}).install();
  std::vector<std::pair<std::string, std::uint64_t>> places;
  for (const Instance& instance : instances()) {
    places.emplace_back(instance["Name"].text(), instance["OrderOfAccess"].number());
  }
  EXPECT_THAT(places, ElementsAre(std::pair("10.0.0.1", 3U), std::pair("192.0.2.1", 2U), std::pair("192.0.2.9", 1U)));
}

TEST_F(Servers, OfAHostWithEndpointsAloneAreNone) {
  world.nic("eth0").nic("eth1", {.servers = noTexts()}).install();
  EXPECT_THAT(instances(), IsEmpty());
  EXPECT_THAT(paths(), IsEmpty());
}

TEST_F(Servers, OfTheServiceProcessorBelongToTheHostToo) {
  world.host("host1").bmc().nic("bmc0", {.servers = {"198.51.100.1"}}).install();
  ASSERT_THAT(instances(), SizeIs(1));
  EXPECT_EQ(chars("ZORVA_ComputerSystem"), instances()[0]["SystemCreationClassName"]);
  EXPECT_EQ(chars("host1"), instances()[0]["SystemName"]);
}

// A name is compared as text, not as the address that it means.
TEST_F(Servers, AddressIsFoundInItsOwnSpellingAlone) {
  world.nic("eth0", {.servers = {"2001:db8::1"}}).install();
  EXPECT_THAT(found(serverPath("2001:db8::1")), SizeIs(1));
  EXPECT_THAT(found(serverPath("2001:DB8::1")), IsEmpty());
  EXPECT_THAT(found(serverPath("2001:db8:0::1")), IsEmpty());
}

TEST_F(Servers, AreThoseOfTheMoment) {
  world.nic("eth0", {.servers = {"192.0.2.1"}}).install();
  EXPECT_THAT(instances(), SizeIs(1));
  world.nic("eth1", {.servers = {"192.0.2.2"}}).install();
  EXPECT_THAT(instances(), SizeIs(2));
}

}  // namespace
}  // namespace ZV::Test
