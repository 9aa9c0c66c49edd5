#include "providers/testing/AssociationTestSupport.h"

extern "C" CMPIInstanceMI* DNSRemoteAccessAvailableToElementProvider_Create_InstanceMI(const CMPIBroker*,
                                                                                       const CMPIContext*, CMPIStatus*);
extern "C" CMPIAssociationMI* DNSRemoteAccessAvailableToElementProvider_Create_AssociationMI(const CMPIBroker*,
                                                                                             const CMPIContext*,
                                                                                             CMPIStatus*);

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const char* const kAssociation = "ZORVA_RemoteAccessAvailableToElement";
const char* const kServer = "ZORVA_RemoteServiceAccessPoint";
const char* const kEndpoint = "ZORVA_DNSProtocolEndPoint";

const char* const kNoServers = "***Can't get DNS Server ObjectPaths.             Exiting EnumerateInstanceNames***";
const char* const kNoServersForNames =
    "***Can't get DNS Server's ObjectPaths.             Exiting EnumerateInstanceNames***";
const char* const kNoEndpoints =
    "***Can't get ObjectPaths for DNSClient.                 Exiting EnumerateInstanceNames***";
const char* const kBadServer = "CMPIObjectPath is NULL for DNS Server";
const char* const kBadEndpoint = "CMPIObjectPath is NULL for DNSClient";
const char* const kNoPath = "Create CMPIObjectPath failed for RemoteAccessAvailableToElement.";

class RemoteAccessAvailableToElement : public AssociationTest {
 protected:
  RemoteAccessAvailableToElement()
      : AssociationTest({.className = kAssociation,
                         .left = "Antecedent",
                         .right = "Dependent",
                         .stem = "DNSRemoteAccessAvailableToElement",
                         .builder = "RemoteAccessAvailableToElementCMPIInstances",
                         .source = "providers/DNSRemoteAccessAvailableToElementProvider.cpp",
                         .category = "Zorvagent.DNSRemoteAccessAvailableToElementProvider",
                         .createInstanceMI = DNSRemoteAccessAvailableToElementProvider_Create_InstanceMI,
                         .createAssociationMI = DNSRemoteAccessAvailableToElementProvider_Create_AssociationMI,
                         .associationsAreDone = false}) {}

  void installOneOfEach() { world.nic("eth0", {.servers = {"192.0.2.1"}}).install(); }
  // Addresses sort as text: 192.0.2.1, 192.0.2.2; the host uses the first one second.
  void installTwoOfEach() {
    world.nic("eth1", {.servers = {"192.0.2.2", "192.0.2.1"}}).nic("eth0", {.servers = {"192.0.2.2"}}).install();
  }
  Path pair(const std::string& address, const std::string& endpoint) const {
    return pairOf(serverPath(address), endpointPath(endpoint));
  }
  std::function<Outcome()> names() {
    return [this] { return enumerateInstanceNames(); };
  }
  std::function<Outcome()> instances() {
    return [this] { return enumerateInstances(); };
  }
};

// --- Enumerations

TEST_F(RemoteAccessAvailableToElement, NamesAreMadeOfBothPathsAndMarkedBeforeTheyAreDone) {
  installOneOfEach();
  const Outcome names = enumerateInstanceNames();
  EXPECT_EQ(tell({entry(operation("EnumInstanceNames")),
                  newServerPath("OP1", "192.0.2.1"),
                  {R"(OP1.setNameSpace("root/cimv2"))"},
                  newEndpointPath("OP2", "eth0"),
                  {R"(OP2.setNameSpace("root/cimv2"))"},
                  newHostPath("OP3", kAssociation),
                  keyEnds("OP3", "OP1", "OP2"),
                  {"returnObjectPath(OP3)"},
                  exitMark(operation("EnumInstanceNames")),
                  {"returnDone()"}}),
            storyOf(names));
  EXPECT_THAT(names.paths(), ElementsAre(Path(kAssociation)
                                             .on("host1")
                                             .key("Antecedent", ref(names.paths().at(0)["Antecedent"].path()))
                                             .key("Dependent", ref(names.paths().at(0)["Dependent"].path()))));
}

