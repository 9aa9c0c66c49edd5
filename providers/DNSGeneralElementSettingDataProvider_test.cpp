#include "providers/testing/AssociationTestSupport.h"

extern "C" CMPIInstanceMI* DNSGeneralElementSettingDataProvider_Create_InstanceMI(const CMPIBroker*, const CMPIContext*,
                                                                                  CMPIStatus*);
extern "C" CMPIAssociationMI* DNSGeneralElementSettingDataProvider_Create_AssociationMI(const CMPIBroker*,
                                                                                        const CMPIContext*,
                                                                                        CMPIStatus*);

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const char* const kAssociation = "ZORVA_DNSGeneralElementSettingData";
const char* const kSystem = "ZORVA_ComputerSystem";
const char* const kSetting = "ZORVA_DNSGeneralSettingData";
const char* const kBuilder = "DNSGeneralElementSettingDataCMPIInstances";

const char* const kNoSystemClass = "Create CMPIObjectPath failed for ComputerSystem.";
const char* const kNoSystemClassInNames = "Create CMPIObjectPath failed for computerSystemClass.";
const char* const kNoNames = "CBEnumInstanceNames Failed for the target Class";
const char* const kNoSettings = "getAllDNSGeneralSettingDataCMPIObjectPaths failed";
const char* const kNoSettingsForAssociations = "getAllDNSGeneralSettingDataCMPIObjectPaths Failed";
const char* const kBadSettingInBuilder = "CMPIObjectPath is NULL for DNS Client";
const char* const kBadSettingInNames = "CMPIObjectPath is NULL for DNSGeneralSettingData";
const char* const kNoPathInBuilder =
    "Create CMPIObjectPath failed for                         DNSGeneralElementSettingData.";
const char* const kNoPathInNames =
    "Create CMPIObjectPath failed for                         DNSGeneralElementSettingData Class";
const char* const kNotMatched = "Key is not matched";

class GeneralElementSettingData : public AssociationTest {
 protected:
  GeneralElementSettingData()
      : AssociationTest({.className = kAssociation,
                         .left = "ManagedElement",
                         .right = "SettingData",
                         .stem = "DNSGeneralElementSettingData",
                         .builder = kBuilder,
                         .source = "providers/DNSGeneralElementSettingDataProvider.cpp",
                         .category = "Zorvagent.DNSGeneralElementSettingDataProvider",
                         .createInstanceMI = DNSGeneralElementSettingDataProvider_Create_InstanceMI,
                         .createAssociationMI = DNSGeneralElementSettingDataProvider_Create_AssociationMI,
                         .associationsAreDone = true}) {}

  // Computer systems of these names, served by another provider.
  static std::vector<Instance> systems(const std::vector<std::string>& names) {
    std::vector<Instance> all;
    for (const std::string& name : names) all.push_back(objectOf(systemPath(name)));
    return all;
  }
  // A host with one general setting data.
  void install(const std::vector<std::string>& systemNames) {
    world.nic("eth0").install();
    broker.serve(kSystem, systems(systemNames));
  }
  static Story setFlags(const std::string& instance) {
    return {instance + ".setProperty(\"IsCurrent\", uint16 1)", instance + ".setProperty(\"IsDefault\", uint16 1)"};
  }
  Path pair(const std::string& system) const { return pairOf(systemPath(system), generalSettingPath()); }
  std::function<Outcome()> names() {
    return [this] { return enumerateInstanceNames(); };
  }
  std::function<Outcome()> instances() {
    return [this] { return enumerateInstances(); };
  }
};

// --- Which systems have the settings

