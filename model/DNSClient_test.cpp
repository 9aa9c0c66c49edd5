#include "model/DNSClient.h"

#include "tests/support/Matchers.h"
#include "tests/support/RecordingLogger.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

TEST(DNSClient, IsEmptyWhenItIsMade) {
  const DNSClient client;
  EXPECT_EQ("", client.getDNSClientName());
  EXPECT_EQ("", client.getDNSSCCN());
  EXPECT_EQ("", client.getHostName());
  EXPECT_EQ("", client.getDomainName());
  EXPECT_EQ("", client.getElementName());
  EXPECT_THAT(client.getDNSSuffixesToAppend(), IsEmpty());
  EXPECT_EQ(0, client.getprotocolIFType());
  EXPECT_EQ(0, client.getEnabledState());
  EXPECT_EQ(0, client.getRequestedState());
}

TEST(DNSClient, FormatAndTypeAreFixedAlsoOnAnEmptyRecord) {
  DNSClient client;
  EXPECT_EQ("NICName", client.getNameFormat());
  EXPECT_EQ("DNS", client.getOtherTypeDescription());
}

TEST(DNSClient, NamesAreUsableUnlessEmptyAndStoredInAnyCase) {
  DNSClient client;
  EXPECT_TRUE(client.setDNSClientName("eth0"));
  EXPECT_TRUE(client.setHostName("host1"));
  EXPECT_TRUE(client.setElementName("element"));
  EXPECT_EQ("eth0", client.getDNSClientName());
  EXPECT_EQ("host1", client.getHostName());
  EXPECT_EQ("element", client.getElementName());
  EXPECT_FALSE(client.setDNSClientName(""));
  EXPECT_FALSE(client.setHostName(""));
  EXPECT_FALSE(client.setElementName(""));
  EXPECT_EQ("", client.getDNSClientName());
  EXPECT_EQ("", client.getHostName());
  EXPECT_EQ("", client.getElementName());
}

TEST(DNSClient, NamesAreNotStripped) {
  DNSClient client;
  EXPECT_TRUE(client.setDNSClientName(" "));
  EXPECT_TRUE(client.setHostName(" host1 "));
  EXPECT_EQ(" ", client.getDNSClientName());
  EXPECT_EQ(" host1 ", client.getHostName());
}

TEST(DNSClient, DomainIsStrippedAndThenUsableUnlessEmpty) {
  DNSClient client;
  EXPECT_TRUE(client.setDomainName(" \texample.org\t "));
  EXPECT_EQ("example.org", client.getDomainName());
  EXPECT_FALSE(client.setDomainName("   "));
  EXPECT_EQ("", client.getDomainName());
  EXPECT_FALSE(client.setDomainName(""));
}

TEST(DNSClient, DomainOfAMethodIsStoredAsItIs) {
  DNSClient client;
  EXPECT_EQ(0, client.setDNSDomain(" example.org "));
  EXPECT_EQ(" example.org ", client.getDomainName());
  EXPECT_EQ(0, client.setDNSDomain(""));
  EXPECT_EQ("", client.getDomainName());
}

TEST(DNSClient, ClassOfTheSystemIsAlwaysUsable) {
  DNSClient client;
  EXPECT_TRUE(client.setDNSSCCN("ZORVA_ComputerSystem"));
  EXPECT_EQ("ZORVA_ComputerSystem", client.getDNSSCCN());
  EXPECT_TRUE(client.setDNSSCCN(""));
}

TEST(DNSClient, InterfaceTypeIsAlwaysOther) {
  for (const unsigned int type : {0U, 1U, 4097U, 0xffffffffU}) {
    DNSClient client;
    EXPECT_TRUE(client.setprotocolIFType(type));
    EXPECT_EQ(1, client.getprotocolIFType());
  }
}

TEST(DNSClient, EnabledStateIsMappedFromTheHostsOwn) {
  const std::map<unsigned short, unsigned short> states = {{12, 6}, {16, 3}, {1, 2},  {0, 5},
                                                           {2, 5},  {3, 5},  {11, 5}, {65535, 5}};
  for (const auto& [raw, stored] : states) {
    DNSClient client;
    EXPECT_TRUE(client.setEnabledState(raw));
    EXPECT_EQ(stored, client.getEnabledState()) << raw;
    EXPECT_EQ(0, client.getRequestedState());
  }
}

TEST(DNSClient, RequestedStateIsAlwaysNotApplicable) {
  for (const unsigned short raw : std::vector<unsigned short>{0, 1, 12, 65535}) {
    DNSClient client;
    EXPECT_TRUE(client.setRequestedState(raw));
    EXPECT_EQ(12, client.getRequestedState());
  }
}

