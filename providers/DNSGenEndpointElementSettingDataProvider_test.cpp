#include "providers/testing/SettingAssociations.h"

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const char* const kAssociation = "ZORVA_DNSGenEndPointElementSettingData";
const char* const kSister = "ZORVA_DNSEndPointElementSettingData";
const char* const kBuilder = "DNSGenEndpointElementSettingDataCMPIInstances";

const char* const kNoEndpoints = "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames";
const char* const kNoSettingsForNames =
    "Can't get ObjectPaths for DNSGeneralSettingData.             Exiting EnumerateInstanceNames";
const char* const kNoSettingsInBuilder = "getAllDNSGeneralSettingDataCMPIObjectPaths failed";
const char* const kNoSettingPaths = "getAllDNSGeneralSettingDataCMPIObjectPaths Failed";
const char* const kBadEndpoint = "CMPIObjectPath is NULL for DNS Server";
const char* const kBadSettingInBuilder = "CMPIObjectPath is NULL for DNS Client";
const char* const kBadSettingForNames = "CMPIObjectPath is NULL for DNSGeneralSettingData";
const char* const kNoPathInBuilder =
    "Create CMPIObjectPath failed for                     DNSGenEndpointElementSettingData.";
const char* const kNoPathForNames =
    "Create CMPIObjectPath failed for                     DNSGenEndpointElementSettingData Class.";

class GenEndpointElementSettingData : public SettingAssociationTest {
 protected:
  GenEndpointElementSettingData() : SettingAssociationTest(genEndpointElementSettingData()) {}

  void installOne() { world.host().nic("eth0").install(); }
  void installThree() { world.host().nic("eth1").nic("eth0").bmc().nic("bmc0").install(); }
  void installServiceProcessorAlone() { world.bmc().nic("bmc0").install(); }

  Story setAll(const std::string& instance, const std::string& endpoint, const std::string& setting) const {
    return tell({setEnds(instance, endpoint, setting), flags(instance, 1)});
  }
  static std::vector<std::string> endpointsOf(const Outcome& outcome) {
    return outcome.paths().empty() ? textsOf(outcome.instances(), "Name") : textsOf(outcome.paths(), "Name");
  }

  std::function<Outcome()> names() {
    return [this] { return enumerateInstanceNames(); };
  }
  std::function<Outcome()> instances() {
    return [this] { return enumerateInstances(); };
  }
};

// --- Enumerations

TEST_F(GenEndpointElementSettingData, NamesAreMadeOfBothPathsAndGoOutAtOnce) {
  installOne();
  const Outcome names = enumerateInstanceNames();
  EXPECT_EQ(tell({entry(operation("EnumInstanceNames")),
                  newEndpointPath("OP1", "eth0"),
                  newGeneralSettingPath("OP2"),
                  {inRootCimv2("OP1"), inRootCimv2("OP2")},  // the setting's host is not set again
                  newHostPath("OP3", kAssociation),
                  keyEnds("OP3", "OP1", "OP2"),
                  {"returnObjectPath(OP3)"},
                  done(operation("EnumInstanceNames"))}),
            storyOf(names));
  EXPECT_EQ(CMPI_RC_OK, names.rc);
}

