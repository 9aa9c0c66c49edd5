#include "providers/testing/AssociationTestSupport.h"

extern "C" CMPIInstanceMI* DNSHostedAccessPointProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                          CMPIStatus*);
extern "C" CMPIAssociationMI* DNSHostedAccessPointProvider_Create_AssociationMI(const CMPIBroker*, const CMPIContext*,
                                                                                CMPIStatus*);

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const char* const kAssociation = "ZORVA_DNSHostedAccessPoint";
const char* const kSystem = "ZORVA_ComputerSystem";
const char* const kEndpoint = "ZORVA_DNSProtocolEndPoint";
const char* const kBuilder = "DNSHostedAccessPointCMPIInstances";

const char* const kNoSystemClass = "Create CMPIObjectPath failed for ComputerSystem.";
const char* const kNoNames = "CBEnumInstanceNames Failed for the target Class";
const char* const kNoEndpointsInBuilder =
    "***Can't get DNS Client ObjectPaths.                 Exiting EnumerateInstanceNames***";
const char* const kNoEndpointsInNames =  // with one more blank
    "***Can't get DNS Client ObjectPaths.                  Exiting EnumerateInstanceNames***";
const char* const kBadEndpoint = "CMPIObjectPath is NULL for DNS Client";
const char* const kNoPath = "Create CMPIObjectPath failed for                     dnsHostedAccessPointClass.";
const char* const kNoAssociators = "***Can't get DNS Client ObjectPaths.                 Exiting Associators***";
const char* const kNoAssociatorNames =
    "***Can't get Service processor ObjectPaths.                 Exiting AssociatorNames***";
const char* const kNoReferences = "***Can't get DNS Client instances                 Exiting References***";

class HostedAccessPoint : public AssociationTest {
 protected:
  HostedAccessPoint()
      : AssociationTest({.className = kAssociation,
                         .left = "Antecedent",
                         .right = "Dependent",
                         .stem = "DNSHostedAccessPoint",
                         .builder = kBuilder,
                         .source = "providers/DNSHostedAccessPointProvider.cpp",
                         .category = "Zorvagent.DNSHostedAccessPointProvider",
                         .createInstanceMI = DNSHostedAccessPointProvider_Create_InstanceMI,
                         .createAssociationMI = DNSHostedAccessPointProvider_Create_AssociationMI,
                         .associationsAreDone = false}) {}

  // Computer systems of these names, served by another provider.
  static std::vector<Instance> systems(const std::vector<std::string>& names) {
    std::vector<Instance> all;
    for (const std::string& name : names) all.push_back(objectOf(systemPath(name)));
    return all;
  }
  void install(std::initializer_list<const char*> endpoints, const std::vector<std::string>& systemNames) {
    for (const char* name : endpoints) world.nic(name);
    world.install();
    broker.serve(kSystem, systems(systemNames));
  }
  Path pair(const std::string& system, const std::string& name) const {
    return pairOf(systemPath(system), endpointPath(name));
  }
  std::function<Outcome()> names() {
    return [this] { return enumerateInstanceNames(); };
  }
  std::function<Outcome()> instances() {
    return [this] { return enumerateInstances(); };
  }
};

// --- Which systems host which endpoints

TEST_F(HostedAccessPoint, SystemOfTheHostsNameIsPairedWithAllEndpointsInEveryOperation) {
  install({"eth1", "eth0"}, {"host1"});
  const auto both = {"host1 > eth0", "host1 > eth1"};
  for (const Outcome& outcome : {enumerateInstanceNames(), enumerateInstances(), references(systemPath("host1")),
                                 referenceNames(systemPath("host1"))}) {
    EXPECT_THAT(pairsOf(outcome), testing::ElementsAreArray(both));
  }
  EXPECT_THAT(pairsOf(references(endpointPath("eth1"))), ElementsAre("host1 > eth1"));
  EXPECT_THAT(pairsOf(referenceNames(endpointPath("eth1"))), ElementsAre("host1 > eth1"));
  EXPECT_THAT(pairsOf(getInstance(pair("host1", "eth1"))), ElementsAre("host1 > eth1"));
  EXPECT_THAT(textsOf(associators(systemPath("host1")).instances(), "Name"), ElementsAre("eth0", "eth1"));
  EXPECT_THAT(textsOf(associatorNames(systemPath("host1")).paths(), "Name"), ElementsAre("eth0", "eth1"));
  EXPECT_THAT(textsOf(associators(endpointPath("eth0")).instances(), "Name"), ElementsAre("host1"));
  EXPECT_THAT(textsOf(associatorNames(endpointPath("eth0")).paths(), "Name"), ElementsAre("host1"));
}

