#include "providers/testing/SettingAssociations.h"

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const char* const kAssociation = "ZORVA_DNSEndPointElementSettingData";
const char* const kBuilder = "DNSEndpointElementSettingDataCMPIInstances";

const char* const kNoEndpoints = "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames";
const char* const kNoSettingsInBuilder = "getAllDNSSettingDataCMPIObjectPaths failed";
const char* const kNoSettingPaths = "getAllDNSSettingDataCMPIObjectPaths Failed";
const char* const kBadEndpoint = "CMPIObjectPath is NULL for DNS Server";
const char* const kBadSetting = "CMPIObjectPath is NULL for DNS Client";
const char* const kNoPath = "Create CMPIObjectPath failed for                     DNSEndpointElementSettingData.";
const char* const kMalformed = "Incorrect InstanceID in the Source ObjectPath";

class EndpointElementSettingData : public SettingAssociationTest {
 protected:
  EndpointElementSettingData() : SettingAssociationTest(endpointElementSettingData()) {}

  void installOne() { world.host().nic("eth0").install(); }
  // Endpoints come in the order of their names, settings in the order of the interfaces.
  void installThree() { world.host().nic("eth1").nic("eth0").bmc().nic("bmc0").install(); }
  // The second setting has no key, the third has the endpoint's name again.
  void installMalformed() { world.host().nic("eth0").nic("x", {.isUnnamed = true}).bmc().nic("eth0").install(); }

  static std::string token(const std::string& name) { return "log 4000 VARIABLE instance_tokens[1] = " + name; }
  Story setAll(const std::string& instance, const std::string& endpoint, const std::string& setting) const {
    return tell({setEnds(instance, endpoint, setting), flags(instance, 2)});
  }
};

// --- Enumerations

TEST_F(EndpointElementSettingData, InstancesAreBuiltFirstAndThenReturned) {
  installOne();
  const Outcome all = enumerateInstances();
  EXPECT_EQ(tell({entry(operation("EnumInstances")),
                  entry(kBuilder),
                  newEndpointPath("OP1", "eth0"),
                  newSettingPath("OP2", "Computer%eth0"),
                  {inRootCimv2("OP1"), token("eth0")},  // the endpoint's host is not set again
                  placed("OP2"),
                  newHostPath("OP3", kAssociation),
                  {"newInstance(OP3)", R"(I1.setPropertyFilter(null, {"ManagedElement", "SettingData"}))"},
                  setAll("I1", "OP1", "OP2"),
                  exitMark(kBuilder),
                  {"returnInstance(I1)"},
                  done(operation("EnumInstances"))}),
            storyOf(all));
  EXPECT_EQ(CMPI_RC_OK, all.rc);
}

TEST_F(EndpointElementSettingData, NamesAreThoseOfTheBuiltInstances) {
  installOne();
  const Outcome names = enumerateInstanceNames();
  EXPECT_EQ(tell({entry(operation("EnumInstanceNames")),
                  entry(kBuilder),
                  newEndpointPath("OP1", "eth0"),
                  newSettingPath("OP2", "Computer%eth0"),
                  {inRootCimv2("OP1"), token("eth0")},
                  placed("OP2"),
                  newHostPath("OP3", kAssociation),
                  {"newInstance(OP3)", R"(I1.setPropertyFilter(null, {"ManagedElement", "SettingData"}))"},
                  setAll("I1", "OP1", "OP2"),
                  exitMark(kBuilder),
                  {"I1.getObjectPath()", "returnObjectPath(OP4)"},
                  done(operation("EnumInstanceNames"))}),
            storyOf(names));
  EXPECT_EQ(CMPI_RC_OK, names.rc);
}

TEST_F(EndpointElementSettingData, EndpointsComeByNameAndEachMeetsTheSettingOfItsInterface) {
  installThree();
  for (const Operation& run : enumerations()) {
    EXPECT_THAT(pairsOf(run()), ElementsAre("bmc0 > BMC%bmc0", "eth0 > Computer%eth0", "eth1 > Computer%eth1"));
  }
}

