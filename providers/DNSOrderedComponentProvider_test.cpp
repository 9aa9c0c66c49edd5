#include "providers/testing/SettingAssociations.h"

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const char* const kAssociation = "ZORVA_DNSOrderedComponent";
const char* const kBuilder = "DNSOrderedComponentCMPIInstances";

const char* const kMalformed = "Invalid InstanceId";

const Path kAssignment = ipAssignmentPath("Computer%eth0%ipv4");
const Path kSetting = settingPath("Computer%eth0");

class OrderedComponent : public SettingAssociationTest {
 protected:
  OrderedComponent() : SettingAssociationTest(orderedComponent()) {}

  void installOne() {
    world.host().nic("eth0").install();
    serveAssignments({"Computer%eth0%ipv4"});
  }
  // Two assignments of eth0, one of eth1; the first setting belongs to eth1.
  void installTwo() {
    world.host().nic("eth1").nic("eth0").install();
    serveAssignments({"Computer%eth0%ipv4", "Computer%eth1%ipv4", "Computer%eth0%ipv6"});
  }

  static std::string target(const std::string& text) { return "log 4000 VARIABLE target = " + text; }
  Story setAll(const std::string& instance, const std::string& group, const std::string& part) const {
    return tell({setEnds(instance, group, part), sequence(instance, 2)});
  }
  static std::string builderLine(const char* form) {
    return std::string("log 3000 ") + form + " " + kBuilder + ", ref=ADDR properties=0 ctx=ADDR instances=ADDR";
  }
  Story builtOne() const {
    return tell({{builderLine("ENTERING"), newPath(kIpAssignmentClass), "enumerateInstanceNames(OP1)"},
                 newSettingPath("OP2", "Computer%eth0"),
                 {"E1.getNext()", target("Computer%eth0")},
                 placed("OP2"),
                 newHostPath("OP4", kAssociation),
                 {"newInstance(OP4)", R"(I1.setPropertyFilter(null, {"GroupComponent", "PartComponent"}))"},
                 setAll("I1", "OP3", "OP2"),
                 {builderLine("EXITING")}});
  }
};

// --- Enumerations

TEST_F(OrderedComponent, InstancesAreBuiltFirstAndThenReturned) {
  installOne();
  const Outcome all = enumerateInstances();
  EXPECT_EQ(
      tell({entry(operation("EnumInstances")), builtOne(), {"returnInstance(I1)"}, done(operation("EnumInstances"))}),
      storyOf(all));
  EXPECT_EQ(CMPI_RC_OK, all.rc);
}

TEST_F(OrderedComponent, NamesAreThoseOfTheBuiltInstances) {
  installOne();
  const Outcome names = enumerateInstanceNames();
  EXPECT_EQ(tell({entry(operation("EnumInstanceNames")),
                  builtOne(),
                  {"I1.getObjectPath()", "returnObjectPath(OP5)"},
                  done(operation("EnumInstanceNames"))}),
            storyOf(names));
  EXPECT_EQ(CMPI_RC_OK, names.rc);
}

TEST_F(OrderedComponent, AssignmentsComeAsTheBrokerGivesThemEachWithTheSettingOfItsInterface) {
  installTwo();
  const Outcome all = enumerateInstances();
  EXPECT_THAT(pairsOf(all), ElementsAre("Computer%eth0%ipv4 > Computer%eth0", "Computer%eth1%ipv4 > Computer%eth1",
                                        "Computer%eth0%ipv6 > Computer%eth0"));
  EXPECT_EQ(pairsOf(all), pairsOf(enumerateInstanceNames()));
  for (const Instance& one : all.instances()) {
    EXPECT_THAT(one.names(), ElementsAre("GroupComponent", "PartComponent", "AssignedSequence"));
    EXPECT_EQ(uint64(2), one["AssignedSequence"]);
  }
}

TEST_F(OrderedComponent, MatchDoesNotEndTheSearchAmongTheSettings) {
  world.host().nic("eth0").nic("eth0").install();
  serveAssignments({"Computer%eth0%ipv4"});
  EXPECT_THAT(enumerateInstances().instances(), SizeIs(2));
  EXPECT_THAT(associatorNames(kAssignment).paths(), SizeIs(2));
  EXPECT_THAT(references(kAssignment).instances(), SizeIs(2));
}