TEST_F(RemoteAccessAvailableToElement, InstancesCarryTheOrderOfAccessAndAreMarkedBeforeTheyAreDone) {
  installOneOfEach();
  const Outcome all = enumerateInstances();
  const std::string builder = "RemoteAccessAvailableToElementCMPIInstances, ref=ADDR properties=0 instances=ADDR";
  EXPECT_EQ(tell({entry(operation("EnumInstances")),
                  {"log 3000 ENTERING " + builder},
                  newServerPath("OP1", "192.0.2.1"),
                  newEndpointPath("OP2", "eth0"),
                  newHostPath("OP3", kAssociation),
                  {"newInstance(OP3)", R"(I1.setPropertyFilter(null, {"Antecedent", "Dependent"}))"},
                  setEnds("I1", "OP1", "OP2"),
                  {R"(I1.setProperty("OrderOfAccess", uint16 1))", "log 3000 EXITING " + builder, "returnInstance(I1)"},
                  exitMark(operation("EnumInstances")),
                  {"returnDone()"}}),
            storyOf(all));
}

TEST_F(RemoteAccessAvailableToElement, EveryServerMeetsEveryEndpointServersOuterInSortedOrder) {
  installTwoOfEach();
  const auto all = {"192.0.2.1 > eth0", "192.0.2.1 > eth1", "192.0.2.2 > eth0", "192.0.2.2 > eth1"};
  EXPECT_THAT(pairsOf(enumerateInstanceNames()), testing::ElementsAreArray(all));
  EXPECT_THAT(pairsOf(enumerateInstances()), testing::ElementsAreArray(all));
}

TEST_F(RemoteAccessAvailableToElement, TwoEndpointsOfOneServerBothHaveThatServersOrder) {
  world.nic("eth0", {.servers = {"192.0.2.9"}}).nic("eth1").install();
  const Outcome all = enumerateInstances();
  ASSERT_THAT(all.instances(), SizeIs(2));
  EXPECT_EQ(uint16(1), all.instances()[0]["OrderOfAccess"]);
  EXPECT_EQ(uint16(1), all.instances()[1]["OrderOfAccess"]);
}

TEST_F(RemoteAccessAvailableToElement, OrderOfAccessIsTheServersPlaceAndNotItsPlaceAmongTheSorted) {
  installTwoOfEach();
  const Outcome all = enumerateInstances();
  ASSERT_THAT(all.instances(), SizeIs(4));
  EXPECT_EQ(uint16(2), all.instances()[0]["OrderOfAccess"]);  // of 192.0.2.1
  EXPECT_EQ(uint16(1), all.instances()[2]["OrderOfAccess"]);  // of 192.0.2.2
}

TEST_F(RemoteAccessAvailableToElement, PropertyListNarrowsInstancesToItAndTheKeys) {
  installOneOfEach();
  const Outcome keys = enumerateInstances({{}});
  ASSERT_THAT(keys.instances(), SizeIs(1));
  EXPECT_THAT(keys.instances()[0].names(), ElementsAre("Antecedent", "Dependent"));
  const Outcome all = enumerateInstances({"orderofaccess"});
  ASSERT_THAT(all.instances(), SizeIs(1));
  EXPECT_THAT(all.instances()[0].names(), ElementsAre("Antecedent", "Dependent", "OrderOfAccess"));
}

TEST_F(RemoteAccessAvailableToElement, HostWithoutServersLeavesNamesOpenAndEndsInstancesEmpty) {
  world.nic("eth0").install();
  EXPECT_THAT(endOf(enumerateInstanceNames()), ElementsAre("CMPI_RC_OK", "not done, not marked", kNoServersForNames));
  const Outcome all = enumerateInstances();
  EXPECT_THAT(endOf(all), ElementsAre("CMPI_RC_OK", "done, marked", kNoServers));
  EXPECT_THAT(all.instances(), IsEmpty());
}