TEST_F(HostedAccessPoint, SystemThatHasTheHostsNameAsAPartIsPairedByTheBuilderAlone) {
  install({"eth0"}, {});
  for (const char* system : {"host1.example.org", "myhost1", "myhost10"}) {
    SCOPED_TRACE(system);
    broker.serve(kSystem, systems({system}));
    EXPECT_THAT(enumerateInstances().instances(), SizeIs(1));
    EXPECT_THAT(getInstance(pair(system, "eth0")).instances(), SizeIs(1));
    EXPECT_THAT(enumerateInstanceNames().paths(), IsEmpty());
    for (const Path& source : {systemPath(system), endpointPath("eth0")}) {
      EXPECT_THAT(associators(source).instances(), IsEmpty());
      EXPECT_THAT(associatorNames(source).paths(), IsEmpty());
      EXPECT_THAT(references(source).instances(), IsEmpty());
      EXPECT_THAT(referenceNames(source).paths(), IsEmpty());
    }
  }
}

TEST_F(HostedAccessPoint, SystemOfAnotherNameIsPairedWithNothing) {
  install({"eth0"}, {});
  for (const char* system : {"host2", "HOST1", "host", ""}) {
    SCOPED_TRACE(system);
    broker.serve(kSystem, systems({system}));
    EXPECT_THAT(enumerateInstances().instances(), IsEmpty());
    EXPECT_THAT(enumerateInstanceNames().paths(), IsEmpty());
    EXPECT_THAT(associators(systemPath(system)).instances(), IsEmpty());
    EXPECT_THAT(associators(endpointPath("eth0")).instances(), IsEmpty());
    EXPECT_THAT(references(systemPath(system)).instances(), IsEmpty());
    EXPECT_THAT(references(endpointPath("eth0")).instances(), IsEmpty());
  }
}

TEST_F(HostedAccessPoint, EndpointWithAnEmptySystemNameIsPairedWithEverySystemByTheBuilder) {
  install({"eth0"}, {"anything"});
  const char* const systemName = R"(addKey("SystemName")";  // the broker refuses it, so it stays empty
  EXPECT_THAT(pairsOf(failing(systemName, Mode::SetRc, instances())), ElementsAre("anything > eth0"));
  EXPECT_THAT(pairsOf(failing(systemName, Mode::SetRc, names())), IsEmpty());
  broker.serve(kSystem, systems({""}));
  EXPECT_THAT(pairsOf(failing(systemName, Mode::SetRc, names())), ElementsAre(" > eth0"));
}

TEST_F(HostedAccessPoint, ServiceProcessorsEndpointsAreNoAssociatorsOfASystemButAreReferredTo) {
  world.host("host1").nic("eth0").bmc().nic("bmc0").install();
  broker.serve(kSystem, systems({"host1", "BMC:-1"}));
  const Path processor = systemPath("BMC:-1");
  EXPECT_THAT(pairsOf(enumerateInstances()), ElementsAre("host1 > eth0", "BMC:-1 > bmc0"));
  EXPECT_THAT(pairsOf(enumerateInstanceNames()), ElementsAre("host1 > eth0", "BMC:-1 > bmc0"));
  EXPECT_THAT(associators(processor).instances(), IsEmpty());
  EXPECT_THAT(associatorNames(processor).paths(), IsEmpty());
  EXPECT_THAT(pairsOf(references(processor)), ElementsAre("BMC:-1 > bmc0"));
  EXPECT_THAT(pairsOf(referenceNames(processor)), ElementsAre("BMC:-1 > bmc0"));
  EXPECT_THAT(textsOf(associators(endpointPath("bmc0", "BMC:-1")).instances(), "Name"), ElementsAre("BMC:-1"));
}

