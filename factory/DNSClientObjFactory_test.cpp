#include "factory/DNSClientObjFactory.h"

#include <functional>

#include "tests/support/Matchers.h"
#include "tests/support/RecordingBroker.h"
#include "tests/support/RecordingLogger.h"
#include "tests/support/World.h"

namespace ZV::Test {
namespace {

class Factory : public ::testing::Test {
 protected:
  CMPIObjectPath* ref() { return broker.make(Path("ZORVA_Any", "root/cimv2"), "ref"); }
  CMPIInstance* make(const DNSClient& client, const char** properties = nullptr, bool isObjPath = false) {
    return DNSClientObjFactory().makeDNSClientInstance(broker.cmpi(), ref(), client, properties, isObjPath, &status);
  }
  CMPIInstance* make(const DNSServer& server, const char** properties = nullptr, bool isObjPath = false) {
    return DNSClientObjFactory().makeDNSServerInstance(broker.cmpi(), ref(), server, properties, isObjPath, &status);
  }
  LogLines linesOf(const char* function) const { return logger.pairs().ofFunction(function); }

  World world;
  RecordingLogger logger;
  RecordingBroker broker;
  CMPIStatus status{CMPI_RC_OK, nullptr};
};

DNSClient usualClient() {
  DNSClient client;
  client.setDNSSCCN("ZORVA_ComputerSystem");
  client.setDNSClientName("eth0");
  client.setElementName("element");
  client.setHostName("myhost");
  client.setDomainName("example.org");
  client.setDNSSuffixesToAppend({"b.org", "a.org"});
  client.setprotocolIFType(4097);
  client.setEnabledState(1);
  client.setRequestedState(1);
  return client;
}

DNSServer usualServer(const std::string& address = "192.0.2.53") {
  DNSServer server;
  server.setAccessInfo(address);
  server.setOrderOfAccess(2);
  return server;
}

TEST_F(Factory, ReadsEndpointsAndServersWhenItIsMade) {
  world.nic("eth0", {.servers = {"192.0.2.1", "192.0.2.2"}}).install();
  const DNSClientObjFactory factory;
  EXPECT_EQ(1, factory.getNumberOfDNSClientInstances());
  EXPECT_EQ(2, factory.getNumberOfDNSServerInstances());
}

TEST_F(Factory, ReadsNoServersIfThereAreNoEndpoints) {
  world.host().install();
  const DNSClientObjFactory factory;
  EXPECT_EQ(0, factory.getNumberOfDNSClientInstances());
  EXPECT_EQ(0, factory.getNumberOfDNSServerInstances());
  EXPECT_TRUE(logger.pairs().exited("getDNSClientInstances"));
  EXPECT_FALSE(logger.pairs().entered("getDNSServerInstances"));
}

TEST_F(Factory, ContinuesWithThePartialResultOfAFailedRead) {
  world.nic("eth0", {.servers = {"192.0.2.1"}}).nic("eth1").install();
  std::vector<int> seen;
  for (std::size_t n = 2;; ++n) {
    const FailingTree failing(n);
    const DNSClientObjFactory factory;
    if (!failing.hasThrown()) break;
    seen.push_back(factory.getNumberOfDNSClientInstances() * 10 + factory.getNumberOfDNSServerInstances());
  }
  EXPECT_THAT(seen, AllOf(Contains(0), Contains(10), Contains(20), Contains(21)));
}

// --- endpoint instances

TEST_F(Factory, EndpointHasFifteenPropertiesInOrder) {
  world.host("host1").install();
  EXPECT_EQ(
      "ZORVA_DNSProtocolEndPoint\n"
      "  SystemCreationClassName = chars \"ZORVA_ComputerSystem\"\n"
      "  CreationClassName = chars \"ZORVA_DNSProtocolEndPoint\"\n"
      "  SystemName = chars \"host1\"\n"
      "  Name = chars \"eth0\"\n"
      "  Caption = chars \"DNS Client\"\n"
      "  Description = chars \"DNS client of a network interface\"\n"
      "  ProtocolIFType = uint16 1\n"
      "  ElementName = chars \"element\"\n"
      "  Hostname = chars \"myhost\"\n"
      "  NameFormat = chars \"NICName\"\n"
      "  OtherTypeDescription = chars \"DNS\"\n"
      "  DomainName = chars \"example.org\"\n"
      "  DNSSuffixesToAppend = string[] {\"b.org\", \"a.org\"}\n"
      "  EnabledState = uint16 2\n"
      "  RequestedState = uint16 12\n",
      describe(make(usualClient())));
  EXPECT_EQ(CMPI_RC_OK, status.rc);
}

TEST_F(Factory, ClassOfTheHostIsKnownInAnyCase) {
  world.host("host1").install();
  DNSClient client = usualClient();
  client.setDNSSCCN("zorva_COMPUTERsystem");
  EXPECT_EQ(chars("host1"), RecordingBroker::read(make(client))["SystemName"]);
  client.setDNSSCCN("ZORVA_ComputerSystemX");
  EXPECT_EQ(chars("BMC:-1"), RecordingBroker::read(make(client))["SystemName"]);
}

TEST_F(Factory, EndpointOfANodeThatGivesNothingHasEmptyValues) {
  world.nic("x", {.isUnnamed = true}).install();
  std::vector<CMPIInstance*> instances;
  EXPECT_EQ(
      0, DNSClientObjFactory().getAllDNSClientCMPIInstances(broker.cmpi(), ref(), nullptr, false, instances, &status));
  ASSERT_EQ(1U, instances.size());
  const Instance instance = RecordingBroker::read(instances[0]);
  EXPECT_EQ(15U, instance.properties.size());
  EXPECT_EQ(chars("ZORVA_ComputerSystem"), instance["SystemCreationClassName"]);
  for (const char* name : {"Name", "ElementName", "Hostname", "DomainName"}) EXPECT_EQ(chars(""), instance[name]);
  for (const char* name : {"ProtocolIFType", "EnabledState", "RequestedState"}) EXPECT_EQ(uint16(0), instance[name]);
  EXPECT_EQ(texts({}), instance["DNSSuffixesToAppend"]);
}

TEST_F(Factory, EndpointWithoutSuffixesHasAnEmptyArray) {
  world.host().install();
  DNSClient client = usualClient();
  client.setDNSSuffixesToAppend({});
  EXPECT_EQ(texts({}), RecordingBroker::read(make(client))["DNSSuffixesToAppend"]);
  EXPECT_EQ(1U, broker.callsOf("newArray"));
  EXPECT_EQ(0U, broker.callsOf("newString"));
}

TEST_F(Factory, SuffixesAreCountedIn16Bits) {
  world.host().install();
  broker.keepsLines = false;
  DNSClient client = usualClient();
  client.setDNSSuffixesToAppend(std::vector<std::string>(65536 + 3, "x"));
  EXPECT_EQ(3U, RecordingBroker::read(make(client))["DNSSuffixesToAppend"].elements().size());
}

TEST_F(Factory, ArrayWithoutAHandleIsSkipped) {
  world.host().install();
  broker.failNext("newArray", Mode::NullHandle);
  const Instance instance = RecordingBroker::read(make(usualClient()));
  EXPECT_FALSE(instance.has("DNSSuffixesToAppend"));
  EXPECT_TRUE(instance.has("RequestedState"));
  EXPECT_TRUE(logger.pairs().exited("makeDNSClientInstance"));
}

TEST_F(Factory, SuffixThatCannotBeMadeLeavesItsElementUnset) {
  world.host().install();
  for (const Mode mode : kAllStatusModes) {
    broker.failNext("newString", mode);
    const Instance instance = RecordingBroker::read(make(usualClient()));
    EXPECT_EQ(list(CMPI_stringA, {null(CMPI_string), text("a.org")}), instance["DNSSuffixesToAppend"]) << nameOf(mode);
    EXPECT_TRUE(instance.has("RequestedState"));
    EXPECT_EQ(CMPI_RC_OK, status.rc);
    EXPECT_EQ(1U, broker.callsOf("setElementAt")) << nameOf(mode);
    broker.startOver();
  }
}

// --- server instances

TEST_F(Factory, ServerHasTwelvePropertiesInOrder) {
  world.host("host1").install();
  EXPECT_EQ(
      "ZORVA_RemoteServiceAccessPoint\n"
      "  SystemCreationClassName = chars \"ZORVA_ComputerSystem\"\n"
      "  CreationClassName = chars \"ZORVA_RemoteServiceAccessPoint\"\n"
      "  SystemName = chars \"host1\"\n"
      "  Name = chars \"192.0.2.53\"\n"
      "  Caption = chars \"DNS Server\"\n"
      "  Description = chars \"DNS server that the system is configured to use\"\n"
      "  NameFormat = chars \"DNSServer\"\n"
      "  AccessContext = uint16 3\n"
      "  AccessInfo = chars \"192.0.2.53\"\n"
      "  InfoFormat = uint16 3\n"
      "  OrderOfAccess = uint16 2\n"
      "  ElementName = chars \"192.0.2.53\"\n",
      describe(make(usualServer())));
}

TEST_F(Factory, ServerWithAnIPv6AddressHasItThroughout) {
  world.host().install();
  const Instance instance = RecordingBroker::read(make(usualServer("2001:db8::53")));
  for (const char* name : {"Name", "AccessInfo", "ElementName"}) EXPECT_EQ(chars("2001:db8::53"), instance[name]);
  EXPECT_EQ(uint16(4), instance["InfoFormat"]);
}

// --- which properties an instance has, alike for both classes

// Makes an instance of one of the classes.
struct Kind {
  const char* name;
  std::size_t propertyCount;
  std::function<CMPIInstance*(RecordingBroker&, const char**, bool)> make;
};
void PrintTo(const Kind& kind, std::ostream* out) { *out << kind.name; }

CMPIInstance* makeEndpoint(RecordingBroker& broker, const char** properties, bool isObjPath) {
  CMPIStatus status{CMPI_RC_OK, nullptr};
  return DNSClientObjFactory().makeDNSClientInstance(broker.cmpi(), broker.make(Path("X")), usualClient(), properties,
                                                     isObjPath, &status);
}

CMPIInstance* makeServer(RecordingBroker& broker, const char** properties, bool isObjPath) {
  CMPIStatus status{CMPI_RC_OK, nullptr};
  return DNSClientObjFactory().makeDNSServerInstance(broker.cmpi(), broker.make(Path("X")), usualServer(), properties,
                                                     isObjPath, &status);
}

class Selection : public ::testing::TestWithParam<Kind> {
 protected:
  Selection() { world.host().install(); }
  std::vector<std::string> namesWithoutList(bool isObjPath = false) { return names(nullptr, isObjPath); }
  std::vector<std::string> namesWith(std::vector<const char*> properties, bool isObjPath = false) {
    properties.push_back(nullptr);
    return names(properties.data(), isObjPath);
  }
  std::string filter() const {
    const std::vector<std::string> lines = broker.calls().only({"setPropertyFilter"});
    return lines.empty() ? "none" : lines.at(0);
  }
  std::vector<std::string> names(const char** properties, bool isObjPath) {
    broker.startOver();
    return RecordingBroker::read(GetParam().make(broker, properties, isObjPath)).names();
  }