TEST_F(RemoteAccessAvailableToElement, NamesLeaveOpenOnEveryFailureAndShowItsCode) {
  installTwoOfEach();
  EXPECT_THAT(endOf(failing(newPath(kServer), Mode::RcAndNull, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoServersForNames));
  EXPECT_THAT(endOf(failing(newPath(kEndpoint), Mode::RcAndNull, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoEndpoints));
  EXPECT_THAT(endOf(failing(newPath(kAssociation), Mode::RcAndNull, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoPath));
  EXPECT_THAT(endOf(failing(newPath(kAssociation), Mode::NullHandle, names())),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kNoPath));
  EXPECT_THAT(endOf(losingHandles(kServer, kEndpoint, names())),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kBadServer));
  EXPECT_THAT(endOf(losingHandles(kEndpoint, kAssociation, names())),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kBadEndpoint));
}

TEST_F(RemoteAccessAvailableToElement, NamesThatWentOutBeforeAFailureStayDelivered) {
  installTwoOfEach();
  EXPECT_THAT(pairsOf(failing(newPath(kAssociation), Mode::ReturnNull, names(), 3)),
              ElementsAre("192.0.2.1 > eth0", "192.0.2.1 > eth1"));
}

TEST_F(RemoteAccessAvailableToElement, InstancesEndEmptyOnEveryFailureAndShowNoCode) {
  installTwoOfEach();
  const auto expectEmpty = [this](const Outcome& outcome, const char* text) {
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked", text));
    EXPECT_EQ(0U, outcome.calls.count("returnInstance"));
    EXPECT_FALSE(outcome.lines.exited("RemoteAccessAvailableToElementCMPIInstances"));
  };
  expectEmpty(failing(newPath(kServer), Mode::RcAndNull, instances()), kNoServers);
  expectEmpty(failing(newPath(kEndpoint), Mode::RcAndNull, instances()), kNoEndpoints);
  expectEmpty(failing(newPath(kAssociation), Mode::RcAndNull, instances(), 4), kNoPath);
  expectEmpty(failing(newPath(kAssociation), Mode::NullHandle, instances(), 4), kNoPath);
  expectEmpty(losingHandles(kServer, kEndpoint, instances()), kBadServer);
  expectEmpty(losingHandles(kEndpoint, kAssociation, instances()), kBadEndpoint);
}