TEST_F(HostedAccessPoint, EverySystemOfTheEndpointsNameIsAssociated) {
  install({"eth0"}, {"host1", "host2", "host1"});
  EXPECT_THAT(associators(endpointPath("eth0")).instances(), SizeIs(2));
  EXPECT_THAT(associatorNames(endpointPath("eth0")).paths(), SizeIs(2));
  EXPECT_THAT(references(endpointPath("eth0")).instances(), SizeIs(2));
  EXPECT_THAT(referenceNames(endpointPath("eth0")).paths(), SizeIs(2));
}

TEST_F(HostedAccessPoint, SourceWithoutTheKeyThatIsComparedMatchesWhatHasNone) {
  install({"eth0"}, {"host1"});
  for (const Path& source : {Path(kSystem), Path(kEndpoint), Path(kEndpoint).key("SystemName", uint16(1))}) {
    for (const Outcome& outcome :
         {associators(source), associatorNames(source), references(source), referenceNames(source)}) {
      EXPECT_EQ("not done, marked", endOf(outcome).at(1));
      EXPECT_EQ(0U, outcome.calls.count("returnInstance") + outcome.calls.count("returnObjectPath"));
    }
  }
  broker.serve(kSystem, {objectOf(Path(kSystem))});
  EXPECT_THAT(associators(Path(kEndpoint)).instances(), SizeIs(1));
  EXPECT_THAT(references(Path(kEndpoint)).instances(), SizeIs(1));
}

TEST_F(HostedAccessPoint, PairsComeInTheBrokersOrderOfSystemsAndEndpointsSortedInside) {
  install({"eth1", "eth0"}, {"xhost1", "host1"});
  EXPECT_THAT(pairsOf(enumerateInstances()),
              ElementsAre("xhost1 > eth0", "xhost1 > eth1", "host1 > eth0", "host1 > eth1"));
}

// --- Enumerations

TEST_F(HostedAccessPoint, NamesGiveTheEndpointTheNamespaceAloneAndAreDoneBeforeTheyAreMarked) {
  install({"eth0"}, {"host1"});
  const Outcome names = enumerateInstanceNames();
  EXPECT_EQ(tell({entry(operation("EnumInstanceNames")),
                  {newPath(kSystem), "enumerateInstanceNames(OP1)", "E1.getNext()"},
                  newEndpointPath("OP3", "eth0"),
                  {R"(OP3.setNameSpace("root/cimv2"))"},
                  newHostPath("OP4", kAssociation),
                  keyEnds("OP4", "OP2", "OP3"),
                  {"returnObjectPath(OP4)", "returnDone()"},
                  exitMark(operation("EnumInstanceNames"))}),
            storyOf(names));
}

TEST_F(HostedAccessPoint, InstancesAreDoneBeforeTheyAreMarked) {
  install({"eth0"}, {"host1"});
  const Outcome all = enumerateInstances({"Antecedent"});
  EXPECT_EQ(tell({entry(operation("EnumInstances")),
                  entry(kBuilder),
                  {newPath(kSystem), "enumerateInstanceNames(OP1)", "E1.getNext()"},
                  newEndpointPath("OP3", "eth0"),
                  {R"(OP3.setNameSpace("root/cimv2"))"},
                  newHostPath("OP4", kAssociation),
                  {"newInstance(OP4)", R"(I1.setPropertyFilter({"Antecedent"}, {"Antecedent", "Dependent"}))"},
                  setEnds("I1", "OP2", "OP3"),
                  exitMark(kBuilder),
                  {"returnInstance(I1)", "returnDone()"},
                  exitMark(operation("EnumInstances"))}),
            storyOf(all));
}

TEST_F(HostedAccessPoint, HostWithoutEndpointsLeavesNamesOpenAndEndsInstancesEmpty) {
  install({}, {"host1"});
  EXPECT_THAT(endOf(enumerateInstanceNames()), ElementsAre("CMPI_RC_OK", "not done, not marked", kNoEndpointsInNames));
  const Outcome all = enumerateInstances();
  EXPECT_THAT(endOf(all), ElementsAre("CMPI_RC_OK", "done, marked", kNoEndpointsInBuilder));
  EXPECT_THAT(all.instances(), IsEmpty());
}