  World world;
  RecordingLogger logger;
  RecordingBroker broker;
};

auto keysAnd(std::vector<std::string> more) {
  std::vector<std::string> all = {"SystemCreationClassName", "CreationClassName", "SystemName", "Name"};
  all.insert(all.end(), more.begin(), more.end());
  return all;
}

TEST_P(Selection, WithoutAListIsEverything) {
  EXPECT_EQ(GetParam().propertyCount, namesWithoutList().size());
  EXPECT_THAT(filter(), HasSubstr("setPropertyFilter(null, {\"SystemCreationClassName\""));
}

TEST_P(Selection, OfAnEmptyListIsTheKeys) {
  EXPECT_EQ(keysAnd({}), namesWith({}));
  EXPECT_THAT(filter(), HasSubstr("setPropertyFilter({}, {\"SystemCreationClassName\""));
}

TEST_P(Selection, OfAListIsItsNamesInTheOrderOfTheClass) {
  EXPECT_EQ(keysAnd({"Caption", "ElementName"}), namesWith({"ElementName", "Caption", "NoSuchProperty"}));
}

TEST_P(Selection, LooksAtNamesByteForByte) {
  EXPECT_EQ(keysAnd({}), namesWith({"caption", "ELEMENTNAME", "Captio", "Caption "}));
  EXPECT_EQ(keysAnd({"Caption"}), namesWith({"caption", "Caption"}));
}

TEST_P(Selection, HasItsKeysAnyway) {
  EXPECT_EQ(keysAnd({}), namesWith({"Name"}));
  EXPECT_EQ(keysAnd({}), namesWith({"Name", "SystemName", "Name"}));
}

TEST_P(Selection, OfEachNameAloneIsThatOne) {
  const std::vector<std::string> all = namesWithoutList();
  for (std::size_t i = 4; i < all.size(); ++i) {
    EXPECT_EQ(keysAnd({all[i]}), namesWith({all[i].c_str()}));
  }
}

TEST_P(Selection, ForAPathIsTheKeysWithoutAFilter) {
  EXPECT_EQ(keysAnd({}), namesWithoutList(true));
  EXPECT_EQ("none", filter());
}

TEST_P(Selection, ForAPathWithAListIsItsNamesWithoutAFilter) {
  EXPECT_EQ(keysAnd({"Caption"}), namesWith({"Caption"}, true));
  EXPECT_EQ("none", filter());
  EXPECT_EQ(keysAnd({}), namesWith({}, true));
  EXPECT_EQ("none", filter());
}

TEST_P(Selection, LooksAtNoResultOfSettingAProperty) {
  broker.failEach("setProperty", Mode::SetRc);
  const CMPIInstance* instance = GetParam().make(broker, nullptr, false);
  EXPECT_EQ(GetParam().propertyCount, broker.callsOf("setProperty"));
  EXPECT_THAT(RecordingBroker::read(instance).names(), IsEmpty());
  EXPECT_THAT(logger.pairs().errors(), IsEmpty());
}

TEST_P(Selection, IsTakenOverIntoTheNamespaceOfThePathThatWasGiven) {
  EXPECT_EQ("root/cimv2", RecordingBroker::read(GetParam().make(broker, nullptr, false)).path.nameSpace);
}

INSTANTIATE_TEST_SUITE_P(Of, Selection,
                         ::testing::Values(Kind{"Endpoint", 15, makeEndpoint}, Kind{"Server", 12, makeServer}),
                         [](const auto& row) { return std::string(row.param.name); });

// --- the functions over all and over one

TEST_F(Factory, NothingToGiveIsFailureOne) {
  world.host().install();
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> paths;
  std::vector<CMPIInstance*> instances;
  CMPIString* name = broker.makeString("eth0");
  EXPECT_EQ(1, factory.getAllDNSClientCMPIObjPaths(broker.cmpi(), ref(), paths, &status));
  EXPECT_EQ(1, factory.getAllDNSServerCMPIObjPaths(broker.cmpi(), ref(), paths, &status));
  EXPECT_EQ(1, factory.getAllDNSClientCMPIInstances(broker.cmpi(), ref(), nullptr, false, instances, &status));
  EXPECT_EQ(1, factory.getAllDNSServerCMPIInstances(broker.cmpi(), ref(), nullptr, false, instances, &status));
  EXPECT_EQ(1, factory.getOneDNSClientCMPIInstance(broker.cmpi(), ref(), name, nullptr, instances, &status));
  EXPECT_EQ(1, factory.getOneDNSServerCMPIInstance(broker.cmpi(), ref(), name, nullptr, instances, &status));
  EXPECT_EQ(CMPI_RC_OK, status.rc);
}

TEST_F(Factory, PathThatIsNotMadeIsFailureTwoAndKeepsTheEarlierOnes) {
  world.nic("eth0", {.servers = {"192.0.2.1", "192.0.2.2"}}).nic("eth1").install();
  DNSClientObjFactory factory;
  for (const bool ofServers : {false, true}) {
    std::vector<CMPIObjectPath*> paths;
    CMPIObjectPath* given = ref();
    broker.failAt(10, Mode::RcAndNull);  // the namespace and its text, then seven calls for the first path
    EXPECT_EQ(2, ofServers ? factory.getAllDNSServerCMPIObjPaths(broker.cmpi(), given, paths, &status)
                           : factory.getAllDNSClientCMPIObjPaths(broker.cmpi(), given, paths, &status));
    ASSERT_EQ(1U, paths.size());
    EXPECT_EQ(4U, RecordingBroker::read(paths[0]).keys.size());
  }
}

// --- the place of a server

class Place : public Factory {
 protected:
  int placeOf(CMPIObjectPath* path) {
    logger.clear();
    return DNSClientObjFactory().getOrderOfAccess(broker.cmpi(), path, &status);
  }
  int placeOf(const Path& path) { return placeOf(broker.make(path)); }
  static Path server(const char* name) { return Path("ZORVA_RemoteServiceAccessPoint").key("Name", name); }
};

TEST_F(Place, IsThatInTheListOfTheNode) {
  world.nic("eth0", {.servers = {"192.0.2.9", "192.0.2.1"}}).install();
  EXPECT_EQ(1, placeOf(server("192.0.2.9")));
  EXPECT_EQ(2, placeOf(server("192.0.2.1")));
  EXPECT_THAT(linesOf("getOrderOfAccess").briefs(),
              ElementsAre("3000 ENTERING getOrderOfAccess, _broker=ADDR dnsServer=ADDR rc=ADDR",
                          "4000 VARIABLE serverName = 192.0.2.1"));
}

TEST_F(Place, OfAServerThatIsNotKnownIsOneAndMarksTheExit) {
  world.nic("eth0", {.servers = {"192.0.2.9", "192.0.2.1"}}).install();
  EXPECT_EQ(1, placeOf(server("192.0.2.2")));
  EXPECT_THAT(linesOf("getOrderOfAccess").briefs(),
              ElementsAre("3000 ENTERING getOrderOfAccess, _broker=ADDR dnsServer=ADDR rc=ADDR",
                          "4000 VARIABLE serverName = 192.0.2.2",
                          "3000 EXITING getOrderOfAccess, _broker=ADDR dnsServer=ADDR rc=ADDR"));
}

TEST_F(Place, OnAHostWithoutServersIsOne) {
  world.nic("eth0").install();
  EXPECT_EQ(1, placeOf(server("192.0.2.9")));
  EXPECT_TRUE(logger.pairs().exited("getOrderOfAccess"));
}

TEST_F(Place, WithoutANameIsOneWithTheStatusOfTheKey) {
  world.nic("eth0", {.servers = {"192.0.2.9"}}).install();
  EXPECT_EQ(1, placeOf(Path("ZORVA_RemoteServiceAccessPoint")));
  EXPECT_EQ(CMPI_RC_ERR_NOT_FOUND, status.rc);
  EXPECT_EQ(1, placeOf(nullptr));
}

}  // namespace
}  // namespace ZV::Test