TEST_F(EndpointElementSettingData, EveryAssociationIsNeitherCurrentNorDefault) {
  installThree();
  const Outcome all = enumerateInstances();
  ASSERT_THAT(all.instances(), SizeIs(3));
  for (const Instance& one : all.instances()) {
    EXPECT_THAT(one.names(), ElementsAre("ManagedElement", "SettingData", "IsCurrent", "IsDefault"));
    EXPECT_EQ(uint16(2), one["IsCurrent"]);
    EXPECT_EQ(uint16(2), one["IsDefault"]);
  }
}

TEST_F(EndpointElementSettingData, OneEndpointMeetsTheSettingsOfBothSystems) {
  world.host().nic("eth0").bmc().nic("eth0").install();
  for (const Operation& run : enumerations()) {
    EXPECT_THAT(pairsOf(run()), ElementsAre("eth0 > Computer%eth0", "eth0 > BMC%eth0"));
  }
  EXPECT_THAT(textsOf(associators(endpointPath("eth0")).instances(), "InstanceID"),
              ElementsAre("Computer%eth0", "BMC%eth0"));
}

TEST_F(EndpointElementSettingData, CaseOfTheNameCounts) {
  installOne();
  EXPECT_THAT(pairsOf(references(endpointPath("ETH0"))), IsEmpty());
  EXPECT_THAT(pairsOf(references(settingPath("Computer%ETH0"))), IsEmpty());
  world.nic("ETH0").install();
  EXPECT_THAT(pairsOf(enumerateInstances()), ElementsAre("ETH0 > Computer%ETH0", "eth0 > Computer%eth0"));
}

TEST_F(EndpointElementSettingData, NameMustBeEqualInItsWholeLength) {
  world.host().nic("eth").nic("eth01").install();
  EXPECT_THAT(pairsOf(references(settingPath("Computer%eth0"))), IsEmpty());
  EXPECT_THAT(pairsOf(enumerateInstances()), ElementsAre("eth > Computer%eth", "eth01 > Computer%eth01"));
}

TEST_F(EndpointElementSettingData, PercentSignInANameCutsIt) {
  world.host().nic("eth0").nic("eth0%x").nic("%y").nic("z%").install();
  EXPECT_THAT(pairsOf(enumerateInstances()), ElementsAre("eth0 > Computer%eth0", "eth0 > Computer%eth0%x"));
}

TEST_F(EndpointElementSettingData, MalformedSettingIsPassedOverInSilence) {
  world.host().nic("eth0").nic("").nic("x", {.isUnnamed = true}).bmc().nic("eth0").install();
  for (const Operation& run : enumerations()) {
    const Outcome outcome = run();
    EXPECT_THAT(pairsOf(outcome), ElementsAre("eth0 > Computer%eth0", "eth0 > BMC%eth0"));
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    // Of both endpoints, the nameless one and eth0: the log has no line about the two settings without a second part.
    EXPECT_THAT(outcome.lines.ofCategory(under.category).ofKind(LineKind::Variable), SizeIs(4));
  }
}

TEST_F(EndpointElementSettingData, HostWithoutEndpointsIsAnErrorLineAndAnEmptyResult) {
  world.host().install();
  for (const Operation& run : enumerations()) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked", kNoEndpoints));
    EXPECT_FALSE(outcome.lines.exited(kBuilder));
  }
}

TEST_F(EndpointElementSettingData, EndpointsWithoutTheirSettingsGiveAnEmptyResult) {
  world.host().nic("%y").install();
  for (const Operation& run : enumerations()) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_TRUE(outcome.lines.exited(kBuilder));
    EXPECT_THAT(pairsOf(outcome), IsEmpty());
  }
}

TEST_F(EndpointElementSettingData, EveryFailureOfTheBuilderEndsEmptyAndShowsNoCode) {
  installThree();
  const auto expectEmpty = [this](const Outcome& outcome, const char* text, bool builderIsMarked = false) {
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked", text));
    EXPECT_EQ(0U, handedOut(outcome));
    EXPECT_EQ(builderIsMarked, outcome.lines.exited(kBuilder));
  };
  for (const Operation& run : enumerations()) {
    expectEmpty(failing(newPath(kEndpointClass), Mode::RcAndNull, run, 2), kNoEndpoints);
    expectEmpty(failing(newPath(kSettingClass), Mode::RcAndNull, run, 2), kNoSettingsInBuilder, true);
    expectEmpty(failing(newPath(kSettingClass), Mode::NullHandle, run, 2), kNoSettingsInBuilder, true);
    expectEmpty(failing(newPath(kAssociation), Mode::RcAndNull, run, 3), kNoPath);
    expectEmpty(failing(newPath(kAssociation), Mode::NullHandle, run, 3), kNoPath);
    expectEmpty(losingHandles(kEndpointClass, kSettingClass, run), kBadEndpoint);
    expectEmpty(losingHandles(kSettingClass, kAssociation, run), kBadSetting);
  }
}