TEST_F(GeneralElementSettingData, SystemsWhoseNameIsInTheInstanceIDArePairedByTheEnumerations) {
  install({});
  for (const char* name : {"host1", "host", "1", "dnsgen1", ":", "dnsgen1:host1", ""}) {
    SCOPED_TRACE(name);
    broker.serve(kSystem, systems({name}));
    EXPECT_THAT(pairsOf(enumerateInstanceNames()), ElementsAre(std::string(name) + " > dnsgen1:host1"));
    EXPECT_THAT(pairsOf(enumerateInstances()), ElementsAre(std::string(name) + " > dnsgen1:host1"));
    EXPECT_THAT(getInstance(pair(name)).instances(), SizeIs(1));
  }
  for (const char* name : {"host2", "HOST1", "host1.example.org", "host1 "}) {
    SCOPED_TRACE(name);
    broker.serve(kSystem, systems({name}));
    EXPECT_THAT(enumerateInstanceNames().paths(), IsEmpty());
    EXPECT_THAT(enumerateInstances().instances(), IsEmpty());
    EXPECT_THAT(getInstance(pair(name)).instances(), IsEmpty());
  }
}

TEST_F(GeneralElementSettingData, MismatchIsLoggedByTheNamesAndNotByTheInstances) {
  install({"host2", "host1"});
  EXPECT_THAT(endOf(enumerateInstanceNames()), ElementsAre("CMPI_RC_OK", "done, marked", kNotMatched));
  EXPECT_THAT(endOf(enumerateInstances()), ElementsAre("CMPI_RC_OK", "done, marked"));
  EXPECT_THAT(pairsOf(enumerateInstanceNames()), ElementsAre("host1 > dnsgen1:host1"));
  EXPECT_THAT(pairsOf(enumerateInstances()), ElementsAre("host1 > dnsgen1:host1"));
}

TEST_F(GeneralElementSettingData, AssociationOperationsCompareNothing) {
  install({"host1", "host2"});
  for (const Path& source : {generalSettingPath(), generalSettingPath("other"), Path(kSetting)}) {
    EXPECT_THAT(textsOf(associators(source).instances(), "Name"), ElementsAre("host1", "host2"));
    EXPECT_THAT(textsOf(associatorNames(source).paths(), "Name"), ElementsAre("host1", "host2"));
    EXPECT_THAT(references(source).instances(), SizeIs(2));
    EXPECT_THAT(referenceNames(source).paths(), SizeIs(2));
  }
  for (const Path& source : {systemPath("host1"), systemPath("host9"), Path(kSystem)}) {
    EXPECT_THAT(textsOf(associators(source).instances(), "InstanceID"), ElementsAre("dnsgen1:host1"));
    EXPECT_THAT(textsOf(associatorNames(source).paths(), "InstanceID"), ElementsAre("dnsgen1:host1"));
    EXPECT_THAT(references(source).instances(), SizeIs(1));
    EXPECT_THAT(referenceNames(source).paths(), SizeIs(1));
  }
}

TEST_F(GeneralElementSettingData, ReferencesOfTheSettingsAllNameTheSystemsClassWithoutKeys) {
  install({"host1", "host2"});
  const auto alike = {"ZORVA_ComputerSystem > dnsgen1:host1", "ZORVA_ComputerSystem > dnsgen1:host1"};
  EXPECT_THAT(pairsOf(references(generalSettingPath())), testing::ElementsAreArray(alike));
  const Outcome names = referenceNames(generalSettingPath());
  EXPECT_THAT(pairsOf(names), testing::ElementsAreArray(alike));
  EXPECT_EQ(names.paths().at(0), names.paths().at(1));
}

TEST_F(GeneralElementSettingData, HostWithoutSettingsHasAssociationsOfNothing) {
  world.bmc().nic("bmc0").install();  // the service processor's interfaces give none
  broker.serve(kSystem, systems({"host1"}));
  for (const Outcome& outcome :
       {enumerateInstanceNames(), enumerateInstances(), getInstance(pair("host1")), associators(systemPath("host1")),
        associatorNames(systemPath("host1")), references(systemPath("host1")), referenceNames(systemPath("host1"))}) {
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(0U, outcome.instances().size() + outcome.paths().size());
  }
}