TEST_F(HostedAccessPoint, WithoutASystemTheEndpointsAreNotLookedAt) {
  install({}, {});
  EXPECT_THAT(endOf(enumerateInstanceNames()), ElementsAre("CMPI_RC_OK", "done, marked"));
  EXPECT_THAT(endOf(enumerateInstances()), ElementsAre("CMPI_RC_OK", "done, marked"));
}

TEST_F(HostedAccessPoint, NamesLeaveOpenOnEveryFailureAndShowItsCode) {
  install({"eth0", "eth1"}, {"host1"});
  EXPECT_THAT(endOf(failing(newPath(kSystem), Mode::RcAndNull, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoSystemClass));
  EXPECT_THAT(endOf(failing(newPath(kSystem), Mode::NullHandle, names())),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kNoSystemClass));
  EXPECT_THAT(endOf(failing("enumerateInstanceNames(", Mode::SetRc, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoNames));
  EXPECT_THAT(endOf(failing(newPath(kEndpoint), Mode::RcAndNull, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoEndpointsInNames));
  EXPECT_THAT(endOf(losingHandles(kEndpoint, kAssociation, names())),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kBadEndpoint));
  EXPECT_THAT(endOf(failing(newPath(kAssociation), Mode::RcAndNull, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoPath));
  EXPECT_THAT(pairsOf(failing(newPath(kAssociation), Mode::ReturnNull, names(), 2)), ElementsAre("host1 > eth0"));
}

TEST_F(HostedAccessPoint, InstancesEndEmptyOnEveryFailureAndShowNoCode) {
  install({"eth0", "eth1"}, {"host1"});
  const auto expectEmpty = [this](const Outcome& outcome, const char* text) {
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked", text));
    EXPECT_EQ(0U, outcome.calls.count("returnInstance"));
    EXPECT_FALSE(outcome.lines.exited(kBuilder));
  };
  expectEmpty(failing(newPath(kSystem), Mode::RcAndNull, instances()), kNoSystemClass);
  expectEmpty(failing(newPath(kSystem), Mode::NullHandle, instances()), kNoSystemClass);
  expectEmpty(failing("enumerateInstanceNames(", Mode::SetRc, instances()), kNoNames);
  expectEmpty(failing(newPath(kEndpoint), Mode::RcAndNull, instances()), kNoEndpointsInBuilder);
  expectEmpty(losingHandles(kEndpoint, kAssociation, instances()), kBadEndpoint);
  expectEmpty(failing(newPath(kAssociation), Mode::RcAndNull, instances(), 2), kNoPath);
  expectEmpty(failing(newPath(kAssociation), Mode::NullHandle, instances(), 2), kNoPath);
}

TEST_F(HostedAccessPoint, InstanceThatCouldNotBeMadeIsReturnedUnchanged) {
  install({"eth0", "eth1"}, {"host1"});
  for (const auto& [mode, handedOut] :
       {std::pair(Mode::ReturnNull, "returnInstance(null)"), std::pair(Mode::RcAndNull, "returnInstance(null)"),
        std::pair(Mode::NullHandle, "returnInstance(I1(no handle))")}) {
    const Outcome all = failing("newInstance(", mode, instances());
    EXPECT_THAT(endOf(all), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_THAT(all.calls.only({"returnInstance"}), ElementsAre(handedOut, testing::_));
    EXPECT_THAT(pairsOf(all), ElementsAre("host1 > eth1"));
  }
}

// --- One instance

TEST_F(HostedAccessPoint, InstanceOfAPairIsFoundAndDoneBeforeItIsMarked) {
  install({"eth0", "eth1"}, {"host1"});
  const Outcome got = getInstance(pair("host1", "eth1"), {{}});
  EXPECT_THAT(pairsOf(got), ElementsAre("host1 > eth1"));
  const Story story = storyOf(got);
  EXPECT_EQ(tell({{"returnInstance(I2)", "returnDone()"}, exitMark(operation("GetInstance"))}),
            Story(story.end() - 4, story.end()));
}

TEST_F(HostedAccessPoint, PathThatNamesNoPairGivesAnEmptyCompletedResult) {
  install({"eth0"}, {"host1"});
  const Path half = Path(kAssociation).key("Dependent", ref(endpointPath("eth0")));
  for (const Path& path : {pair("host1", "eth1"), pair("host2", "eth0"), half, half.key("Antecedent", "host1")}) {
    const Outcome got = getInstance(path);
    EXPECT_THAT(endOf(got), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_THAT(got.instances(), IsEmpty());
  }
  EXPECT_THAT(endOf(getInstance(associationClass())),
              ElementsAre("CMPI_RC_OK", "done, marked", "At least one key should be passed"));
}

// --- Associators and their names

TEST_F(HostedAccessPoint, AssociatorsOfAnEndpointGoOutAsTheBrokerGaveThemWhateverTheList) {
  install({"eth0"}, {"host1"});
  const Outcome found = associators(endpointPath("eth0"), {.properties = {"Name"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kSystem),
                  {"enumerateInstances(OP1)", "E1.getNext()", "I1.getObjectPath()", "returnInstance(I1)"},
                  exitMark(operation("Associators"))}),
            storyOf(found));
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kSystem),
                  {"enumerateInstanceNames(OP1)", "E1.getNext()", "returnObjectPath(OP2)"},
                  exitMark(operation("AssociatorNames"))}),
            storyOf(associatorNames(endpointPath("eth0"))));
}