TEST_F(EndpointElementSettingData, FailureOfTheBuilderLeavesTheSearchForOneDoneAndEmpty) {
  installThree();
  const Outcome outcome = failing(
      newPath(kAssociation), Mode::RcAndNull,
      [this] { return getInstance(pairOf(endpointPath("bmc0", "BMC:-1"), settingPath("BMC%bmc0"))); }, 2);
  EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked", kNoPath));
  EXPECT_THAT(outcome.instances(), IsEmpty());
}

TEST_F(EndpointElementSettingData, NameThatTheBrokerCannotReadIsPassedOnUnchanged) {
  installThree();
  const Outcome outcome = failing(
      "getObjectPath", Mode::RcAndNull, [this] { return enumerateInstanceNames(); }, 3);
  EXPECT_THAT(outcome.calls.only({"returnObjectPath"}).back(), "returnObjectPath(null)");
  EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_ERR_FAILED", "done, marked"));
}

// --- From a setting to its endpoint

TEST_F(EndpointElementSettingData, EndpointIsMadeWithThePropertiesThatWereAskedFor) {
  installOne();
  const Outcome outcome = associators(settingPath("Computer%eth0"), {.properties = {"Name"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kEndpointClass),
                  {token("eth0")},
                  newEndpoint("OP2", "I1", "eth0", R"({"Name"})"),
                  {"returnInstance(I1)"},
                  done(operation("Associators"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(EndpointElementSettingData, EndpointsPathGetsNamespaceAndHostAgain) {
  installOne();
  const Outcome outcome = associatorNames(settingPath("Computer%eth0"));
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kEndpointClass),
                  newEndpointPath("OP2", "eth0"),
                  placed("OP2"),
                  {"returnObjectPath(OP2)"},
                  done(operation("AssociatorNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(EndpointElementSettingData, ReferenceOfASettingHoldsTheEndpointAndTheSource) {
  installOne();
  const Outcome outcome = references(settingPath("Computer%eth0"));
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kEndpointClass),
                  {newPath(kAssociation)},  // without a host
                  newEndpointPath("OP3", "eth0"),
                  placed("OP3"),
                  {"newInstance(OP2)"},
                  setAll("I1", "OP3", "ref"),
                  {"returnInstance(I1)"},
                  done(operation("References"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(EndpointElementSettingData, NameOfAReferenceOfASettingIsAskedOfTheInstance) {
  installOne();
  const Outcome outcome = referenceNames(settingPath("Computer%eth0"));
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kEndpointClass),
                  {newPath(kAssociation)},
                  newEndpointPath("OP3", "eth0"),
                  placed("OP3"),
                  {"newInstance(OP2)"},
                  setAll("I1", "OP3", "ref"),
                  returnedPath("I1", "OP4"),
                  done(operation("ReferenceNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(EndpointElementSettingData, SettingLeadsToTheEndpointOfItsInterfaceWhateverItsPrefix) {
  installThree();
  for (const char* instanceID : {"Computer%eth0", "BMC%eth0", "x%eth0", "Computer%eth0%x", "Computer%%eth0",
                                 "%Computer%eth0", "Computer%eth0%", "%%Computer%%eth0%%x%%"}) {
    SCOPED_TRACE(instanceID);
    const Path source = settingPath(instanceID);
    EXPECT_THAT(textsOf(associators(source).instances(), "Name"), ElementsAre("eth0"));
    EXPECT_THAT(textsOf(associatorNames(source).paths(), "Name"), ElementsAre("eth0"));
    EXPECT_THAT(pairsOf(references(source)), ElementsAre(std::string("eth0 > ") + instanceID));
    EXPECT_THAT(pairsOf(referenceNames(source)), ElementsAre(std::string("eth0 > ") + instanceID));
  }
}

TEST_F(EndpointElementSettingData, SettingOfNoEndpointLeadsNowhere) {
  installThree();
  for (const Operation& run : allFrom(settingPath("Computer%eth7"))) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(0U, handedOut(outcome));
  }
}

TEST_F(EndpointElementSettingData, MalformedSourceIsLoggedAndLeavesTheResultOpen) {
  installThree();
  for (const char* instanceID : {"", "%", "%%%", "Computereth0", "%eth0", "eth0%", "%%eth0%%", "dnsgen1:host1"}) {
    SCOPED_TRACE(instanceID);
    for (const Operation& run : allFrom(settingPath(instanceID))) {
      const Outcome outcome = run();
      EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "not done, not marked", kMalformed));
      EXPECT_THAT(pairsOf(outcome), IsEmpty());
      EXPECT_EQ(0U, outcome.calls.count("addKey") + outcome.calls.count("newInstance"));  // nothing was fetched
    }
  }
}

TEST_F(EndpointElementSettingData, SourceWithoutItsKeyHasTheEmptyText) {
  installThree();
  for (const Operation& run : allFrom(Path(kSettingClass))) {
    EXPECT_THAT(endOf(run()), ElementsAre("CMPI_RC_ERR_NOT_FOUND", "not done, not marked", kMalformed));
  }
  for (const Operation& run : allFrom(Path(kSettingClass).key("InstanceID", uint16(7)))) {
    EXPECT_THAT(endOf(run()), ElementsAre("CMPI_RC_OK", "not done, not marked", kMalformed));
  }
  for (const Operation& run : allFrom(Path(kEndpointClass))) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_THAT(pairsOf(outcome), IsEmpty());
  }
}

TEST_F(EndpointElementSettingData, FailedFetchOfEndpointsLeavesOpenWithoutAWord) {
  world.install();
  for (const Operation& run : allFrom(settingPath("Computer%eth0"))) {
    EXPECT_THAT(endOf(run()), ElementsAre("CMPI_RC_OK", "not done, not marked"));
  }
  installThree();
  for (const Operation& run : pathsFrom(settingPath("Computer%eth0"))) {
    EXPECT_THAT(endOf(failing(newPath(kEndpointClass), Mode::RcAndNull, run, 3)),
                ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked"));
  }
}

// --- From an endpoint to its settings

TEST_F(EndpointElementSettingData, SettingIsMadeFromTheSourceWithThePropertiesThatWereAskedFor) {
  installOne();
  const Outcome outcome = associators(endpointPath("eth0"), {.properties = {"InstanceID"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kSettingClass),
                  newSetting("OP2", "I1", kSettingClass, "Computer%eth0"),
                  {token("eth0"), "returnInstance(I1)"},
                  done(operation("Associators"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(EndpointElementSettingData, SettingsPathIsReturnedUnchanged) {
  installOne();
  const Outcome outcome = associatorNames(endpointPath("eth0"));
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kSettingClass),
                  newSettingPath("OP2", "Computer%eth0"),
                  {"returnObjectPath(OP2)"},
                  done(operation("AssociatorNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(EndpointElementSettingData, ReferenceOfAnEndpointHoldsTheSourceAndTheSetting) {
  world.host().nic("eth1").nic("eth0").install();
  const Outcome outcome = references(endpointPath("eth0"));
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kSettingClass),
                  {newPath(kAssociation)},
                  newSettingPath("OP3", "Computer%eth1"),
                  newSettingPath("OP4", "Computer%eth0"),
                  placed("OP4"),
                  {"newInstance(OP2)"},
                  setAll("I1", "ref", "OP4"),
                  {"returnInstance(I1)"},
                  done(operation("References"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(EndpointElementSettingData, NameOfAReferenceOfAnEndpointCostsAnInstanceForEveryCandidate) {
  world.host().nic("eth1").nic("eth0").install();
  const Outcome outcome = referenceNames(endpointPath("eth0"));
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kSettingClass),
                  {newPath(kAssociation)},
                  newSettingPath("OP3", "Computer%eth1"),
                  newSettingPath("OP4", "Computer%eth0"),
                  {"newInstance(OP2)", "newInstance(OP2)"},
                  placed("OP4"),
                  setAll("I2", "ref", "OP4"),
                  returnedPath("I2", "OP5"),
                  done(operation("ReferenceNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(EndpointElementSettingData, OnlyAssociatorsLogTheCandidates) {
  installThree();
  EXPECT_THAT(associators(endpointPath("eth0")).lines.ofCategory(under.category).ofKind(LineKind::Variable), SizeIs(3));
  EXPECT_THAT(associators(settingPath("Computer%eth0")).lines.ofCategory(under.category).ofKind(LineKind::Variable),
              SizeIs(1));
  for (const Path& source : {endpointPath("eth0"), settingPath("Computer%eth0")}) {
    for (const Operation& run : pathsFrom(source)) {
      EXPECT_THAT(run().lines.ofCategory(under.category).ofKind(LineKind::Variable), IsEmpty());
    }
  }
}

TEST_F(EndpointElementSettingData, EveryMatchIsReturnedAndNoneEndsTheWalk) {
  world.host().nic("eth0").nic("eth1").bmc().nic("eth0").install();
  const auto both = ElementsAre("Computer%eth0", "BMC%eth0");
  EXPECT_THAT(textsOf(associators(endpointPath("eth0")).instances(), "InstanceID"), both);
  EXPECT_THAT(textsOf(associatorNames(endpointPath("eth0")).paths(), "InstanceID"), both);
  EXPECT_THAT(pairsOf(references(endpointPath("eth0"))), ElementsAre("eth0 > Computer%eth0", "eth0 > BMC%eth0"));
  EXPECT_THAT(pairsOf(referenceNames(endpointPath("eth0"))), ElementsAre("eth0 > Computer%eth0", "eth0 > BMC%eth0"));
}

TEST_F(EndpointElementSettingData, MalformedCandidateStopsTheOperationAndEarlierResultsStay) {
  installMalformed();
  for (const Operation& run : allFrom(endpointPath("eth0"))) {
    const Outcome outcome = run();
    EXPECT_EQ("not done, not marked", endOf(outcome).at(1));
    EXPECT_THAT(complaintsOf(outcome), ElementsAre(kMalformed));
    EXPECT_EQ(1U, outcome.instances().size() + outcome.paths().size());
  }
}

TEST_F(EndpointElementSettingData, EndpointOfNoSettingLeadsNowhere) {
  installThree();
  for (const Operation& run : allFrom(endpointPath("eth7"))) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(0U, handedOut(outcome));
  }
}

TEST_F(EndpointElementSettingData, HostWithoutSettingsAnswersAnEndpointWithAnEmptyResult) {
  world.host().install();
  for (const Operation& run : allFrom(endpointPath("eth0"))) {
    EXPECT_THAT(endOf(run()), ElementsAre("CMPI_RC_OK", "done, marked"));
  }
}

TEST_F(EndpointElementSettingData, FailedFetchOfSettingPathsIsLoggedAndLeavesTheResultOpen) {
  installThree();
  for (const Operation& run : pathsFrom(endpointPath("eth0"))) {
    const Outcome outcome = failing(newPath(kSettingClass), Mode::RcAndNull, run, 3);
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "not done, not marked", kNoSettingPaths));
    EXPECT_THAT(pairsOf(outcome), IsEmpty());
  }
}

// --- the properties that a client requests

TEST_F(EndpointElementSettingData, PropertyListNarrowsAssociatorsAndNoReferences) {
  world.host().nic("eth0", usualNic()).install();
  EXPECT_THAT(associators(endpointPath("eth0"), {.properties = {"DomainName"}}).instances().at(0).names(),
              ElementsAre("InstanceID", "DomainName"));
  EXPECT_THAT(associators(settingPath("Computer%eth0"), {.properties = {"Hostname"}}).instances().at(0).names(),
              ElementsAre("SystemCreationClassName", "CreationClassName", "SystemName", "Name", "Hostname"));
  for (const Path& source : {endpointPath("eth0"), settingPath("Computer%eth0")}) {
    const Instance one = references(source, {.properties = {"IsDefault"}}).instances().at(0);
    EXPECT_THAT(one.names(), ElementsAre("ManagedElement", "SettingData", "IsCurrent", "IsDefault"));
    EXPECT_EQ(uint16(2), one["IsCurrent"]);
    EXPECT_EQ(uint16(2), one["IsDefault"]);
  }
}

}  // namespace
}  // namespace ZV::Test