TEST_F(GenEndpointElementSettingData, InstancesAreBuiltFirstAndThenReturned) {
  installOne();
  const Outcome all = enumerateInstances();
  EXPECT_EQ(tell({entry(operation("EnumInstances")),
                  entry(kBuilder),
                  newEndpointPath("OP1", "eth0"),
                  newGeneralSettingPath("OP2"),
                  {inRootCimv2("OP1")},  // the endpoint's host is not set again
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

TEST_F(GenEndpointElementSettingData, ThreeEndpointsAndOneSettingGiveThreeAssociations) {
  installThree();
  const auto all = ElementsAre("bmc0 > dnsgen1:host1", "eth0 > dnsgen1:host1", "eth1 > dnsgen1:host1");
  EXPECT_THAT(pairsOf(enumerateInstanceNames()), all);
  EXPECT_THAT(pairsOf(enumerateInstances()), all);
}

TEST_F(GenEndpointElementSettingData, EndsAreNamedWholly) {
  world.host().nic("eth0").bmc().nic("bmc0").install();
  const std::vector<Path> names = enumerateInstanceNames().paths();
  ASSERT_THAT(names, SizeIs(2));
  EXPECT_EQ(kAssociation, names[0].className);
  EXPECT_EQ("host1", names[0].host);
  EXPECT_EQ("ZORVA_SPComputerSystem", names[0]["ManagedElement"].path()["SystemCreationClassName"].text());
  EXPECT_EQ("BMC:-1", names[0]["ManagedElement"].path()["SystemName"].text());
  EXPECT_EQ("host1", names[1]["ManagedElement"].path()["SystemName"].text());
  EXPECT_EQ(kGeneralSettingClass, names[1]["SettingData"].path().className);
}

TEST_F(GenEndpointElementSettingData, EveryAssociationIsCurrentAndDefault) {
  installThree();
  const Outcome all = enumerateInstances();
  ASSERT_THAT(all.instances(), SizeIs(3));
  for (const Instance& one : all.instances()) {
    EXPECT_THAT(one.names(), ElementsAre("ManagedElement", "SettingData", "IsCurrent", "IsDefault"));
    EXPECT_EQ(uint16(1), one["IsCurrent"]);
    EXPECT_EQ(uint16(1), one["IsDefault"]);
  }
}

TEST_F(GenEndpointElementSettingData, HostWithoutGeneralSettingHasNoAssociation) {
  installServiceProcessorAlone();
  std::vector<Operation> all = instanceOperations(pairOf(endpointPath("bmc0"), generalSettingPath()));
  for (const Operation& run : allFrom(endpointPath("bmc0"))) all.push_back(run);
  for (const Operation& run : all) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(0U, handedOut(outcome));
  }
}

TEST_F(GenEndpointElementSettingData, HostWithoutEndpointsLeavesNamesOpenAndEndsInstancesEmpty) {
  world.host().install();
  EXPECT_THAT(endOf(enumerateInstanceNames()), ElementsAre("CMPI_RC_OK", "not done, not marked", kNoEndpoints));
  const Outcome all = enumerateInstances();
  EXPECT_EQ(tell({entry(operation("EnumInstances")),
                  entry(kBuilder),
                  {error(kNoEndpoints)},
                  done(operation("EnumInstances"))}),
            storyOf(all));
  EXPECT_THAT(all.instances(), IsEmpty());
}

TEST_F(GenEndpointElementSettingData, NamesLeaveOpenOnEveryFailure) {
  installThree();
  const auto expectOpen = [this](const Outcome& outcome, const char* code, const char* text) {
    EXPECT_THAT(endOf(outcome), ElementsAre(code, "not done, not marked", text));
  };
  expectOpen(failing(newPath(kEndpointClass), Mode::RcAndNull, names(), 2), "CMPI_RC_ERR_FAILED", kNoEndpoints);
  expectOpen(failing(newPath(kEndpointClass), Mode::NullHandle, names()), "CMPI_RC_OK", kNoEndpoints);
  expectOpen(failing(newPath(kGeneralSettingClass), Mode::RcAndNull, names()), "CMPI_RC_OK", kNoSettingsForNames);
  expectOpen(failing(newPath(kGeneralSettingClass), Mode::NullHandle, names()), "CMPI_RC_OK", kNoSettingsForNames);
  expectOpen(failing(newPath(kAssociation), Mode::RcAndNull, names(), 2), "CMPI_RC_ERR_FAILED", kNoPathForNames);
  expectOpen(failing(newPath(kAssociation), Mode::NullHandle, names(), 2), "CMPI_RC_OK", kNoPathForNames);
  expectOpen(losingHandles(kEndpointClass, kGeneralSettingClass, names()), "CMPI_RC_OK", kBadEndpoint);
  expectOpen(losingHandles(kGeneralSettingClass, kAssociation, names()), "CMPI_RC_OK", kBadSettingForNames);
}

TEST_F(GenEndpointElementSettingData, NamesThatWentOutBeforeAFailureStayDelivered) {
  installThree();
  EXPECT_THAT(pairsOf(failing(newPath(kAssociation), Mode::ReturnNull, names(), 3)),
              ElementsAre("bmc0 > dnsgen1:host1", "eth0 > dnsgen1:host1"));
}

TEST_F(GenEndpointElementSettingData, InstancesEndEmptyOnEveryFailureAndShowNoCode) {
  installThree();
  const auto expectEmpty = [this](const Outcome& outcome, const char* text, bool builderIsMarked = false) {
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked", text));
    EXPECT_EQ(0U, outcome.calls.count("returnInstance"));
    EXPECT_EQ(builderIsMarked, outcome.lines.exited(kBuilder));
  };
  expectEmpty(failing(newPath(kEndpointClass), Mode::RcAndNull, instances(), 2), kNoEndpoints);
  expectEmpty(failing(newPath(kGeneralSettingClass), Mode::RcAndNull, instances()), kNoSettingsInBuilder, true);
  expectEmpty(failing(newPath(kGeneralSettingClass), Mode::NullHandle, instances()), kNoSettingsInBuilder, true);
  expectEmpty(failing(newPath(kAssociation), Mode::RcAndNull, instances(), 3), kNoPathInBuilder);
  expectEmpty(failing(newPath(kAssociation), Mode::NullHandle, instances(), 3), kNoPathInBuilder);
  expectEmpty(losingHandles(kEndpointClass, kGeneralSettingClass, instances()), kBadEndpoint);
  expectEmpty(losingHandles(kGeneralSettingClass, kAssociation, instances()), kBadSettingInBuilder);
}

TEST_F(GenEndpointElementSettingData, FailureOfTheBuilderLeavesTheSearchForOneDoneAndEmpty) {
  installThree();
  const Outcome outcome = failing(newPath(kAssociation), Mode::RcAndNull,
                                  [this] { return getInstance(pairOf(endpointPath("eth0"), generalSettingPath())); });
  EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked", kNoPathInBuilder));
  EXPECT_THAT(outcome.instances(), IsEmpty());
}

// --- From an endpoint to the setting

TEST_F(GenEndpointElementSettingData, SettingIsMadeFromTheSourceWithThePropertiesThatWereAskedFor) {
  installOne();
  const Outcome outcome = associators(endpointPath("eth0"), {.properties = {"InstanceID"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kGeneralSettingClass),
                  newSetting("OP2", "I1", kGeneralSettingClass, "dnsgen1:host1"),
                  {"returnInstance(I1)"},
                  done(operation("Associators"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GenEndpointElementSettingData, SettingsPathIsReturnedUnchanged) {
  installOne();
  const Outcome outcome = associatorNames(endpointPath("eth0"));
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kGeneralSettingClass),
                  newGeneralSettingPath("OP2"),
                  {"returnObjectPath(OP2)"},
                  done(operation("AssociatorNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GenEndpointElementSettingData, ReferenceOfAnEndpointHoldsTheSourceAndTheSetting) {
  installOne();
  const Outcome outcome = references(endpointPath("eth0"));
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kGeneralSettingClass),
                  {newPath(kAssociation)},  // without a host
                  newGeneralSettingPath("OP3"),
                  placed("OP3"),
                  {"newInstance(OP2)"},
                  setAll("I1", "ref", "OP3"),
                  {"returnInstance(I1)"},
                  done(operation("References"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GenEndpointElementSettingData, NameOfAReferenceOfAnEndpointIsOfTheSisterClass) {
  installOne();
  const Outcome outcome = referenceNames(endpointPath("eth0"));
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kGeneralSettingClass),
                  {newPath(kSister)},
                  newGeneralSettingPath("OP3"),
                  placed("OP3"),
                  {"newInstance(OP2)"},
                  setAll("I1", "ref", "OP3"),
                  returnedPath("I1", "OP4"),
                  done(operation("ReferenceNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

// --- From the setting to the endpoints

TEST_F(GenEndpointElementSettingData, EndpointsAreMadeWithThePropertiesThatWereAskedFor) {
  installOne();
  const Outcome outcome = associators(generalSettingPath(), {.properties = {"Name"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kEndpointClass),
                  newEndpoint("OP2", "I1", "eth0", R"({"Name"})"),
                  {"returnInstance(I1)"},
                  done(operation("Associators"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GenEndpointElementSettingData, EndpointsPathsGetNamespaceAndHostAgain) {
  installOne();
  const Outcome outcome = associatorNames(generalSettingPath());
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kEndpointClass),
                  newEndpointPath("OP2", "eth0"),
                  placed("OP2"),
                  {"returnObjectPath(OP2)"},
                  done(operation("AssociatorNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GenEndpointElementSettingData, ReferenceOfTheSettingHoldsTheEndpointAndTheSource) {
  installOne();
  const Outcome outcome = references(generalSettingPath());
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kEndpointClass),
                  {newPath(kAssociation)},
                  newEndpointPath("OP3", "eth0"),
                  placed("OP3"),
                  {"newInstance(OP2)"},
                  setAll("I1", "OP3", "ref"),
                  {"returnInstance(I1)"},
                  done(operation("References"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GenEndpointElementSettingData, NameOfAReferenceOfTheSettingIsOfTheSisterClass) {
  installOne();
  const Outcome outcome = referenceNames(generalSettingPath());
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kEndpointClass),
                  {newPath(kSister)},
                  newEndpointPath("OP3", "eth0"),
                  placed("OP3"),
                  {"newInstance(OP2)"},
                  setAll("I1", "OP3", "ref"),
                  returnedPath("I1", "OP4"),
                  done(operation("ReferenceNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

// --- Which objects belong together: all of them

TEST_F(GenEndpointElementSettingData, AnyEndpointLeadsToTheSettingAndTheSettingToEveryEndpoint) {
  installThree();
  for (const char* name : {"eth0", "eth1", "bmc0"}) {
    EXPECT_THAT(textsOf(associators(endpointPath(name)).instances(), "InstanceID"), ElementsAre("dnsgen1:host1"));
    EXPECT_THAT(textsOf(associatorNames(endpointPath(name)).paths(), "InstanceID"), ElementsAre("dnsgen1:host1"));
  }
  EXPECT_THAT(endpointsOf(associators(generalSettingPath())), ElementsAre("bmc0", "eth0", "eth1"));
  EXPECT_THAT(endpointsOf(associatorNames(generalSettingPath())), ElementsAre("bmc0", "eth0", "eth1"));
}

TEST_F(GenEndpointElementSettingData, NoKeyIsEverRead) {
  installThree();
  for (const Path& source : {endpointPath("nobody"), Path(kEndpointClass)}) {
    EXPECT_EQ(associators(endpointPath("eth0")).instances(), associators(source).instances());
    EXPECT_EQ(associatorNames(endpointPath("eth0")).paths(), associatorNames(source).paths());
    EXPECT_THAT(pairsOf(references(source)), SizeIs(1));
    EXPECT_EQ(0U, references(source).calls.count("getKey"));
  }
  EXPECT_THAT(pairsOf(references(generalSettingPath("another"))),
              ElementsAre("bmc0 > another", "eth0 > another", "eth1 > another"));
  EXPECT_EQ(0U, enumerateInstances().calls.count("getKey") + enumerateInstanceNames().calls.count("getKey"));
}

TEST_F(GenEndpointElementSettingData, ReferencesAreOfThisClassAndTheirNamesOfTheSister) {
  installThree();
  for (const Path& source : {endpointPath("eth0"), generalSettingPath()}) {
    const Outcome instances = references(source);
    const Outcome names = referenceNames(source);
    EXPECT_EQ(pairsOf(instances), pairsOf(names));
    for (const Instance& one : instances.instances()) EXPECT_EQ(kAssociation, one.path.className);
    for (const Path& one : names.paths()) EXPECT_EQ(kSister, one.className);
  }
}

TEST_F(GenEndpointElementSettingData, ReferencesCarryAllPropertiesWhateverIsAskedFor) {
  installThree();
  for (const Path& source : {endpointPath("eth0"), generalSettingPath()}) {
    const Outcome outcome = references(source, {.properties = {"IsDefault"}});
    EXPECT_FALSE(outcome.instances().empty());
    for (const Instance& one : outcome.instances()) {
      EXPECT_THAT(one.names(), ElementsAre("ManagedElement", "SettingData", "IsCurrent", "IsDefault"));
      EXPECT_EQ(uint16(1), one["IsCurrent"]);
    }
  }
}

// --- Failed fetches

TEST_F(GenEndpointElementSettingData, FailedFetchOfEndpointsLeavesOpenWithoutAWord) {
  world.host().install();
  for (const Operation& run : allFrom(generalSettingPath())) {
    EXPECT_THAT(endOf(run()), ElementsAre("CMPI_RC_OK", "not done, not marked"));
  }
}

TEST_F(GenEndpointElementSettingData, EndpointPathThatCannotBeMadeShowsTheBrokersCode) {
  installThree();
  const Path source = generalSettingPath();
  for (const Operation& run : pathsFrom(source)) {
    const Outcome outcome = failing(newPath(kEndpointClass), Mode::RcAndNull, run, 3);  // the far end is the first
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked"));
    EXPECT_THAT(pairsOf(outcome), IsEmpty());
  }
}

TEST_F(GenEndpointElementSettingData, FailedFetchOfSettingPathsIsLoggedAndLeavesTheResultOpen) {
  installOne();
  const Path source = endpointPath("eth0");
  for (const Operation& run : pathsFrom(source)) {
    const Outcome outcome = failing(newPath(kGeneralSettingClass), Mode::RcAndNull, run, 2);
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "not done, not marked", kNoSettingPaths));
    EXPECT_THAT(pairsOf(outcome), IsEmpty());
  }
}

TEST_F(GenEndpointElementSettingData, EndpointThatCannotBeMadeIsPassedOnUnchanged) {
  installThree();
  const Outcome outcome = failing(
      "newInstance(", Mode::ReturnNull, [this] { return associators(generalSettingPath()); }, 2);
  EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
  EXPECT_THAT(outcome.calls.only({"returnInstance"}),
              ElementsAre("returnInstance(I1)", "returnInstance(null)", "returnInstance(I2)"));
}

}  // namespace
}  // namespace ZV::Test