// --- Enumerations

TEST_F(GeneralElementSettingData, NamesGiveTheSettingsTheNamespaceAloneAndAreDoneBeforeTheyAreMarked) {
  install({"host1"});
  const Outcome names = enumerateInstanceNames();
  EXPECT_EQ(tell({entry(operation("EnumInstanceNames")),
                  {newPath(kSystem), "enumerateInstanceNames(OP1)"},
                  newGeneralSettingPath("OP2"),
                  {"E1.getNext()", R"(OP2.setNameSpace("root/cimv2"))"},
                  newHostPath("OP4", kAssociation),
                  keyEnds("OP4", "OP3", "OP2"),
                  {"returnObjectPath(OP4)", "returnDone()"},
                  exitMark(operation("EnumInstanceNames"))}),
            storyOf(names));
}

TEST_F(GeneralElementSettingData, InstancesPlaceTheSettingsAndAreDoneBeforeTheyAreMarked) {
  install({"host1"});
  const Outcome all = enumerateInstances();
  EXPECT_EQ(tell({entry(operation("EnumInstances")),
                  entry(kBuilder),
                  {newPath(kSystem), "enumerateInstanceNames(OP1)"},
                  newGeneralSettingPath("OP2"),
                  {"E1.getNext()"},
                  placed("OP2"),
                  newHostPath("OP4", kAssociation),
                  {"newInstance(OP4)", R"(I1.setPropertyFilter(null, {"ManagedElement", "SettingData"}))"},
                  setEnds("I1", "OP3", "OP2"),
                  setFlags("I1"),
                  exitMark(kBuilder),
                  {"returnInstance(I1)", "returnDone()"},
                  exitMark(operation("EnumInstances"))}),
            storyOf(all));
}

TEST_F(GeneralElementSettingData, PropertyListNarrowsInstancesToItAndTheKeys) {
  install({"host1"});
  EXPECT_THAT(enumerateInstances({{}}).instances().at(0).names(), ElementsAre("ManagedElement", "SettingData"));
  EXPECT_THAT(enumerateInstances({"IsDefault"}).instances().at(0).names(),
              ElementsAre("ManagedElement", "SettingData", "IsDefault"));
}

TEST_F(GeneralElementSettingData, NamesLeaveOpenOnEveryFailureAndShowItsCode) {
  install({"host1", "host1"});
  EXPECT_THAT(endOf(failing(newPath(kSystem), Mode::RcAndNull, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoSystemClassInNames));
  EXPECT_THAT(endOf(failing(newPath(kSystem), Mode::NullHandle, names())),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kNoSystemClassInNames));
  EXPECT_THAT(endOf(failing("enumerateInstanceNames(", Mode::SetRc, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoNames));
  EXPECT_THAT(endOf(failing(newPath(kSetting), Mode::ReturnNull, names())),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kNoSettings));
  EXPECT_THAT(endOf(failing(newPath(kAssociation), Mode::RcAndNull, names())),
              ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoPathInNames));
  EXPECT_THAT(pairsOf(failing(newPath(kAssociation), Mode::ReturnNull, names(), 2)),
              ElementsAre("host1 > dnsgen1:host1"));
}

TEST_F(GeneralElementSettingData, NamesTestTheSettingsPathOnlyAfterItsKeyWasRead) {
  install({"host1", "host1", ""});  // without a handle the key reads as the empty text, which contains only ""
  const Outcome lost = losingHandles(kSetting, kAssociation, names());
  EXPECT_THAT(lost.paths(), SizeIs(1));
  EXPECT_THAT(endOf(lost), ElementsAre("CMPI_RC_OK", "not done, not marked", kNotMatched, kBadSettingInNames));
}