TEST_F(OrderedComponent, HostWithoutSettingsHasNoAssociation) {
  world.install();
  serveAssignments({"Computer%eth0%ipv4", "Computer"});
  for (const Operation& run : enumerations()) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(0U, handedOut(outcome));
    EXPECT_THAT(outcome.lines.ofCategory(under.category).ofKind(LineKind::Variable), SizeIs(2));
  }
}

// --- Which assignment has which setting

struct Cut {
  const char* assignment;
  const char* target;
  const char* setting;  // its setting; null for none
};

// The settings of a host with interfaces eth0, "eth0%" and one without a name, whose InstanceID is absent.
const Cut kCuts[] = {
    {"Computer%eth0%ipv4", "Computer%eth0", "Computer%eth0"},
    {"Computer%eth0%", "Computer%eth0", "Computer%eth0"},
    {"Computer%eth0%%", "Computer%eth0%", "Computer%eth0%"},
    {"Computer%eth0%a%b", "Computer%eth0%a", nullptr},
    {"Computer%eth0", "Computer", nullptr},
    {"Computer%ETH0%ipv4", "Computer%ETH0", nullptr},
    {"Computer%eth01%ipv4", "Computer%eth01", nullptr},
    {"BMC%eth0%ipv4", "BMC%eth0", nullptr},
    {"%Computer%eth0%ipv4", "%Computer%eth0", nullptr},
    {"%", "", ""},
    {"%ipv4", "", ""},
    {"%%", "%", nullptr},
};

TEST_F(OrderedComponent, TextBeforeTheLastPercentSignIsCompared) {
  world.host().nic("eth0").nic("eth0%").nic("x", {.isUnnamed = true}).install();
  for (const Cut& cut : kCuts) {
    SCOPED_TRACE(cut.assignment);
    serveAssignments({cut.assignment});
    std::vector<std::string> pairs;
    if (cut.setting != nullptr) pairs = {std::string(cut.assignment) + " > " + cut.setting};

    const Outcome all = enumerateInstances();
    EXPECT_THAT(all.lines.ofCategory(under.category).ofKind(LineKind::Variable).briefs(),
                ElementsAre(target(cut.target).substr(4)));
    EXPECT_EQ(pairs.size(), all.instances().size());
    const Path source = ipAssignmentPath(cut.assignment);
    for (const Operation& run : allFrom(source)) {
      const Outcome outcome = run();
      EXPECT_EQ(pairs.size(), handedOut(outcome));
      EXPECT_EQ("done, marked", endOf(outcome).at(1));
    }
    if (cut.setting == nullptr || *cut.setting == '\0') continue;  // a path without keys is recognized by its class
    EXPECT_EQ(pairs, pairsOf(all));
    EXPECT_EQ(pairs, pairsOf(references(source)));
    EXPECT_EQ(pairs, pairsOf(referenceNames(source)));
    EXPECT_EQ(pairs, pairsOf(referenceNames(settingPath(cut.setting))));
    EXPECT_THAT(textsOf(associators(source).instances(), "InstanceID"), ElementsAre(cut.setting));
    EXPECT_THAT(textsOf(associatorNames(source).paths(), "InstanceID"), ElementsAre(cut.setting));
    EXPECT_THAT(textsOf(associators(settingPath(cut.setting)).instances(), "InstanceID"), ElementsAre(cut.assignment));
    EXPECT_THAT(textsOf(associatorNames(settingPath(cut.setting)).paths(), "InstanceID"), ElementsAre(cut.assignment));
  }
}

TEST_F(OrderedComponent, AssignmentWithoutItsKeyHasTheEmptyText) {
  world.host().nic("eth0").install();
  broker.serve(kIpAssignmentClass, {Instance(kIpAssignmentClass), objectOf(kAssignment)});
  EXPECT_THAT(pairsOf(enumerateInstances()), ElementsAre("Computer%eth0%ipv4 > Computer%eth0"));
  for (const Operation& run : allFrom(kSetting)) {
    EXPECT_THAT(endOf(run()), ElementsAre("CMPI_RC_ERR_NOT_FOUND", "not done, not marked", kMalformed));
  }
  for (const Operation& run : allFrom(Path(kIpAssignmentClass))) {
    const Outcome outcome = run();
    EXPECT_EQ("not done, not marked", endOf(outcome).at(1));
    EXPECT_THAT(complaintsOf(outcome), ElementsAre(kMalformed));
  }
}

TEST_F(OrderedComponent, SettingWithoutItsKeyHasTheEmptyText) {
  world.host().nic("eth0").install();
  serveAssignments({"Computer%eth0%ipv4", "%ipv4"});
  for (const Operation& run : allFrom(Path(kSettingClass))) EXPECT_EQ(1U, handedOut(run()));
}

