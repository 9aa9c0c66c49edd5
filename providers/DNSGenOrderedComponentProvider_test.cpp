#include <stdexcept>

#include "providers/testing/SettingAssociations.h"

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

const char* const kAssociation = "ZORVA_DNSGenOrderedComponent";
const char* const kBuilder = "DNSGeneralOrderedComponentCMPIInstances";

const Path kAssignment = ipAssignmentPath("Computer%eth0%ipv4");

class GeneralOrderedComponent : public SettingAssociationTest {
 protected:
  GeneralOrderedComponent() : SettingAssociationTest(generalOrderedComponent()) {}

  void installOne() {
    world.host().nic("eth0").install();
    serveAssignments({"Computer%eth0%ipv4"});
  }
  void installThree() {
    world.host().nic("eth0").install();
    serveAssignments({"first", "second", "third"});
  }
  void installServiceProcessorAlone() { world.bmc().nic("bmc0").install(); }

  Story setAll(const std::string& instance, const std::string& group, const std::string& part) const {
    return tell({setEnds(instance, group, part), sequence(instance, 1)});
  }
  // In lines with parameters the labels have two equal signs.
  static std::string builderLine(const char* form) {
    return std::string("log 3000 ") + form + " " + kBuilder + ", ref==ADDR properties==0 ctx==ADDR instances==ADDR";
  }
  Story builtOne() const {
    return tell({{builderLine("ENTERING"), newPath(kIpAssignmentClass), "enumerateInstanceNames(OP1)"},
                 newGeneralSettingPath("OP2"),
                 {"E1.getNext()"},
                 placed("OP2"),
                 newHostPath("OP4", kAssociation),
                 {"newInstance(OP4)", R"(I1.setPropertyFilter(null, {"GroupComponent", "PartComponent"}))"},
                 setAll("I1", "OP3", "OP2"),
                 {builderLine("EXITING")}});
  }
};

// --- Enumerations

TEST_F(GeneralOrderedComponent, InstancesAreBuiltFirstAndThenReturned) {
  installOne();
  const Outcome all = enumerateInstances();
  EXPECT_EQ(
      tell({entry(operation("EnumInstances")), builtOne(), {"returnInstance(I1)"}, done(operation("EnumInstances"))}),
      storyOf(all));
  EXPECT_EQ(CMPI_RC_OK, all.rc);
}

TEST_F(GeneralOrderedComponent, NamesAreThoseOfTheBuiltInstances) {
  installOne();
  const Outcome names = enumerateInstanceNames();
  EXPECT_EQ(tell({entry(operation("EnumInstanceNames")),
                  builtOne(),
                  {"I1.getObjectPath()", "returnObjectPath(OP5)"},
                  done(operation("EnumInstanceNames"))}),
            storyOf(names));
  EXPECT_EQ(CMPI_RC_OK, names.rc);
}

TEST_F(GeneralOrderedComponent, EachAssignmentHasTheSettingAsItsFirstPart) {
  world.host().nic("eth0").install();
  serveAssignments({"Computer%eth0%ipv6", "Computer%eth0%ipv4"});
  const Outcome all = enumerateInstances();
  EXPECT_THAT(pairsOf(all), ElementsAre("Computer%eth0%ipv6 > dnsgen1:host1", "Computer%eth0%ipv4 > dnsgen1:host1"));
  EXPECT_EQ(pairsOf(all), pairsOf(enumerateInstanceNames()));
  for (const Instance& one : all.instances()) {
    EXPECT_THAT(one.names(), ElementsAre("GroupComponent", "PartComponent", "AssignedSequence"));
    EXPECT_EQ(uint64(1), one["AssignedSequence"]);
  }
}

TEST_F(GeneralOrderedComponent, NoKeyDecidesWhatBelongsTogether) {
  world.host().nic("eth0").install();
  broker.serve(kIpAssignmentClass, {Instance(kIpAssignmentClass), objectOf(ipAssignmentPath("")),
                                    objectOf(ipAssignmentPath("%")), objectOf(ipAssignmentPath("BMC%eth7%x"))});
  EXPECT_THAT(enumerateInstances().instances(), SizeIs(4));
  EXPECT_THAT(references(generalSettingPath("another")).instances(), SizeIs(4));
  EXPECT_THAT(textsOf(associators(ipAssignmentPath("nobody")).instances(), "InstanceID"), ElementsAre("dnsgen1:host1"));
}

TEST_F(GeneralOrderedComponent, BuilderReadsTheKeysOfBothEndsForNothing) {
  installOne();
  for (const Operation& run : enumerations()) {
    EXPECT_THAT(run().calls.only({"getKey"}),
                ElementsAre(R"(OP3.getKey("InstanceID"))", R"(OP2.getKey("InstanceID"))"));
  }
}