TEST_F(GeneralElementSettingData, InstancesEndEmptyOnEveryFailureAndShowNoCode) {
  install({"host1", "host1"});
  const auto expectEmpty = [this](const Outcome& outcome, const char* text, bool marksExit = false) {
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked", text));
    EXPECT_EQ(0U, outcome.calls.count("returnInstance"));
    EXPECT_EQ(marksExit, outcome.lines.exited(kBuilder));
  };
  expectEmpty(failing(newPath(kSystem), Mode::RcAndNull, instances()), kNoSystemClass);
  expectEmpty(failing(newPath(kSystem), Mode::NullHandle, instances()), kNoSystemClass);
  expectEmpty(failing("enumerateInstanceNames(", Mode::SetRc, instances()), kNoNames);
  expectEmpty(failing(newPath(kSetting), Mode::ReturnNull, instances()), kNoSettings, true);
  expectEmpty(losingHandles(kSetting, kAssociation, instances()), kBadSettingInBuilder);
  expectEmpty(failing(newPath(kAssociation), Mode::RcAndNull, instances(), 2), kNoPathInBuilder);
  expectEmpty(failing(newPath(kAssociation), Mode::NullHandle, instances(), 2), kNoPathInBuilder);
}

TEST_F(GeneralElementSettingData, InstanceThatCouldNotBeMadeIsLoggedAsAMismatchAndLeftOut) {
  install({"host1", "host1"});
  for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull}) {
    const Outcome all = failing("newInstance(", mode, instances());
    EXPECT_THAT(endOf(all), ElementsAre("CMPI_RC_OK", "done, marked", kNotMatched));
    EXPECT_THAT(all.calls.only({"returnInstance"}), SizeIs(1));
  }
}

// --- One instance

TEST_F(GeneralElementSettingData, InstanceOfAPairIsFoundAndDoneBeforeItIsMarked) {
  install({"host2", "host", "host1"});
  const Outcome got = getInstance(pair("host1"));
  EXPECT_THAT(pairsOf(got), ElementsAre("host1 > dnsgen1:host1"));
  EXPECT_EQ(uint16(1), got.instances().at(0)["IsCurrent"]);
  EXPECT_EQ(uint16(1), got.instances().at(0)["IsDefault"]);
  const Story story = storyOf(got);
  EXPECT_EQ(tell({{"returnInstance(I2)", "returnDone()"}, exitMark(operation("GetInstance"))}),
            Story(story.end() - 4, story.end()));
}

TEST_F(GeneralElementSettingData, PathThatNamesNoPairGivesAnEmptyCompletedResult) {
  install({"host1"});
  const Path half = Path(kAssociation).key("ManagedElement", ref(systemPath("host1")));
  for (const Path& path : {pair("host2"), half, half.key("SettingData", "dnsgen1:host1"),
                           half.key("SettingData", ref(generalSettingPath("dnsgen1:host2")))}) {
    const Outcome got = getInstance(path);
    EXPECT_THAT(endOf(got), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_THAT(got.instances(), IsEmpty());
  }
  EXPECT_THAT(endOf(getInstance(associationClass())),
              ElementsAre("CMPI_RC_OK", "done, marked", "At least one key should be passed"));
}

// --- Associators and their names

TEST_F(GeneralElementSettingData, AssociatorsOfTheSettingsAreAllSystemsWhateverTheList) {
  install({"host1"});
  const Outcome found = associators(generalSettingPath(), {.properties = {"Name"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kSystem),
                  {newPath(kSystem), "enumerateInstances(OP2)", "E1.getNext()", "returnInstance(I1)", "returnDone()"},
                  exitMark(operation("Associators"))}),
            storyOf(found));
  EXPECT_EQ(
      tell({entry(operation("AssociatorNames")),
            newHostPath("OP1", kSystem),
            {newPath(kSystem), "enumerateInstanceNames(OP2)", "E1.getNext()", "returnObjectPath(OP3)", "returnDone()"},
            exitMark(operation("AssociatorNames"))}),
      storyOf(associatorNames(generalSettingPath())));
}