TEST_F(HostedAccessPoint, AssociatorsOfASystemAreTheEndpointsAndTheirNamesArePlaced) {
  install({"eth0"}, {});
  const AssociationQuery query = {.properties = {"Name"}};
  const Outcome found = associators(systemPath("host1"), query);
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kEndpoint),
                  newEndpoint("OP2", "I1", "eth0", R"({"Name"})"),
                  {"returnInstance(I1)"},
                  exitMark(operation("Associators"))}),
            storyOf(found));
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kEndpoint),
                  newEndpointPath("OP2", "eth0"),
                  placed("OP2"),
                  {"returnObjectPath(OP2)"},
                  exitMark(operation("AssociatorNames"))}),
            storyOf(associatorNames(systemPath("host1"))));
}

TEST_F(HostedAccessPoint, ResultClassIsTakenByItsTwoNamesInAnyCaseAndByNoOther) {
  install({"eth0"}, {"host1"});
  expectResultClasses(endpointPath("eth0"), 1,
                      {nullptr, kSystem, "zorva_computersystem", "CIM_ComputerSystem", "cim_COMPUTERsystem"},
                      {"", kEndpoint, "CIM_System", "ZORVA_SPComputerSystem", "ZORVA_Nowhere"});
  expectResultClasses(systemPath("host1"), 1,
                      {nullptr, kEndpoint, "zorva_dnsprotocolendpoint", "CIM_DNSProtocolEndpoint",
                       "CIM_DNSProtocolEndPoint", "cim_dnsprotocolendpoint"},
                      {"", kSystem, "CIM_ProtocolEndpoint", "ZORVA_Nowhere"});
}

TEST_F(HostedAccessPoint, SourcesKeyIsReadBeforeTheResultClassIsTestedAndLeavesItsCode) {
  install({"eth0"}, {"host1"});
  broker.missingKey.rc = CMPI_RC_ERR_NO_SUCH_PROPERTY;
  for (const Path& source : {Path(kEndpoint), Path(kSystem)}) {
    const Outcome found = associators(source, {.resultClass = "ZORVA_Nowhere"});
    EXPECT_THAT(endOf(found), ElementsAre("CMPI_RC_ERR_NO_SUCH_PROPERTY", "not done, not marked"));
  }
}

TEST_F(HostedAccessPoint, AssociatorsOfASystemOnAHostWithoutEndpointsComplainEachInItsWords) {
  install({}, {"host1"});
  EXPECT_THAT(endOf(associators(systemPath("host1"))),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kNoAssociators));
  EXPECT_THAT(endOf(associatorNames(systemPath("host1"))),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kNoAssociatorNames));
}