TEST_F(GeneralOrderedComponent, WithoutSettingsAnExceptionLeavesTheInstanceOperations) {
  installServiceProcessorAlone();
  serveAssignments({"first", "second"});
  for (const Operation& run : instanceOperations(pairOf(kAssignment, generalSettingPath()))) {
    logger.clear();
    try {
      run();
      ADD_FAILURE() << "nothing was thrown";
    } catch (const std::out_of_range& error) {
      EXPECT_STREQ("vector::_M_range_check", error.what());
    }
    const LogLines lines = logger.pairs();
    EXPECT_EQ(0U, broker.calls().count("returnInstance") + broker.calls().count("returnObjectPath") +
                      broker.calls().count("returnDone"));
    EXPECT_THAT(lines.ofCategory(under.category).ofKind(LineKind::Exiting), IsEmpty());
    EXPECT_THAT(lines.ofCategory(under.category).errors(), IsEmpty());
  }
}

TEST_F(GeneralOrderedComponent, WithoutSettingsAndAssignmentsTheResultIsEmpty) {
  installServiceProcessorAlone();
  serveAssignments({});
  for (const Operation& run : instanceOperations(pairOf(kAssignment, generalSettingPath()))) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(0U, handedOut(outcome));
  }
}

TEST_F(GeneralOrderedComponent, WithoutSettingsTheAssociationOperationsEndAsUsual) {
  installServiceProcessorAlone();
  serveAssignments({"first", "second"});
  for (const Operation& run : allFrom(kAssignment)) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(0U, handedOut(outcome));
  }
  for (const Operation& run : allFrom(generalSettingPath())) EXPECT_EQ(2U, handedOut(run()));
}

// --- From an assignment to the setting