TEST_F(GeneralElementSettingData, AssociatorsOfASystemAreTheSettingsAndTheirNamesGoOutAsTheyCame) {
  install({});
  const Outcome found = associators(systemPath("host1"), {.properties = {"Caption"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kSetting),
                  newHostPath("OP2", kSetting),
                  {"newInstance(OP2)", R"(I1.setPropertyFilter({"Caption"}, {"InstanceID"}))"},
                  textProperties("I1", {{"InstanceID", "dnsgen1:host1"}, {"Caption", "DNS General Configuration"}}),
                  {"returnInstance(I1)", "returnDone()"},
                  exitMark(operation("Associators"))}),
            storyOf(found));
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kSetting),
                  newGeneralSettingPath("OP2"),
                  {"returnObjectPath(OP2)", "returnDone()"},
                  exitMark(operation("AssociatorNames"))}),
            storyOf(associatorNames(systemPath("host1"))));
}

TEST_F(GeneralElementSettingData, ResultClassIsTakenByItsTwoNamesInAnyCaseAndByNoOther) {
  install({"host1"});
  expectResultClasses(generalSettingPath(), 1,
                      {nullptr, kSystem, "zorva_computersystem", "CIM_ComputerSystem", "cim_COMPUTERsystem"},
                      {"", kSetting, "CIM_System", "ZORVA_SPComputerSystem", "ZORVA_Nowhere"});
  expectResultClasses(
      systemPath("host1"), 1,
      {nullptr, kSetting, "zorva_dnsgeneralsettingdata", "CIM_DNSGeneralSettingData", "cim_dnsGENERALsettingdata"},
      {"", kSystem, "CIM_SettingData", "ZORVA_DNSSettingData", "ZORVA_Nowhere"});
}

TEST_F(GeneralElementSettingData, AssociatorsLeaveOpenOnEveryFailureAndShowItsCode) {
  install({"host1"});
  const Path setting = generalSettingPath();
  for (const std::function<Outcome()>& run :
       {std::function([&] { return associators(setting); }), std::function([&] { return associatorNames(setting); })}) {
    EXPECT_THAT(endOf(failing(newPath(kSystem), Mode::RcAndNull, run, 1)),
                ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", "Object Path is NULL in Associators."));
    EXPECT_THAT(endOf(failing(newPath(kSystem), Mode::RcAndNull, run, 2)),
                ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kNoSystemClass));
    EXPECT_THAT(endOf(failing(newPath(kSystem), Mode::NullHandle, run, 2)),
                ElementsAre("CMPI_RC_OK", "not done, not marked", kNoSystemClass));
  }
  const auto names = [this] { return associatorNames(systemPath("host1")); };
  EXPECT_THAT(endOf(failing(newPath(kSetting), Mode::ReturnNull, names, 2)),
              ElementsAre("CMPI_RC_OK", "not done, not marked", kNoSettingsForAssociations));
}

TEST_F(GeneralElementSettingData, SettingsThatCouldNotBeMadeAreReturnedUnchanged) {
  install({});
  const Outcome found = failing(
      newPath(kSetting), Mode::ReturnNull, [&] { return associators(systemPath("a")); }, 2);
  EXPECT_THAT(endOf(found), ElementsAre("CMPI_RC_OK", "done, marked"));
  EXPECT_THAT(found.calls.only({"returnInstance"}), ElementsAre("returnInstance(null)"));
}

// --- References and their names

TEST_F(GeneralElementSettingData, ReferencesOfASystemPlaceTheSettings) {
  install({});
  const Outcome found = references(systemPath("host1"));
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kSetting),
                  {newPath(kAssociation)},  // it gets no host
                  newGeneralSettingPath("OP3"),
                  {"newInstance(OP2)"},
                  placed("OP3"),
                  setEnds("I1", "ref", "OP3"),
                  setFlags("I1"),
                  {"returnInstance(I1)", "returnDone()"},
                  exitMark(operation("References"))}),
            storyOf(found));
}