TEST_F(RemoteAccessAvailableToElement, InstanceThatCouldNotBeMadeIsReturnedUnchanged) {
  installTwoOfEach();
  for (const auto& [mode, handedOut] :
       {std::pair(Mode::ReturnNull, "returnInstance(null)"), std::pair(Mode::RcAndNull, "returnInstance(null)"),
        std::pair(Mode::NullHandle, "returnInstance(I2(no handle))")}) {
    const Outcome all = failing("newInstance(", mode, instances(), 2);
    EXPECT_THAT(endOf(all), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(handedOut, all.calls.only({"returnInstance"}).at(1));
    EXPECT_THAT(pairsOf(all), ElementsAre("192.0.2.1 > eth0", "192.0.2.2 > eth0", "192.0.2.2 > eth1"));
  }
}

// --- One instance

TEST_F(RemoteAccessAvailableToElement, InstanceOfAPairIsFoundWithItsOrderAndDoneBeforeItIsMarked) {
  installTwoOfEach();
  const Outcome got = getInstance(pair("192.0.2.1", "eth1"));
  EXPECT_THAT(pairsOf(got), ElementsAre("192.0.2.1 > eth1"));
  EXPECT_EQ(uint16(2), got.instances().at(0)["OrderOfAccess"]);
  const Story story = storyOf(got);
  EXPECT_EQ(tell({{"returnInstance(I2)", "returnDone()"}, exitMark(operation("GetInstance"))}),
            Story(story.end() - 4, story.end()));
}

TEST_F(RemoteAccessAvailableToElement, PropertyListNarrowsTheInstanceOfAPair) {
  installOneOfEach();
  EXPECT_THAT(getInstance(pair("192.0.2.1", "eth0"), {{}}).instances().at(0).names(),
              ElementsAre("Antecedent", "Dependent"));
}

TEST_F(RemoteAccessAvailableToElement, InstanceIsFoundWhateverHostThePathNames) {
  installOneOfEach();
  EXPECT_THAT(getInstance(pair("192.0.2.1", "eth0").on("elsewhere")).instances(), SizeIs(1));
}

TEST_F(RemoteAccessAvailableToElement, PathThatNamesNoPairGivesAnEmptyCompletedResult) {
  installOneOfEach();
  const Path server = Path(kAssociation).key("Antecedent", ref(serverPath("192.0.2.1")));
  const Path paths[] = {
      pair("192.0.2.1", "eth9"),
      pair("192.0.2.9", "eth0"),
      server,
      server.key("Dependent", "eth0"),                     // a key that is no path
      server.key("Dependent", ref(Path(kEndpoint))),       // a path without keys
      server.key("Dependent", ref(endpointPath("ETH0"))),  // values are case-sensitive
      pair("192.0.2.1", "eth0").key("OrderOfAccess", uint16(1)),
      pair("192.0.2.1", "eth0").in("root/other"),
  };
  for (const Path& path : paths) {
    SCOPED_TRACE(describeWhole(path));
    const Outcome got = getInstance(path);
    EXPECT_THAT(endOf(got), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_THAT(got.instances(), IsEmpty());
  }
}

TEST_F(RemoteAccessAvailableToElement, PathWithoutKeysIsRefusedWithAWordAndNoCode) {
  installOneOfEach();
  const Outcome got = getInstance(associationClass());
  EXPECT_EQ(tell({entry(operation("GetInstance")),
                  {error("At least one key should be passed"), "returnDone()"},
                  exitMark(operation("GetInstance"))}),
            storyOf(got));
}

TEST_F(RemoteAccessAvailableToElement, InstanceIsDoneAndMarkedIfTheBuilderFails) {
  installOneOfEach();
  const Outcome got =
      failing(newPath(kAssociation), Mode::RcAndNull, [this] { return getInstance(pair("192.0.2.1", "eth0")); });
  EXPECT_THAT(endOf(got), ElementsAre("CMPI_RC_OK", "done, marked", kNoPath));
  EXPECT_THAT(got.instances(), IsEmpty());
}

TEST_F(RemoteAccessAvailableToElement, InstancesThatCouldNotBeMadeArePassedOverInTheSearch) {
  installTwoOfEach();
  for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle}) {
    const Outcome got = failing("newInstance(", mode, [this] { return getInstance(pair("192.0.2.2", "eth0")); });
    EXPECT_THAT(pairsOf(got), ElementsAre("192.0.2.2 > eth0"));
  }
}

// --- Associators and their names

TEST_F(RemoteAccessAvailableToElement, AssociatorsOfAnEndpointAreTheServers) {
  installOneOfEach();
  const Outcome found = associators(endpointPath("eth0"), {.properties = {"Name"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kServer),
                  newServer("OP2", "I1", "192.0.2.1", R"({"Name"})"),
                  {"returnInstance(I1)"},
                  exitMark(operation("Associators"))}),
            storyOf(found));
  EXPECT_EQ(uint16(1), associators(endpointPath("eth0")).instances().at(0)["OrderOfAccess"]);
}

TEST_F(RemoteAccessAvailableToElement, AssociatorsOfAServerAreTheEndpoints) {
  installOneOfEach();
  const Outcome found = associators(serverPath("192.0.2.1"), {.properties = {"Name"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kEndpoint),
                  newEndpoint("OP2", "I1", "eth0", R"({"Name"})"),
                  {"returnInstance(I1)"},
                  exitMark(operation("Associators"))}),
            storyOf(found));
}