// --- References and their names

TEST_F(HostedAccessPoint, ReferencesOfAnEndpointLeaveTheSystemUntouched) {
  install({"eth0"}, {"host1"});
  const Outcome found = references(endpointPath("eth0"));
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kSystem),
                  newHostPath("OP2", kAssociation),
                  {"enumerateInstanceNames(OP1)", "E1.getNext()", "newInstance(OP2)"},
                  setEnds("I1", "OP3", "ref"),
                  {"returnInstance(I1)"},
                  exitMark(operation("References"))}),
            storyOf(found));
}

TEST_F(HostedAccessPoint, ReferencesOfASystemPlaceTheEndpoint) {
  install({"eth0"}, {});
  const Outcome found = references(systemPath("host1"));
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kEndpoint),
                  newHostPath("OP2", kAssociation),
                  newEndpointPath("OP3", "eth0"),
                  {"newInstance(OP2)"},
                  placed("OP3"),
                  setEnds("I1", "ref", "OP3"),
                  {"returnInstance(I1)"},
                  exitMark(operation("References"))}),
            storyOf(found));
}

TEST_F(HostedAccessPoint, ReferenceNamesAreThePathsOfInstancesOnTheSourcesNamespaceAndThisHost) {
  install({"eth0"}, {"host1"});
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kSystem),
                  newHostPath("OP2", kAssociation),
                  {"enumerateInstanceNames(OP1)", "E1.getNext()", "newInstance(OP2)"},
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
                  placed("OP3"),
                  setEnds("I1", "ref", "OP3"),
                  {"I1.getObjectPath()"},
                  placed("OP4"),
                  {"returnObjectPath(OP4)"},
                  exitMark(operation("ReferenceNames"))}),
            storyOf(referenceNames(systemPath("host1"))));
}

TEST_F(HostedAccessPoint, ReferencesOfASystemOnAHostWithoutEndpointsComplainInTheSameWords) {
  install({}, {"host1"});
  EXPECT_THAT(endOf(references(systemPath("host1"))), ElementsAre("CMPI_RC_OK", "not done, not marked", kNoReferences));
  EXPECT_THAT(endOf(referenceNames(systemPath("host1"))),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kNoReferences));
}

TEST_F(HostedAccessPoint, EndpointsThatCouldNotBeFetchedLeaveTheirCode) {
  install({"eth0"}, {});
  const auto end = [this](const std::function<Outcome()>& run) {
    return endOf(failing(newPath(kEndpoint), Mode::RcAndNull, run, 2));
  };
  EXPECT_THAT(end([this] { return associatorNames(systemPath("host1")); }),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoAssociatorNames));
  EXPECT_THAT(end([this] { return references(systemPath("host1")); }),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoReferences));
  EXPECT_THAT(end([this] { return referenceNames(systemPath("host1")); }),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoReferences));
}

TEST_F(HostedAccessPoint, ReferenceThatCouldNotBeMadeIsReturnedUnchanged) {
  install({"eth0"}, {"host1"});
  for (const Path& source : {endpointPath("eth0"), systemPath("host1")}) {
    EXPECT_THAT(
        failing("newInstance(", Mode::ReturnNull, [&] { return references(source); }).calls.only({"returnInstance"}),
        ElementsAre("returnInstance(null)"));
    EXPECT_THAT(failing("newInstance(", Mode::ReturnNull, [&] { return referenceNames(source); })
                    .calls.only({"returnObjectPath"}),
                ElementsAre("returnObjectPath(null)"));
  }
}

// --- The other provider, sources, arguments, failures

TEST_F(HostedAccessPoint, OtherProvidersFailureShowsItsCodeWhereverTheBrokerIsAskedButInTheBuilder) {
  install({"eth0"}, {});
  expectToEndAsTheOtherProviderHasIt(
      kSystem, systems({"host1", "host2"}),
      {{names(), kNoNames, true},
       {instances(), kNoNames, false},
       {[this] { return getInstance(pair("host1", "eth0")); }, kNoNames, false},
       {[this] { return associators(endpointPath("eth0")); }, "CBEnumInstances Failed for the target Class", true},
       {[this] { return associatorNames(endpointPath("eth0")); }, kNoNames, true},
       {[this] { return references(endpointPath("eth0")); }, kNoNames, true},
       {[this] { return referenceNames(endpointPath("eth0")); }, kNoNames, true}});
}