TEST(DNSClient, SuffixesAreReplacedAndKeepTheirOrder) {
  DNSClient client;
  EXPECT_TRUE(client.setDNSSuffixesToAppend({"old"}));
  EXPECT_TRUE(client.setDNSSuffixesToAppend({"b.org", "a.org", "b.org", ""}));
  EXPECT_THAT(client.getDNSSuffixesToAppend(), ElementsAre("b.org", "a.org", "b.org", ""));
  EXPECT_TRUE(client.setDNSSuffixesToAppend({}));
  EXPECT_THAT(client.getDNSSuffixesToAppend(), IsEmpty());
}

TEST(DNSClient, SuffixSearchOrderLeavesTheSuffixesUntouched) {
  DNSClient client;
  client.setDNSSuffixesToAppend({"example.org"});
  EXPECT_EQ(0, client.setDNSSuffixSearchOrder({"other.org", "more.org"}));
  EXPECT_THAT(client.getDNSSuffixesToAppend(), ElementsAre("example.org"));
}

TEST(DNSClient, CopyIsIndependent) {
  DNSClient client;
  client.setDomainName("example.org");
  DNSClient copy = client;
  copy.setDomainName("other.org");
  EXPECT_EQ("example.org", client.getDomainName());
}

TEST(DNSClientSearchOrder, IsAcceptedForKnownAndUnknownServersAndChangesNothing) {
  World world;
  world.nic("eth0", {.servers = {"192.0.2.1", "192.0.2.2"}}).install();
  DNSClient client;
  EXPECT_EQ(0, client.setDNSServerSearchOrder({"192.0.2.2", "192.0.2.1", "203.0.113.9", ""}));
  EXPECT_THAT(*world.list(0, NodeLexicon::PROP_DNS_SERVER_ADDRESSES), ElementsAre("192.0.2.1", "192.0.2.2"));
  EXPECT_EQ(0, client.setDNSServerSearchOrder({}));
}

TEST(DNSClientSearchOrder, IsAcceptedOnAHostWithoutServers) {
  World world;
  world.host().install();
  EXPECT_EQ(0, DNSClient().setDNSServerSearchOrder({"192.0.2.1"}));
}

TEST(DNSClientSearchOrder, FailsIfTheServersCannotBeRead) {
  World world;
  world.installUnreadable();
  EXPECT_EQ(1, DNSClient().setDNSServerSearchOrder({"192.0.2.1"}));
  EXPECT_EQ(1, DNSClient().setDNSServerSearchOrder({}));
}

// The walk over the installed tree, its return value, its records and its log lines.
struct Walk {
  unsigned short answer = 0;
  std::map<std::string, DNSClient> found;
  LogLines lines;

  explicit Walk(std::map<std::string, DNSClient> before = {}) : found(std::move(before)) {
    const RecordingLogger logger;
    answer = getDNSClientInstances(found);
    lines = logger.pairs();
  }
  DNSClient operator[](const std::string& name) const { return found.at(name); }
  std::vector<std::string> names() const {
    std::vector<std::string> all;
    for (const auto& [name, client] : found) all.push_back(name);
    return all;
  }
  // The failures that it survived, without the logged values.
  std::vector<std::string> warnings() const { return lines.ofKind(LineKind::Message).texts(4000); }
};

Walk walkOver(const NicProperties& nic, const std::string& name = "eth0") {
  World world;
  world.nic(name, nic).install();
  return Walk();
}

TEST(DNSClientWalk, TreeWithoutInterfacesGivesOneAndNothingElse) {
  World world;
  world.host().install();
  const Walk walk;
  EXPECT_EQ(1, walk.answer);
  EXPECT_THAT(walk.found, IsEmpty());
  EXPECT_THAT(walk.lines.briefs(), ElementsAre("3000 ENTERING getDNSClientInstances, dnsClientMap=ADDR",
                                               "3000 EXITING getDNSClientInstances, dnsClientMap=ADDR"));
}

TEST(DNSClientWalk, FillsARecordFromTheNode) {
  const Walk walk = walkOver(
      {.hostName = "host1", .domain = " example.org ", .suffixes = {"b.org", "a.org"}, .ifType = 4097, .state = 1});
  EXPECT_EQ(0, walk.answer);
  ASSERT_THAT(walk.names(), ElementsAre("eth0"));
  const DNSClient client = walk["eth0"];
  EXPECT_EQ("eth0", client.getDNSClientName());
  EXPECT_EQ("eth0", client.getElementName());
  EXPECT_EQ("host1", client.getHostName());
  EXPECT_EQ("example.org", client.getDomainName());
  EXPECT_THAT(client.getDNSSuffixesToAppend(), ElementsAre("b.org", "a.org"));
  EXPECT_EQ(1, client.getprotocolIFType());
  EXPECT_EQ(2, client.getEnabledState());
  EXPECT_EQ(12, client.getRequestedState());
  EXPECT_EQ("ZORVA_ComputerSystem", client.getDNSSCCN());
}