TEST_F(RemoteAccessAvailableToElement, AssociatorNamesGetTheSourcesNamespaceAndThisHost) {
  installOneOfEach();
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kServer),
                  newServerPath("OP2", "192.0.2.1"),
                  placed("OP2"),
                  {"returnObjectPath(OP2)"},
                  exitMark(operation("AssociatorNames"))}),
            storyOf(associatorNames(endpointPath("eth0"))));
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kEndpoint),
                  newEndpointPath("OP2", "eth0"),
                  placed("OP2"),
                  {"returnObjectPath(OP2)"},
                  exitMark(operation("AssociatorNames"))}),
            storyOf(associatorNames(serverPath("192.0.2.1"))));
}

TEST_F(RemoteAccessAvailableToElement, ResultClassIsTakenByItsTwoNamesInAnyCaseAndByNoOther) {
  installTwoOfEach();
  expectResultClasses(endpointPath("eth0"), 2,
                      {nullptr, kServer, "zorva_remoteserviceaccesspoint", "CIM_RemoteServiceAccessPoint",
                       "cim_REMOTEserviceaccesspoint"},
                      {"", kEndpoint, "CIM_ServiceAccessPoint", "CIM_ManagedElement", "ZORVA_Nowhere", kAssociation});
  expectResultClasses(serverPath("192.0.2.1"), 2,
                      {nullptr, kEndpoint, "zorva_dnsprotocolendpoint", "CIM_DNSProtocolEndPoint",
                       "CIM_DNSProtocolEndpoint", "cim_dnsprotocolendpoint"},
                      {"", kServer, "CIM_ProtocolEndpoint", "CIM_ManagedElement", "ZORVA_Nowhere", kAssociation});
}

TEST_F(RemoteAccessAvailableToElement, OnlyObjectsOfTheSourcesSystemAreAssociated) {
  world.host("host1").nic("eth0", {.servers = {"192.0.2.1"}}).bmc().nic("bmc0").install();
  const auto namesFrom = [this](const Path& source) {
    const std::vector<std::string> names = textsOf(associatorNames(source).paths(), "Name");
    EXPECT_EQ(names, textsOf(associators(source).instances(), "Name"));
    return names;
  };
  EXPECT_THAT(namesFrom(serverPath("192.0.2.1")), ElementsAre("eth0"));
  EXPECT_THAT(namesFrom(serverPath("192.0.2.1", "BMC:-1")), ElementsAre("bmc0"));
  EXPECT_THAT(namesFrom(serverPath("192.0.2.1", "host2")), IsEmpty());
  EXPECT_THAT(namesFrom(serverPath("192.0.2.1", "HOST1")), IsEmpty());
  EXPECT_THAT(namesFrom(endpointPath("bmc0", "BMC:-1")), IsEmpty());
  EXPECT_THAT(namesFrom(Path(kServer)), IsEmpty());  // without the key SystemName
  EXPECT_THAT(namesFrom(Path(kServer).key("SystemName", uint16(1))), IsEmpty());
}

TEST_F(RemoteAccessAvailableToElement, AssociatorsOfASystemElsewhereEndRegularly) {
  installOneOfEach();
  for (const Outcome& found :
       {associators(endpointPath("eth0", "host2")), associatorNames(endpointPath("eth0", "host2"))}) {
    EXPECT_THAT(endOf(found), ElementsAre("CMPI_RC_OK", "not done, marked"));
  }
}

TEST_F(RemoteAccessAvailableToElement, AssociatorsOfAnEndpointOnAHostWithoutServersEndSilently) {
  world.nic("eth0").install();
  EXPECT_THAT(endOf(associators(endpointPath("eth0"))), ElementsAre("CMPI_RC_OK", "not done, not marked"));
  EXPECT_THAT(endOf(associatorNames(endpointPath("eth0"))), ElementsAre("CMPI_RC_OK", "not done, not marked"));
}