TEST_F(HostedAccessPoint, SystemsProviderIsNotNeededFromASystem) {
  world.nic("eth0").install();
  EXPECT_THAT(associators(systemPath("host1")).instances(), SizeIs(1));
  EXPECT_THAT(associatorNames(systemPath("host1")).paths(), SizeIs(1));
  EXPECT_THAT(references(systemPath("host1")).instances(), SizeIs(1));
  EXPECT_THAT(referenceNames(systemPath("host1")).paths(), SizeIs(1));
}

TEST_F(HostedAccessPoint, SourceOfAClassAtNeitherEndHasNoFarEnd) {
  install({"eth0"}, {"host1"});
  for (const Path& source : {ipEndpointPath("eth0"), Path("ZORVA_SPComputerSystem").key("Name", "host1"),
                             Path("CIM_ComputerSystem").key("Name", "host1")}) {
    expectNoFarEnd(source, {"Object Path is NULL in Associators.", "Object Path is NULL in AssociatorNames.",
                            "Object Path is NULL in References.", "Object Path is NULL in ReferenceNames."});
  }
}

TEST_F(HostedAccessPoint, AssociationClassOfAnotherAssociationLeadsToItsFarEnd) {
  install({"eth0"}, {"host1"});
  const AssociationQuery servers = {.assocClass = "ZORVA_RemoteAccessAvailableToElement"};
  EXPECT_THAT(endOf(associators(endpointPath("eth0"), servers)), ElementsAre("CMPI_RC_OK", "not done, marked"));
  EXPECT_THAT(endOf(associatorNames(endpointPath("eth0"), servers)), ElementsAre("CMPI_RC_OK", "not done, marked"));
  // Both associations have this end: the endpoints whose system has the source's name.
  EXPECT_THAT(associators(serverPath("192.0.2.1"), servers).instances(), IsEmpty());
  EXPECT_THAT(textsOf(associators(serverPath("host1"), servers).instances(), "Name"), ElementsAre("eth0"));
  EXPECT_THAT(associationProvider.associators(endpointPath("eth0"), {}).instances(), SizeIs(1));
  EXPECT_THAT(associationProvider.associatorNames(endpointPath("eth0"), {}).paths(), SizeIs(1));
}

TEST_F(HostedAccessPoint, RolesAndTheArgumentsOfReferencesAreNotRead) {
  install({"eth0"}, {"host1"});
  expectUnreadArgumentsIgnored(endpointPath("eth0"));
  expectUnreadArgumentsIgnored(systemPath("host1"));
}

TEST_F(HostedAccessPoint, EveryUpCallHasTheOperationsContext) {
  install({"eth0"}, {"host1"});
  expectUpCallsInTheOperationsContext(allRequests(pair("host1", "eth0"), endpointPath("eth0"), systemPath("host1")), 7);
}

TEST_F(HostedAccessPoint, EverythingLiesInTheNamespaceOfTheRequest) {
  install({"eth0"}, {"host1"});
  expectTheRequestsNamespaceEverywhere(systemPath("host1"), endpointPath("eth0"));
}

TEST_F(HostedAccessPoint, SurvivesEveryFailureOfTheBroker) {
  install({"eth0", "eth1"}, {"host1", "host2"});
  expectToSurviveEveryFailure(allRequests(pair("host1", "eth1"), endpointPath("eth1"), systemPath("host1")));
}

TEST_F(HostedAccessPoint, SurvivesEveryFailureOfTheTree) {
  install({"eth0", "eth1"}, {"host1"});
  expectToSurviveEveryTreeFailure(allRequests(pair("host1", "eth1"), endpointPath("eth1"), systemPath("host1")),
                                  {zorva::agent::TreeCall::Construct});
}

}  // namespace
}  // namespace ZV::Test