TEST_F(GeneralOrderedComponent, SettingIsMadeFromTheSourceWithThePropertiesThatWereAskedFor) {
  installOne();
  const Outcome outcome = associators(kAssignment, {.properties = {"InstanceID"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kGeneralSettingClass),
                  newSetting("OP2", "I1", kGeneralSettingClass, "dnsgen1:host1"),
                  {"returnInstance(I1)"},
                  done(operation("Associators"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GeneralOrderedComponent, SettingsPathIsReturnedUnchanged) {
  installOne();
  const Outcome outcome = associatorNames(kAssignment);
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kGeneralSettingClass),
                  newGeneralSettingPath("OP2"),
                  {"returnObjectPath(OP2)"},
                  done(operation("AssociatorNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GeneralOrderedComponent, ReferenceOfAnAssignmentHoldsTheSourceAndTheSetting) {
  installOne();
  const Outcome outcome = references(kAssignment);
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kGeneralSettingClass),
                  {newPath(kAssociation)},  // without a host
                  newGeneralSettingPath("OP3"),
                  {"newInstance(OP2)"},
                  placed("OP3"),
                  setAll("I1", "ref", "OP3"),
                  {"returnInstance(I1)"},
                  done(operation("References"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GeneralOrderedComponent, NameOfAReferenceOfAnAssignmentIsAskedOfTheInstance) {
  installOne();
  const Outcome outcome = referenceNames(kAssignment);
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kGeneralSettingClass),
                  {newPath(kAssociation)},
                  newGeneralSettingPath("OP3"),
                  {"newInstance(OP2)"},
                  placed("OP3"),
                  setAll("I1", "ref", "OP3"),
                  returnedPath("I1", "OP4"),
                  done(operation("ReferenceNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

// --- From the setting to the assignments

TEST_F(GeneralOrderedComponent, AssignmentsAreAskedForWithoutAPropertyList) {
  installOne();
  const Outcome outcome = associators(generalSettingPath(), {.properties = {"InstanceID"}});
  EXPECT_EQ(tell({entry(operation("Associators")),
                  newHostPath("OP1", kIpAssignmentClass),
                  {newPath(kIpAssignmentClass), "enumerateInstances(OP2)", "E1.getNext()", "returnInstance(I1)"},
                  done(operation("Associators"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GeneralOrderedComponent, AssignmentsPathsGoOutAsTheyCame) {
  installOne();
  const Outcome outcome = associatorNames(generalSettingPath());
  EXPECT_EQ(tell({entry(operation("AssociatorNames")),
                  newHostPath("OP1", kIpAssignmentClass),
                  {newPath(kIpAssignmentClass), "enumerateInstanceNames(OP2)", "E1.getNext()", "returnObjectPath(OP3)"},
                  done(operation("AssociatorNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GeneralOrderedComponent, ReferenceOfTheSettingHoldsItAsTheGroupAndAPathWithoutKeys) {
  installOne();
  const Outcome outcome = references(generalSettingPath());
  EXPECT_EQ(tell({entry(operation("References")),
                  newHostPath("OP1", kIpAssignmentClass),
                  {newPath(kAssociation), "enumerateInstanceNames(OP1)", "E1.getNext()", "newInstance(OP2)"},
                  setAll("I1", "ref", "OP1"),
                  {"returnInstance(I1)"},
                  done(operation("References"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GeneralOrderedComponent, NameOfAReferenceOfTheSettingHoldsTheSame) {
  installOne();
  const Outcome outcome = referenceNames(generalSettingPath());
  EXPECT_EQ(tell({entry(operation("ReferenceNames")),
                  newHostPath("OP1", kIpAssignmentClass),
                  {newPath(kAssociation), "enumerateInstanceNames(OP1)", "E1.getNext()", "newInstance(OP2)"},
                  setAll("I1", "ref", "OP1"),
                  returnedPath("I1", "OP4"),  // OP3 is the assignment, which is only counted
                  done(operation("ReferenceNames"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_F(GeneralOrderedComponent, ReferencesAreTheReverseOfTheBuildersAndAreAllAlike) {
  installThree();
  const std::string reversed = std::string("dnsgen1:host1 > ") + kIpAssignmentClass;
  EXPECT_THAT(pairsOf(references(generalSettingPath())), ElementsAre(reversed, reversed, reversed));
  EXPECT_THAT(pairsOf(referenceNames(generalSettingPath())), ElementsAre(reversed, reversed, reversed));
  EXPECT_THAT(pairsOf(references(ipAssignmentPath("second"))), ElementsAre("second > dnsgen1:host1"));
}

TEST_F(GeneralOrderedComponent, ReferencesCarryAllPropertiesWhateverIsAskedFor) {
  installThree();
  for (const Path& source : {kAssignment, generalSettingPath()}) {
    const Outcome outcome = references(source, {.properties = {"PartComponent"}});
    EXPECT_FALSE(outcome.instances().empty());
    for (const Instance& one : outcome.instances()) {
      EXPECT_THAT(one.names(), ElementsAre("GroupComponent", "PartComponent", "AssignedSequence"));
      EXPECT_EQ(uint64(1), one["AssignedSequence"]);
    }
  }
}

TEST_F(GeneralOrderedComponent, AnyAssignmentLeadsToTheSettingAndTheSettingToEveryAssignment) {
  installThree();
  for (const char* instanceID : {"first", "second", "third"}) {
    EXPECT_THAT(textsOf(associators(ipAssignmentPath(instanceID)).instances(), "InstanceID"),
                ElementsAre("dnsgen1:host1"));
  }
  EXPECT_THAT(textsOf(associators(generalSettingPath()).instances(), "InstanceID"),
              ElementsAre("first", "second", "third"));
  EXPECT_THAT(textsOf(associatorNames(generalSettingPath()).paths(), "InstanceID"),
              ElementsAre("first", "second", "third"));
}

TEST_F(GeneralOrderedComponent, NoKeyOfTheSourceIsRead) {
  installThree();
  for (const Path& source : {Path(kIpAssignmentClass), Path(kGeneralSettingClass)}) {
    for (const Operation& run : allFrom(source)) {
      const Outcome outcome = run();
      EXPECT_EQ(0U, outcome.calls.count("getKey"));
      EXPECT_LT(0U, handedOut(outcome));
    }
  }
}

TEST_F(GeneralOrderedComponent, AssignmentThatTheEnumerationCannotGiveIsNull) {
  installThree();
  const Path source = generalSettingPath();
  EXPECT_EQ("returnInstance(null)", failing(
                                        "getNext", Mode::RcAndNull, [&] { return associators(source); }, 2)
                                        .calls.only({"returnInstance"})
                                        .at(1));
  EXPECT_EQ("returnObjectPath(null)", failing(
                                          "getNext", Mode::ReturnNull, [&] { return associatorNames(source); }, 2)
                                          .calls.only({"returnObjectPath"})
                                          .at(1));
  EXPECT_THAT(failing(
                  "getNext", Mode::RcAndNull, [&] { return references(source); }, 2)
                  .instances(),
              SizeIs(3));
  const Outcome all = failing(
      "getNext", Mode::RcAndNull, [this] { return enumerateInstances(); }, 2);
  ASSERT_THAT(all.instances(), SizeIs(3));
  EXPECT_THAT(all.instances()[1].names(), ElementsAre("PartComponent", "AssignedSequence"));
  EXPECT_EQ(CMPI_RC_OK, all.rc);
}

}  // namespace
}  // namespace ZV::Test
