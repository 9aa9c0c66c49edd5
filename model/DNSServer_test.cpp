#include "model/DNSServer.h"

#include <vector>

#include "tests/support/Matchers.h"
#include "tests/support/RecordingLogger.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

DNSServer serverAt(const std::string& address) {
  DNSServer server;
  server.setAccessInfo(address);
  return server;
}

TEST(DNSServer, IsTheFirstInOrderWhenItIsMade) {
  const DNSServer server;
  EXPECT_EQ("", server.getAccessInfo());
  EXPECT_EQ(1, server.getOrderOfAccess());
}

TEST(DNSServer, FormatAndContextAreFixedAlsoOnAnEmptyRecord) {
  DNSServer server;
  EXPECT_EQ("DNSServer", server.getNameFormat());
  EXPECT_EQ(3, server.getAccessContext());
  EXPECT_EQ("", server.getElementName());
  EXPECT_EQ(3, server.getInfoFormat());
}

TEST(DNSServer, AddressIsItsElementNameToo) {
  DNSServer server = serverAt("192.0.2.53");
  EXPECT_EQ("192.0.2.53", server.getAccessInfo());
  EXPECT_EQ("192.0.2.53", server.getElementName());
  server.setAccessInfo("192.0.2.54");
  EXPECT_EQ("192.0.2.54", server.getElementName());
}

TEST(DNSServer, OnlyAColonMakesAnAddressIPv6) {
  for (const char* address : {"2001:db8::53", ":", "a:", "not an address: at all"}) {
    EXPECT_EQ(4, serverAt(address).getInfoFormat()) << address;
  }
  for (const char* address : {"192.0.2.53", "", "dns.example.org", "20010db8"}) {
    EXPECT_EQ(3, serverAt(address).getInfoFormat()) << address;
  }
}

TEST(DNSServer, OrderIsStored) {
  DNSServer server;
  EXPECT_EQ(0, server.setOrderOfAccess(7));
  EXPECT_EQ(7, server.getOrderOfAccess());
  EXPECT_EQ(0, server.setOrderOfAccess(0));
  EXPECT_EQ(0, server.getOrderOfAccess());
}

// The walk over the installed tree, its return value, its records and its log lines.
struct Walk {
  unsigned short answer = 0;
  std::map<std::string, DNSServer> found;
  LogLines lines;

  explicit Walk(std::map<std::string, DNSServer> before = {}) : found(std::move(before)) {
    const RecordingLogger logger;
    answer = getDNSServerInstances(found);
    lines = logger.pairs();
  }
  // Addresses with their positions, in the order of the map.
  std::vector<std::pair<std::string, int>> places() const {
    std::vector<std::pair<std::string, int>> all;
    for (const auto& [address, server] : found) {
      EXPECT_EQ(address, server.getAccessInfo());
      all.emplace_back(address, server.getOrderOfAccess());
    }
    return all;
  }
};

using Place = std::pair<std::string, int>;

TEST(DNSServerWalk, TreeWithoutInterfacesIsASuccessWithNothing) {
  World world;
  world.host().install();
  const Walk walk;
  EXPECT_EQ(0, walk.answer);
  EXPECT_THAT(walk.found, IsEmpty());
  EXPECT_THAT(walk.lines.briefs(), ElementsAre("3000 ENTERING getDNSServerInstances, dnsServerMap=ADDR",
                                               "3000 EXITING getDNSServerInstances, dnsServerMap=ADDR"));
}

TEST(DNSServerWalk, RecordsAreSortedAndKeepTheirPlaceInTheList) {
  World world;
  world.nic("eth0", {.servers = {"192.0.2.9", "192.0.2.1", "10.0.0.1"}}).install();
  const Walk walk;
  EXPECT_EQ(0, walk.answer);
  EXPECT_THAT(walk.places(), ElementsAre(Place("10.0.0.1", 3), Place("192.0.2.1", 2), Place("192.0.2.9", 1)));
}

TEST(DNSServerWalk, LogsItsSteps) {
  World world;
  world.nic("eth0", {.servers = {"192.0.2.9", "", "192.0.2.9"}}).install();
  const Walk walk;
  EXPECT_THAT(
      walk.lines.briefsWithCategory(),
      ElementsAre("Zorvagent.DNSClient 3000 ENTERING getDNSServerInstances, dnsServerMap=ADDR",
                  "Zorvagent.DNSClient 4000 VARIABLE name = 192.0.2.9",
                  "Zorvagent.DNSClient 4000 VARIABLE name = ", "Zorvagent.DNSClient 4000 VARIABLE name = 192.0.2.9",
                  "Zorvagent.DNSClient 3000 EXITING getDNSServerInstances, dnsServerMap=ADDR"));
  for (const LogLine& line : walk.lines) EXPECT_EQ("getDNSServerInstances", line.function);
}