TEST_F(GeneralElementSettingData, ReferencesOfTheSettingsOnlyCountTheSystems) {
  install({"host1"});
  const Outcome found = references(generalSettingPath());
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kSystem),
                  {newPath(kAssociation), "enumerateInstanceNames(OP1)", "E1.getNext()", "newInstance(OP2)"},
                  setEnds("I1", "OP1", "ref"),
                  setFlags("I1"),
                  {"returnInstance(I1)", "returnDone()"},
                  exitMark(operation("References"))}),
            storyOf(found));
}

TEST_F(GeneralElementSettingData, ReferenceNamesAreThePathsOfInstancesOnTheSourcesNamespaceWithoutAHost) {
  install({"host1"});
  const Outcome names = referenceNames(systemPath("host1"));
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kSetting),
                  {newPath(kAssociation)},
                  newGeneralSettingPath("OP3"),
                  {"newInstance(OP2)"},
                  placed("OP3"),
                  setEnds("I1", "ref", "OP3"),
                  setFlags("I1"),
                  {"I1.getObjectPath()", R"(OP4.setNameSpace("root/cimv2"))", "returnObjectPath(OP4)", "returnDone()"},
                  exitMark(operation("ReferenceNames"))}),
            storyOf(names));
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kSystem),
                  {newPath(kAssociation), "enumerateInstanceNames(OP1)", "E1.getNext()", "newInstance(OP2)"},
                  setEnds("I1", "OP1", "ref"),
                  setFlags("I1"),
                  {"I1.getObjectPath()", R"(OP4.setNameSpace("root/cimv2"))", "returnObjectPath(OP4)", "returnDone()"},
                  exitMark(operation("ReferenceNames"))}),
            storyOf(referenceNames(generalSettingPath())));
}

TEST_F(GeneralElementSettingData, ReferencesLeaveOpenIfTheSettingsCannotBeRead) {
  install({});
  for (const Outcome& found :
       {failing(
            newPath(kSetting), Mode::ReturnNull, [this] { return references(systemPath("host1")); }, 2),
        failing(
            newPath(kSetting), Mode::ReturnNull, [this] { return referenceNames(systemPath("host1")); }, 2)}) {
    EXPECT_THAT(endOf(found), ElementsAre("CMPI_RC_OK", "not done, not marked", kNoSettingsForAssociations));
  }
}

TEST_F(GeneralElementSettingData, ReferenceThatCouldNotBeMadeIsReturnedUnchanged) {
  install({"host1"});
  for (const Path& source : {generalSettingPath(), systemPath("host1")}) {
    const auto references = [&] { return this->references(source); };
    const auto names = [&] { return referenceNames(source); };
    EXPECT_THAT(failing("newInstance(", Mode::ReturnNull, references).calls.only({"returnInstance"}),
                ElementsAre("returnInstance(null)"));
    EXPECT_THAT(failing("newInstance(", Mode::ReturnNull, names).calls.only({"returnObjectPath"}),
                ElementsAre("returnObjectPath(null)"));
  }
}

// --- The other provider, sources, arguments, failures

TEST_F(GeneralElementSettingData, OtherProvidersFailureShowsItsCodeWhereverTheBrokerIsAskedButInTheBuilder) {
  install({});
  expectToEndAsTheOtherProviderHasIt(kSystem, systems({"host1", "host2"}),
                                     {{names(), kNoNames, true},
                                      {instances(), kNoNames, false},
                                      {[this] { return getInstance(pair("host1")); }, kNoNames, false},
                                      {[this] { return associators(generalSettingPath()); }, kNoNames, true},
                                      {[this] { return associatorNames(generalSettingPath()); }, kNoNames, true},
                                      {[this] { return references(generalSettingPath()); }, kNoNames, true},
                                      {[this] { return referenceNames(generalSettingPath()); }, kNoNames, true}});
}