TEST_F(RemoteAccessAvailableToElement, AssociatorsOfAServerOnAHostWithoutEndpointsComplainButTheirNamesDoNot) {
  world.install();
  EXPECT_THAT(endOf(associators(serverPath("192.0.2.1"))),
              ElementsAre("CMPI_RC_OK", "not done, not marked", "getAllDNSClientCMPIInstances Failed"));
  EXPECT_THAT(endOf(associatorNames(serverPath("192.0.2.1"))), ElementsAre("CMPI_RC_OK", "not done, not marked"));
}

TEST_F(RemoteAccessAvailableToElement, SourcesKeyIsReadBeforeTheResultClassIsTestedAndLeavesItsCode) {
  installOneOfEach();
  for (const Path& source : {Path(kEndpoint), Path(kServer)}) {
    const AssociationQuery refused = {.resultClass = "ZORVA_Nowhere"};
    EXPECT_THAT(endOf(associators(source, refused)), ElementsAre("CMPI_RC_ERR_NOT_FOUND", "not done, not marked"));
    EXPECT_THAT(endOf(associatorNames(source, refused)), ElementsAre("CMPI_RC_ERR_NOT_FOUND", "not done, not marked"));
  }
}

TEST_F(RemoteAccessAvailableToElement, PathsThatCouldNotBeFetchedLeaveTheirCode) {
  installOneOfEach();
  using Case = std::pair<Path, const char*>;
  for (const Case& one : {Case(endpointPath("eth0"), kServer), Case(serverPath("192.0.2.1"), kEndpoint)}) {
    const auto end = [&](const std::function<Outcome()>& run) {
      return endOf(failing(newPath(one.second), Mode::RcAndNull, run, 2));
    };
    EXPECT_THAT(end([&] { return associatorNames(one.first); }),
                ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked"));
    EXPECT_THAT(end([&] { return referenceNames(one.first); }),
                ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", testing::HasSubstr("CMPIObjPaths Failed")));
  }
}

// --- References and their names

TEST_F(RemoteAccessAvailableToElement, ReferencesOfAnEndpointHaveItAsDependentAndNoOrder) {
  installOneOfEach();
  const Outcome found = references(endpointPath("eth0"));
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kServer),
                  newHostPath("OP2", kAssociation),
                  newServer("OP3", "I1", "192.0.2.1"),
                  {"newInstance(OP2)", "I1.getObjectPath()"},
                  setEnds("I2", "OP4", "ref"),
                  {"returnInstance(I2)"},
                  exitMark(operation("References"))}),
            storyOf(found));
}

TEST_F(RemoteAccessAvailableToElement, ReferencesOfAServerHaveItAsAntecedent) {
  installOneOfEach();
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kEndpoint),
                  newHostPath("OP2", kAssociation),
                  newEndpoint("OP3", "I1", "eth0"),
                  {"newInstance(OP2)", "I1.getObjectPath()"},
                  setEnds("I2", "ref", "OP4"),
                  {"returnInstance(I2)"},
                  exitMark(operation("References"))}),
            storyOf(references(serverPath("192.0.2.1"))));
}

TEST_F(RemoteAccessAvailableToElement, ReferenceNamesAreThePathsOfInstancesOnTheSourcesNamespaceAndThisHost) {
  installOneOfEach();
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kServer),
                  newHostPath("OP2", kAssociation),
                  newServerPath("OP3", "192.0.2.1"),
                  {"newInstance(OP2)"},
                  setEnds("I1", "OP3", "ref"),
                  {"I1.getObjectPath()"},
                  placed("OP4"),
                  {"returnObjectPath(OP4)"},
                  exitMark(operation("ReferenceNames"))}),
            storyOf(referenceNames(endpointPath("eth0"))));
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kEndpoint),
                  newHostPath("OP2", kAssociation),
                  newEndpointPath("OP3", "eth0"),
                  {"newInstance(OP2)"},
                  setEnds("I1", "ref", "OP3"),
                  {"I1.getObjectPath()"},
                  placed("OP4"),
                  {"returnObjectPath(OP4)"},
                  exitMark(operation("ReferenceNames"))}),
            storyOf(referenceNames(serverPath("192.0.2.1"))));
}