TEST(DNSClientWalk, LogsItsSteps) {
  EXPECT_THAT(walkOver({.domain = " example.org "}).lines.briefsWithCategory(),
              ElementsAre("Zorvagent.DNSClient 3000 ENTERING getDNSClientInstances, dnsClientMap=ADDR",
                          "Zorvagent.DNSClient 4000 VARIABLE string =  example.org ",
                          "Zorvagent.DNSClient 4000 VARIABLE nodeString = Computer",
                          "Zorvagent.DNSClient 3000 EXITING getDNSClientInstances, dnsClientMap=ADDR"));
}

TEST(DNSClientWalk, LinesNameTheWalkAndItsFile) {
  for (const LogLine& line : walkOver({.hostName = "", .domain = ""}).lines) {
    EXPECT_EQ("getDNSClientInstances", line.function);
    EXPECT_EQ("model/DNSClient.cpp", line.file);
    EXPECT_EQ("model/DNSClient.cpp", line.fileInText());
    EXPECT_EQ(line.line, line.lineInText());
  }
}

TEST(DNSClientWalk, RecordsAreSortedByNameByteForByte) {
  World world;
  world.nic("eth1").nic("eth0").nic("Wlan0").nic("eth10").install();
  EXPECT_THAT(Walk().names(), ElementsAre("Wlan0", "eth0", "eth1", "eth10"));
}

TEST(DNSClientWalk, NodeThatGivesNothingIsStoredUnderTheEmptyKeyWithoutAWord) {
  const Walk walk = walkOver({.isUnnamed = true});
  ASSERT_THAT(walk.names(), ElementsAre(""));
  EXPECT_EQ("", walk[""].getDNSClientName());
  EXPECT_EQ("", walk[""].getElementName());
  EXPECT_EQ("ZORVA_ComputerSystem", walk[""].getDNSSCCN());
  EXPECT_EQ(0, walk[""].getprotocolIFType());
  EXPECT_THAT(walk.warnings(), IsEmpty());
}

TEST(DNSClientWalk, SecondNodeWithoutANameReplacesTheFirst) {
  World world;
  world.nic("a", {.hostName = "first", .isUnnamed = true}).nic("b", {.domain = "second.org", .isUnnamed = true});
  world.install();
  const Walk walk;
  ASSERT_THAT(walk.names(), ElementsAre(""));
  EXPECT_EQ("", walk[""].getHostName());
  EXPECT_EQ("second.org", walk[""].getDomainName());
}

TEST(DNSClientWalk, EmptyNameIsLoggedTwiceAndStoredUnderTheEmptyKey) {
  const Walk walk = walkOver({}, "");
  EXPECT_EQ(0, walk.answer);
  EXPECT_THAT(walk.names(), ElementsAre(""));
  EXPECT_THAT(walk.warnings(), ElementsAre("Failed while setting Name", "Failed while setting Element Name"));
}

TEST(DNSClientWalk, EmptyTextsAreLoggedAndTheRecordIsStored) {
  const Walk walk = walkOver({.hostName = "", .domain = ""});
  EXPECT_EQ(0, walk.answer);
  EXPECT_THAT(walk.names(), ElementsAre("eth0"));
  EXPECT_THAT(walk.warnings(), ElementsAre("Failed while setting IP Host Name.", "Failed while setting Domain Name."));
}

TEST(DNSClientWalk, DomainOfSpacesIsLoggedAndLeftEmpty) {
  const Walk walk = walkOver({.domain = "   "});
  EXPECT_THAT(walk.warnings(), ElementsAre("Failed while setting Domain Name."));
  EXPECT_EQ("", walk["eth0"].getDomainName());
}

TEST(DNSClientWalk, RepeatedNameKeepsTheWholeOfTheLastNode) {
  World world;
  world.nic("eth0", {.hostName = "first", .domain = "first.org", .suffixes = {"first.org"}, .ifType = 1, .state = 1});
  world.bmc().nic("eth0", {.hostName = "second"}).install();
  const Walk walk;
  ASSERT_THAT(walk.names(), ElementsAre("eth0"));
  const DNSClient client = walk["eth0"];
  EXPECT_EQ("second", client.getHostName());
  EXPECT_EQ("", client.getDomainName());
  EXPECT_THAT(client.getDNSSuffixesToAppend(), IsEmpty());
  EXPECT_EQ(0, client.getprotocolIFType());
  EXPECT_EQ(0, client.getEnabledState());
  EXPECT_EQ("ZORVA_SPComputerSystem", client.getDNSSCCN());
}