TEST_F(OrderedComponent, SourceIsTestedOnlyOnceThereIsACandidate) {
  world.install();
  for (const Operation& run : allFrom(ipAssignmentPath("malformed"))) {
    EXPECT_THAT(endOf(run()), ElementsAre("CMPI_RC_OK", "done, marked"));
  }
  world.nic("eth0").install();
  for (const Operation& run : allFrom(ipAssignmentPath("malformed"))) {
    EXPECT_THAT(endOf(run()), ElementsAre("CMPI_RC_OK", "not done, not marked", kMalformed));
  }
}

TEST_F(OrderedComponent, MalformedAssignmentStopsTheOperationAndEarlierResultsStay) {
  world.host().nic("eth0").install();
  serveAssignments({"Computer%eth0%ipv4", "malformed", "Computer%eth0%ipv6"});
  for (const Operation& run : allFrom(kSetting)) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "not done, not marked", kMalformed));
    EXPECT_EQ(1U, outcome.instances().size() + outcome.paths().size());
  }
  EXPECT_THAT(pairsOf(enumerateInstances()),
              ElementsAre("Computer%eth0%ipv4 > Computer%eth0", "Computer%eth0%ipv6 > Computer%eth0"));
}

TEST_F(OrderedComponent, KeyOfTheSourceIsReadBeforeTheFarEndIsLookedAt) {
  installOne();
  for (const Outcome& outcome : {associators(kAssignment, {.assocClass = "ZORVA_DNSGenOrderedComponent"}),
                                 associatorNames(kAssignment, {.assocClass = "ZORVA_DNSGenOrderedComponent"})}) {
    EXPECT_THAT(outcome.calls.only({"getKey"}), ElementsAre(R"(ref.getKey("InstanceID"))"));
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
  }
}

// --- From an assignment to its setting