TEST_F(RemoteAccessAvailableToElement, SourceThatDoesNotExistIsReferredToAllTheSame) {
  installTwoOfEach();
  for (const Path& source : {endpointPath("eth9"), endpointPath("eth9", "host2")}) {
    EXPECT_THAT(pairsOf(references(source)), ElementsAre("192.0.2.1 > eth9", "192.0.2.2 > eth9"));
    EXPECT_THAT(pairsOf(referenceNames(source)), ElementsAre("192.0.2.1 > eth9", "192.0.2.2 > eth9"));
  }
  EXPECT_THAT(pairsOf(references(serverPath("192.0.2.9"))), ElementsAre("192.0.2.9 > eth0", "192.0.2.9 > eth1"));
  EXPECT_THAT(pairsOf(references(Path(kServer))),  // without keys
              ElementsAre("ZORVA_RemoteServiceAccessPoint > eth0", "ZORVA_RemoteServiceAccessPoint > eth1"));
}

TEST_F(RemoteAccessAvailableToElement, ReferencesToAnEmptyFarEndComplainAndLeaveOpen) {
  world.install();
  EXPECT_THAT(endOf(references(endpointPath("eth0"))),
              ElementsAre("CMPI_RC_OK", "not done, not marked", "getAllDNSServerCMPIInstances Failed"));
  EXPECT_THAT(endOf(references(serverPath("192.0.2.1"))),
              ElementsAre("CMPI_RC_OK", "not done, not marked", "getAllDNSClientCMPIInstances Failed"));
  EXPECT_THAT(endOf(referenceNames(endpointPath("eth0"))),
              ElementsAre("CMPI_RC_OK", "not done, not marked", "getAllDNSServerCMPIObjPaths Failed"));
  EXPECT_THAT(endOf(referenceNames(serverPath("192.0.2.1"))),
              ElementsAre("CMPI_RC_OK", "not done, not marked", "getAllDNSClientCMPIObjPaths Failed"));
}

TEST_F(RemoteAccessAvailableToElement, AssociationPathThatCouldNotBeMadeGivesReferencesOfNothing) {
  installTwoOfEach();
  const Outcome found =
      failing(newPath(kAssociation), Mode::ReturnNull, [this] { return references(endpointPath("eth0")); });
  EXPECT_THAT(endOf(found), ElementsAre("CMPI_RC_OK", "not done, marked"));
  EXPECT_THAT(found.calls.only({"returnInstance"}), ElementsAre("returnInstance(null)", "returnInstance(null)"));
  const Outcome names =
      failing(newPath(kAssociation), Mode::ReturnNull, [this] { return referenceNames(endpointPath("eth0")); });
  EXPECT_THAT(names.calls.only({"returnObjectPath"}), ElementsAre("returnObjectPath(null)", "returnObjectPath(null)"));
}

// --- Sources, arguments, failures

TEST_F(RemoteAccessAvailableToElement, SourceOfAClassAtNeitherEndHasNoFarEnd) {
  installOneOfEach();
  for (const Path& source : {systemPath("host1"), Path("CIM_DNSProtocolEndPoint").key("Name", "eth0"),
                             Path("zorva_dnsprotocolendpoint").key("Name", "eth0"), Path("")}) {
    expectNoFarEnd(source, {"Object Path is NULL in Associators.", "Object Path is NULL in AssociatorNames.",
                            "Object Path is NULL in References.", "Object Path is NULL in ReferenceNames."});
  }
}