TEST(DNSClientWalk, StateIsCutTo16BitsAndMapped) {
  const std::map<unsigned int, unsigned short> states = {{12, 6}, {16, 3}, {1, 2}, {65537, 2}, {0, 5}, {0xffff000c, 6}};
  for (const auto& [given, stored] : states) {
    const Walk walk = walkOver({.state = given});
    EXPECT_EQ(stored, walk["eth0"].getEnabledState()) << given;
    EXPECT_EQ(12, walk["eth0"].getRequestedState()) << given;
  }
}

TEST(DNSClientWalk, AbsentStateLeavesBothStatesUnset) {
  const Walk walk = walkOver({.ifType = 4097});
  EXPECT_EQ(0, walk["eth0"].getEnabledState());
  EXPECT_EQ(0, walk["eth0"].getRequestedState());
}

TEST(DNSClientWalk, OnlyTheExactDescriptionIsAServiceProcessor) {
  for (const char* description : {"bmc", "BMC ", "BM", "BMC2", "", "Computer"}) {
    World world;
    world.system("system", description).nic("eth0").install();
    const Walk walk;
    EXPECT_EQ("ZORVA_ComputerSystem", walk["eth0"].getDNSSCCN()) << description;
    EXPECT_THAT(walk.lines.briefs(), Contains("4000 VARIABLE nodeString = " + std::string(description)));
  }
  World world;
  world.bmc().nic("eth0").install();
  EXPECT_EQ("ZORVA_SPComputerSystem", Walk()["eth0"].getDNSSCCN());
}

TEST(DNSClientWalk, AddsToTheMapThatItIsGiven) {
  World world;
  world.nic("eth0").install();
  DNSClient before;
  before.setHostName("before");
  const Walk walk({{"before", before}, {"eth0", before}});
  EXPECT_THAT(walk.names(), ElementsAre("before", "eth0"));
  EXPECT_EQ("before", walk["before"].getHostName());
  EXPECT_EQ("", walk["eth0"].getHostName());
}

TEST(DNSClientWalk, UnreadableTreeIsLoggedWithoutAnExitLine) {
  World world;
  world.installUnreadable();
  const Walk walk;
  EXPECT_EQ(1, walk.answer);
  EXPECT_THAT(walk.found, IsEmpty());
  EXPECT_THAT(walk.lines.briefs(),
              ElementsAre("3000 ENTERING getDNSClientInstances, dnsClientMap=ADDR", "6000 MESSAGE Caught Exception"));
}

TEST(DNSClientWalk, MakingItsFirstCursorIsUnguarded) {
  World world;
  world.nic("eth0").install();
  const FailingTree failing(1);
  std::map<std::string, DNSClient> found;
  EXPECT_THROW(getDNSClientInstances(found), std::runtime_error);
  EXPECT_THAT(failing.calls(), ElementsAre(zorva::agent::TreeCall::Construct));
}

TEST(DNSClientWalk, EveryLaterFailureOfTheTreeIsCaughtAndKeepsWhatWasReached) {
  World world;
  world.nic("eth0", usualNic()).nic("eth1", usualNic()).install();
  std::size_t afterTheFirst = 0;
  forEachTreeFailure([&](std::size_t n, Thrown thrown) {
    const RecordingLogger logger;
    std::map<std::string, DNSClient> found;
    if (thrown == Thrown::Int || n == 1) {
      try {
        getDNSClientInstances(found);
      } catch (const std::runtime_error&) {
        EXPECT_EQ(Thrown::StdException, thrown);
      } catch (int) {
        EXPECT_EQ(Thrown::Int, thrown);  // an exception that is no std::exception leaves the function
      }
      return;
    }
    const unsigned short answer = getDNSClientInstances(found);
    const LogLines lines = logger.pairs();
    const bool failed = answer != 0;
    EXPECT_EQ(failed, !lines.exited("getDNSClientInstances"));
    if (!failed) {
      EXPECT_EQ(2U, found.size());
      return;
    }
    EXPECT_EQ(1, answer);
    EXPECT_THAT(lines.errors(), ElementsAre("Caught Exception"));
    EXPECT_LT(found.size(), 3U);
    if (found.size() == 1) {
      ++afterTheFirst;
      EXPECT_EQ("example.org", found.at("eth0").getDomainName());
      EXPECT_EQ("ZORVA_ComputerSystem", found.at("eth0").getDNSSCCN());
    }
  });
  EXPECT_GT(afterTheFirst, 5U);
}

}  // namespace
}  // namespace ZV::Test