TEST_F(OrderedComponent, SettingIsMadeFromTheSourceWithThePropertiesThatWereAskedFor) {
  installOne();
  const Outcome outcome = associators(kAssignment, {.properties = {"InstanceID"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kSettingClass),
                  newSetting("OP2", "I1", kSettingClass, "Computer%eth0"),
                  {"I1.getObjectPath()", "returnInstance(I1)"},
                  done(operation("Associators"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(OrderedComponent, SettingsPathIsReturnedUnchanged) {
  installOne();
  const Outcome outcome = associatorNames(kAssignment);
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kSettingClass),
                  newSettingPath("OP2", "Computer%eth0"),
                  {"returnObjectPath(OP2)"},
                  done(operation("AssociatorNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(OrderedComponent, ReferenceOfAnAssignmentCostsAnInstanceForEveryCandidate) {
  installTwo();
  const Outcome outcome = references(kAssignment);
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kSettingClass),
                  {newPath(kAssociation)},  // without a host
                  newSettingPath("OP3", "Computer%eth1"),
                  newSettingPath("OP4", "Computer%eth0"),
                  {"newInstance(OP2)", "newInstance(OP2)"},
                  placed("OP4"),
                  setAll("I2", "ref", "OP4"),
                  {"returnInstance(I2)"},
                  done(operation("References"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(OrderedComponent, NameOfAReferenceOfAnAssignmentIsAskedOfTheInstance) {
  installTwo();
  const Outcome outcome = referenceNames(kAssignment);
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

TEST_F(OrderedComponent, InstanceIsMadeBeforeTheSourceIsTested) {
  installOne();
  for (const Outcome& outcome :
       {references(ipAssignmentPath("malformed")), referenceNames(ipAssignmentPath("malformed"))}) {
    EXPECT_THAT(complaintsOf(outcome), ElementsAre(kMalformed));
    EXPECT_EQ(1U, outcome.calls.count("newInstance"));
  }
}

// --- From a setting to its assignments

TEST_F(OrderedComponent, AssignmentsAreAskedForWithoutAPropertyListAndTheirPathsGiveTheirKeys) {
  world.host().nic("eth0").install();
  serveAssignments({"Computer%eth1%ipv4", "Computer%eth0%ipv4"});
  const Outcome outcome = associators(kSetting, {.properties = {"InstanceID"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kIpAssignmentClass),
                  {newPath(kIpAssignmentClass), "enumerateInstances(OP2)", "E1.getNext()", "I1.getObjectPath()",
                   "E1.getNext()", "I2.getObjectPath()", "returnInstance(I2)"},
                  done(operation("Associators"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(OrderedComponent, AssignmentsPathsGoOutAsTheyCame) {
  world.host().nic("eth0").install();
  serveAssignments({"Computer%eth1%ipv4", "Computer%eth0%ipv4"});
  const Outcome outcome = associatorNames(kSetting);
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kIpAssignmentClass),
                  {newPath(kIpAssignmentClass), "enumerateInstanceNames(OP2)", "E1.getNext()", "E1.getNext()",
                   "returnObjectPath(OP4)"},
                  done(operation("AssociatorNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(OrderedComponent, ReferenceOfASettingHoldsAPathWithoutKeysInThePlaceOfTheSource) {
  world.host().nic("eth0").install();
  serveAssignments({"Computer%eth1%ipv4", "Computer%eth0%ipv4"});
  const Outcome outcome = references(kSetting);
  EXPECT_EQ(
      tell({entry(operation("References")),
            newHostPath("OP1", kIpAssignmentClass),
            {newPath(kAssociation), "enumerateInstanceNames(OP1)", "E1.getNext()", "E1.getNext()", "newInstance(OP2)"},
            setAll("I1", "OP4", "OP1"),
            {"returnInstance(I1)"},
            done(operation("References"))}),
      storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(OrderedComponent, NameOfAReferenceOfASettingHoldsTheSource) {
  world.host().nic("eth0").install();
  serveAssignments({"Computer%eth1%ipv4", "Computer%eth0%ipv4"});
  const Outcome outcome = referenceNames(kSetting);
  EXPECT_EQ(
      tell({entry(operation("ReferenceNames")),
            newHostPath("OP1", kIpAssignmentClass),
            {newPath(kAssociation), "enumerateInstanceNames(OP1)", "E1.getNext()", "E1.getNext()", "newInstance(OP2)"},
            setAll("I1", "OP4", "ref"),
            returnedPath("I1", "OP5"),
            done(operation("ReferenceNames"))}),
      storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(OrderedComponent, SettingLeadsToEveryAssignmentOfItsInterface) {
  installTwo();
  const std::vector<std::string> both = {"Computer%eth0%ipv4", "Computer%eth0%ipv6"};
  EXPECT_EQ(both, textsOf(associators(kSetting).instances(), "InstanceID"));
  EXPECT_EQ(both, textsOf(associatorNames(kSetting).paths(), "InstanceID"));
  EXPECT_THAT(pairsOf(references(kSetting)),
              ElementsAreArray({both[0] + " > " + kIpAssignmentClass, both[1] + " > " + kIpAssignmentClass}));
  EXPECT_THAT(pairsOf(referenceNames(kSetting)),
              ElementsAreArray({both[0] + " > Computer%eth0", both[1] + " > Computer%eth0"}));
}

TEST_F(OrderedComponent, PropertyListNarrowsSettingsAndNeitherAssignmentsNorReferences) {
  world.host().nic("eth0", usualNic()).install();
  broker.serve(kIpAssignmentClass, {objectOf(kAssignment).with("AddressOrigin", uint16(3))});
  EXPECT_THAT(associators(kAssignment, {.properties = {"DomainName"}}).instances().at(0).names(),
              ElementsAre("InstanceID", "DomainName"));
  EXPECT_THAT(associators(kSetting, {.properties = {"InstanceID"}}).instances().at(0).names(),
              ElementsAre("InstanceID", "AddressOrigin"));
  for (const Path& source : {kAssignment, kSetting}) {
    const Instance one = references(source, {.properties = {"PartComponent"}}).instances().at(0);
    EXPECT_THAT(one.names(), ElementsAre("GroupComponent", "PartComponent", "AssignedSequence"));
    EXPECT_EQ(uint64(2), one["AssignedSequence"]);
  }
}

TEST_F(OrderedComponent, AssignmentThatTheEnumerationCannotGiveHasTheEmptyText) {
  installTwo();
  for (const Operation& run : allFrom(kSetting)) {
    const Outcome outcome = failing("getNext", Mode::RcAndNull, run, 3);
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_ERR_FAILED", "not done, not marked", kMalformed));
    EXPECT_EQ(1U, handedOut(outcome));
  }
  for (const Operation& run : enumerations()) {
    const Outcome outcome = failing("getNext", Mode::RcAndNull, run, 3);
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(2U, handedOut(outcome));
  }
}

}  // namespace
}  // namespace ZV::Test