TEST(DNSServerWalk, EmptyEntryMakesNoRecordAndHasItsPlace) {
  World world;
  world.nic("eth0", {.servers = {"192.0.2.1", "", "192.0.2.3"}}).install();
  EXPECT_THAT(Walk().places(), ElementsAre(Place("192.0.2.1", 1), Place("192.0.2.3", 3)));
}

TEST(DNSServerWalk, RepeatedAddressInAListKeepsItsFirstPlace) {
  World world;
  world.nic("eth0", {.servers = {"192.0.2.1", "192.0.2.2", "192.0.2.1", "192.0.2.4"}}).install();
  EXPECT_THAT(Walk().places(), ElementsAre(Place("192.0.2.1", 1), Place("192.0.2.2", 2), Place("192.0.2.4", 4)));
}

TEST(DNSServerWalk, AddressOfTwoNodesKeepsThePlaceOfTheFirst) {
  World world;
  world.nic("eth0", {.servers = {"192.0.2.1", "192.0.2.2"}}).nic("eth1", {.servers = {"192.0.2.2", "192.0.2.3"}});
  world.install();
  EXPECT_THAT(Walk().places(), ElementsAre(Place("192.0.2.1", 1), Place("192.0.2.2", 2), Place("192.0.2.3", 2)));
}

TEST(DNSServerWalk, NodesWithoutAListAreSteppedOver) {
  World world;
  world.nic("eth0").nic("eth1", {.servers = noTexts()}).nic("eth2", {.servers = {"192.0.2.1"}}).install();
  EXPECT_THAT(Walk().places(), ElementsAre(Place("192.0.2.1", 1)));
}

TEST(DNSServerWalk, ServersOfTheServiceProcessorCountToo) {
  World world;
  world.nic("eth0", {.servers = {"192.0.2.1"}}).bmc().nic("bmc0", {.servers = {"198.51.100.1"}}).install();
  EXPECT_THAT(Walk().places(), ElementsAre(Place("192.0.2.1", 1), Place("198.51.100.1", 1)));
}

TEST(DNSServerWalk, AddsToTheMapThatItIsGiven) {
  World world;
  world.nic("eth0", {.servers = {"192.0.2.9", "192.0.2.1"}}).install();
  DNSServer before = serverAt("192.0.2.1");
  before.setOrderOfAccess(5);
  EXPECT_THAT(Walk({{"192.0.2.1", before}}).places(), ElementsAre(Place("192.0.2.1", 5), Place("192.0.2.9", 1)));
}

TEST(DNSServerWalk, UnreadableTreeIsLoggedWithoutAnExitLine) {
  World world;
  world.installUnreadable();
  const Walk walk;
  EXPECT_EQ(1, walk.answer);
  EXPECT_THAT(walk.lines.briefs(),
              ElementsAre("3000 ENTERING getDNSServerInstances, dnsServerMap=ADDR", "6000 MESSAGE Caught Exception"));
}

TEST(DNSServerWalk, EveryFailureOfTheTreeIsCaughtAndKeepsWhatWasReached) {
  World world;
  world.nic("eth0", {.servers = {"192.0.2.1"}}).nic("eth1", {.servers = {"192.0.2.2"}}).install();
  std::vector<std::size_t> reached;
  forEachTreeFailure([&](std::size_t, Thrown thrown) {
    const RecordingLogger logger;
    std::map<std::string, DNSServer> found;
    if (thrown == Thrown::Int) {
      try {
        getDNSServerInstances(found);
      } catch (int) {  // an exception that is no std::exception leaves the function
        EXPECT_FALSE(logger.pairs().exited("getDNSServerInstances"));
      }
      return;
    }
    const unsigned short answer = getDNSServerInstances(found);
    EXPECT_EQ(answer == 0, logger.pairs().exited("getDNSServerInstances"));
    EXPECT_EQ(answer == 0 ? 0U : 1U, logger.pairs().errors().size());
    reached.push_back(found.size());
  });
  // The failing calls: making the cursor, placing it, then for each node a test, its list and the step to the next; the
  // last test; no failure at all.
  EXPECT_THAT(reached, ElementsAre(0, 0, 0, 0, 1, 1, 1, 2, 2, 2));
}

}  // namespace
}  // namespace ZV::Test