TEST_F(GeneralElementSettingData, SystemsProviderIsNotNeededFromASystem) {
  world.nic("eth0").install();
  EXPECT_THAT(associators(systemPath("host1")).instances(), SizeIs(1));
  EXPECT_THAT(associatorNames(systemPath("host1")).paths(), SizeIs(1));
  EXPECT_THAT(references(systemPath("host1")).instances(), SizeIs(1));
  EXPECT_THAT(referenceNames(systemPath("host1")).paths(), SizeIs(1));
}

TEST_F(GeneralElementSettingData, SourceOfAClassAtNeitherEndHasNoFarEndAndTheNamesLogItWithTheSameText) {
  install({"host1"});
  for (const Path& source : {endpointPath("eth0"), settingPath("Computer%eth0"), Path("CIM_ComputerSystem")}) {
    expectNoFarEnd(source, {"Object Path is NULL in Associators.", "Object Path is NULL in Associators.",
                            "Object Path is NULL in References.", "Object Path is NULL in References."});
  }
}

TEST_F(GeneralElementSettingData, AssociationClassOfAnotherAssociationLeadsToItsFarEnd) {
  install({"host1"});
  const AssociationQuery endpoints = {.assocClass = "ZORVA_DNSHostedAccessPoint"};
  EXPECT_THAT(endOf(associators(systemPath("host1"), endpoints)), ElementsAre("CMPI_RC_OK", "done, marked"));
  EXPECT_THAT(endOf(associatorNames(systemPath("host1"), endpoints)), ElementsAre("CMPI_RC_OK", "done, marked"));
  EXPECT_THAT(associators(systemPath("host1"), endpoints).instances(), IsEmpty());
  // Both associations have these ends.
  EXPECT_THAT(textsOf(associators(endpointPath("eth0"), endpoints).instances(), "Name"), ElementsAre("host1"));
  const AssociationQuery settings = {.assocClass = "ZORVA_DNSGenEndPointElementSettingData"};
  EXPECT_THAT(textsOf(associatorNames(endpointPath("eth0"), settings).paths(), "InstanceID"),
              ElementsAre("dnsgen1:host1"));
  EXPECT_THAT(associationProvider.associators(systemPath("host1"), {}).instances(), SizeIs(1));
  EXPECT_THAT(associationProvider.associatorNames(systemPath("host1"), {}).paths(), SizeIs(1));
}

TEST_F(GeneralElementSettingData, RolesAndTheArgumentsOfReferencesAreNotRead) {
  install({"host1"});
  expectUnreadArgumentsIgnored(generalSettingPath());
  expectUnreadArgumentsIgnored(systemPath("host1"));
}

TEST_F(GeneralElementSettingData, EveryUpCallHasTheOperationsContext) {
  install({"host1"});
  expectUpCallsInTheOperationsContext(allRequests(pair("host1"), generalSettingPath(), systemPath("host1")), 7);
}

TEST_F(GeneralElementSettingData, EverythingLiesInTheNamespaceOfTheRequest) {
  install({"host1"});
  expectTheRequestsNamespaceEverywhere(systemPath("host1"), generalSettingPath());
}

TEST_F(GeneralElementSettingData, SurvivesEveryFailureOfTheBroker) {
  install({"host1", "host1", "host2"});
  expectToSurviveEveryFailure(allRequests(pair("host1"), generalSettingPath(), systemPath("host1")));
}

TEST_F(GeneralElementSettingData, SurvivesEveryFailureOfTheTree) {
  install({"host1"});
  using zorva::agent::TreeCall;
  expectToSurviveEveryTreeFailure(
      allRequests(pair("host1"), generalSettingPath(), systemPath("host1")),
      {TreeCall::Construct, TreeCall::Copy, TreeCall::Test, TreeCall::SelectByPath, TreeCall::GetPathToParent,
       TreeCall::GetDescription, TreeCall::GetText, TreeCall::GetList});
}

}  // namespace
}  // namespace ZV::Test