TEST_F(RemoteAccessAvailableToElement, FarEndPathThatCouldNotBeMadeIsLoggedAndShowsItsCode) {
  installOneOfEach();
  const auto failingTo = [this](Mode mode, const std::function<Outcome()>& run) {
    return endOf(failing(newPath(kServer), mode, run));
  };
  EXPECT_THAT(failingTo(Mode::RcAndNull, [this] { return associators(endpointPath("eth0")); }),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", "Object Path is NULL in Associators."));
  EXPECT_THAT(failingTo(Mode::NullHandle, [this] { return associatorNames(endpointPath("eth0")); }),
              ElementsAre("CMPI_RC_OK", "not done, not marked", "Object Path is NULL in AssociatorNames."));
  // The association's own path is made before the far end is looked up, and its code stays in the status.
  EXPECT_THAT(failingTo(Mode::RcAndNull, [this] { return references(endpointPath("eth0")); }),
              ElementsAre("CMPI_RC_OK", "not done, not marked", "Object Path is NULL in References."));
}

TEST_F(RemoteAccessAvailableToElement, AssociationClassOfAnotherAssociationLeadsToItsFarEnd) {
  installOneOfEach();
  // For an end that this provider does not know the result is empty, and the operation ends normally.
  for (const char* other : {"ZORVA_DNSSAPSAPDependency", "ZORVA_DNSHostedAccessPoint"}) {
    const Outcome found = associators(endpointPath("eth0"), {.assocClass = other});
    EXPECT_THAT(endOf(found), ElementsAre("CMPI_RC_OK", "not done, marked"));
    EXPECT_THAT(found.instances(), IsEmpty());
    EXPECT_THAT(endOf(associatorNames(endpointPath("eth0"), {.assocClass = other})),
                ElementsAre("CMPI_RC_OK", "not done, marked"));
  }
  // Both associations have this end: the endpoints of the source's system.
  const Path setting = generalSettingPath().key("SystemName", "host1");
  const AssociationQuery other = {.assocClass = "ZORVA_DNSGenEndPointElementSettingData"};
  EXPECT_THAT(textsOf(associators(setting, other).instances(), "Name"), ElementsAre("eth0"));
  EXPECT_THAT(textsOf(associatorNames(setting, other).paths(), "Name"), ElementsAre("eth0"));
}

TEST_F(RemoteAccessAvailableToElement, AssociationClassIsTakenByItsExactNameAndIsTheProvidersOwnWhereLeftOut) {
  installOneOfEach();
  EXPECT_THAT(associationProvider.associators(endpointPath("eth0"), {}).instances(), SizeIs(1));
  EXPECT_THAT(associationProvider.associatorNames(endpointPath("eth0"), {}).paths(), SizeIs(1));
  for (const char* name : {"zorva_remoteaccessavailabletoelement", "CIM_RemoteAccessAvailableToElement", ""}) {
    EXPECT_THAT(endOf(associators(endpointPath("eth0"), {.assocClass = name})),
                ElementsAre("CMPI_RC_OK", "not done, not marked", "Object Path is NULL in Associators."));
  }
}

TEST_F(RemoteAccessAvailableToElement, RolesAndTheArgumentsOfReferencesAreNotRead) {
  installTwoOfEach();
  expectUnreadArgumentsIgnored(endpointPath("eth0"));
  expectUnreadArgumentsIgnored(serverPath("192.0.2.1"));
  EXPECT_THAT(references(serverPath("192.0.2.1"), {.role = "Dependent"}).instances(), SizeIs(2));
}

TEST_F(RemoteAccessAvailableToElement, EverythingLiesInTheNamespaceOfTheRequest) {
  installOneOfEach();
  expectTheRequestsNamespaceEverywhere(serverPath("192.0.2.1"), endpointPath("eth0"));
}

TEST_F(RemoteAccessAvailableToElement, SurvivesEveryFailureOfTheBroker) {
  world.nic("eth0", {.servers = {"192.0.2.1"}}).nic("eth1").install();
  expectToSurviveEveryFailure(allRequests(pair("192.0.2.1", "eth1"), endpointPath("eth0"), serverPath("192.0.2.1")));
}

TEST_F(RemoteAccessAvailableToElement, SurvivesEveryFailureOfTheTree) {
  installTwoOfEach();
  expectToSurviveEveryTreeFailure(allRequests(pair("192.0.2.2", "eth1"), endpointPath("eth0"), serverPath("192.0.2.1")),
                                  {zorva::agent::TreeCall::Construct});
}

}  // namespace
}  // namespace ZV::Test
