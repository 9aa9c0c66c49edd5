// The two associations whose groups are IP assignment settings, which are read through the broker: the failures that
// only they can have, and those that are alike in both.
#include "providers/testing/SettingAssociations.h"

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

struct Component {
  AssociationUnderTest provider;
  Path setting;
  const char* parameters;  // of the builder's lines
  const char* noSettingsInBuilder;
  const char* noSettingPaths;
  const char* noPath;
};

void PrintTo(const Component& component, std::ostream* out) { *out << component.provider.stem; }

const Component kComponents[] = {
    {generalOrderedComponent(), generalSettingPath(), ", ref==ADDR properties==0 ctx==ADDR instances==ADDR",
     "getAllDNSGeneralSettingDataCMPIObjectPaths failed", "getAllDNSGeneralSettingDataCMPIObjectPaths Failed",
     "Create CMPIObjectPath failed for                     DNSGeneralOrderedComponent."},
    {orderedComponent(), settingPath("Computer%eth0"), ", ref=ADDR properties=0 ctx=ADDR instances=ADDR",
     "getAllDNSSettingDataCMPIObjectPaths failed", "getAllDNSSettingDataCMPIObjectPaths Failed",
     "Create CMPIObjectPath failed for                         DNSOrderedComponent."},
};

const char* const kNoAssignmentPath = "Create CMPIObjectPath failed for ipAssignmentSettingDataClass.";
const char* const kNoAssignmentPathForNames = "Create CMPIObjectPath failed for ComputerSystem.";
const char* const kNoAssignments = "CBEnumInstanceNames Failed for the target Class";
const char* const kBadSetting = "CMPIObjectPath is NULL for DNS Client";

const Path kAssignment = ipAssignmentPath("Computer%eth0%ipv4");

// One interface with three assignments, which all belong to its setting and to the host's.
class ComponentOfAssignments : public SettingAssociationTest, public ::testing::WithParamInterface<Component> {
 protected:
  ComponentOfAssignments()
      : SettingAssociationTest(GetParam().provider), component(GetParam()), settingClass(component.setting.className) {
    world.host().nic("eth0").install();
    serveAssignments({"Computer%eth0%ipv4", "Computer%eth0%ipv6", "Computer%eth0%more"});
  }

  std::vector<Operation> instanceOperations() {
    return SettingAssociationTest::instanceOperations(pairOf(kAssignment, component.setting));
  }
  // All operations that ask the broker for assignments.
  std::vector<Operation> allThatEnumerate() {
    std::vector<Operation> all = instanceOperations();
    for (const Operation& run : allFrom(component.setting)) all.push_back(run);
    return all;
  }

  const Component& component;
  const std::string settingClass;
};

INSTANTIATE_TEST_SUITE_P(Both, ComponentOfAssignments, ::testing::ValuesIn(kComponents),
                         [](const auto& one) { return one.param.provider.stem; });

// --- The provider of the assignments

TEST_P(ComponentOfAssignments, AssignmentStaysAsTheBrokerGaveIt) {
  Instance served = objectOf(kAssignment);
  served.path.host = "elsewhere";
  broker.serve(kIpAssignmentClass, {served});
  const Instance one = enumerateInstances().instances().at(0);
  EXPECT_EQ("elsewhere", one["GroupComponent"].path().host);
  EXPECT_EQ("host1", one["PartComponent"].path().host);
}

TEST_P(ComponentOfAssignments, MissingProviderIsShownByTheOperationsThatNeedItAndByNoEnumeration) {
  broker.serve(kIpAssignmentClass).rc = CMPI_RC_ERR_INVALID_CLASS;
  for (const Operation& run : allFrom(component.setting)) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_ERR_INVALID_CLASS", "not done, not marked", kNoAssignments));
    EXPECT_EQ(0U, handedOut(outcome));
  }
  for (const Operation& run : instanceOperations()) {
    EXPECT_THAT(endOf(run()), ElementsAre("CMPI_RC_OK", "done, marked", kNoAssignments));
  }
  for (const Operation& run : allFrom(kAssignment)) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(1U, handedOut(outcome));
  }
}

TEST_P(ComponentOfAssignments, FailedEnumerationDeliversNothingEvenIfItReturnedSome) {
  for (const CMPIrc rc : {CMPI_RC_ERR_FAILED, CMPI_RC_ERR_NOT_FOUND, CMPI_RC_ERR_ACCESS_DENIED}) {
    broker.serve(kIpAssignmentClass, {objectOf(kAssignment)}).rc = rc;
    for (const Operation& run : allFrom(component.setting)) {
      const Outcome outcome = run();
      EXPECT_EQ(rc, outcome.rc);
      EXPECT_EQ("not done, not marked", endOf(outcome).at(1));
      EXPECT_THAT(complaintsOf(outcome), ElementsAre(kNoAssignments));
      EXPECT_EQ(0U, handedOut(outcome));
    }
    for (const Operation& run : instanceOperations()) {
      const Outcome outcome = run();
      EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked", kNoAssignments));
      EXPECT_EQ(0U, handedOut(outcome));
    }
  }
}

TEST_P(ComponentOfAssignments, NullEnumerationWithSuccessIsAnEmptyOne) {
  broker.serve(kIpAssignmentClass).nullEnumeration = true;
  for (const Operation& run : allThatEnumerate()) {
    const Outcome outcome = run();
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(0U, handedOut(outcome));
  }
}

TEST_P(ComponentOfAssignments, ExceptionOfTheEnumerationPasses) {
  broker.serve(kIpAssignmentClass).throws = true;
  for (const Operation& run : allThatEnumerate()) EXPECT_THROW(run(), InjectedFailure);
}

TEST_P(ComponentOfAssignments, EnumerationThatEndsHalfWayLeavesWhatWentOutAndItsCode) {
  for (const Operation& run : allFrom(component.setting)) {
    const Outcome outcome = failing("hasNext", Mode::RcAndNull, run, 3);
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_ERR_FAILED", "done, marked"));
    EXPECT_EQ(2U, handedOut(outcome));
  }
  for (const Operation& run : enumerations()) {
    const Outcome outcome = failing("hasNext", Mode::RcAndNull, run, 3);
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ(2U, handedOut(outcome));
  }
}

TEST_P(ComponentOfAssignments, PathToAskWithThatCannotBeMadeIsLoggedAndLeavesTheResultOpen) {
  const Path& source = component.setting;
  for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull}) {
    const char* code = mode == Mode::RcAndNull ? "CMPI_RC_ERR_FAILED" : "CMPI_RC_OK";
    EXPECT_THAT(endOf(failing(
                    newPath(kIpAssignmentClass), mode, [&] { return associators(source); }, 2)),
                ElementsAre(code, "not done, not marked", kNoAssignmentPath));
    EXPECT_THAT(endOf(failing(
                    newPath(kIpAssignmentClass), mode, [&] { return associatorNames(source); }, 2)),
                ElementsAre(code, "not done, not marked", kNoAssignmentPathForNames));
  }
}

// --- The builder

TEST_P(ComponentOfAssignments, EveryFailureOfTheBuilderEndsEmptyAndShowsNoCode) {
  const auto expectEmpty = [this](const Outcome& outcome, const char* text) {
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked", text));
    EXPECT_EQ(0U, handedOut(outcome));
    EXPECT_FALSE(outcome.lines.exited(under.builder));
  };
  for (const Operation& run : instanceOperations()) {
    for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull}) {
      expectEmpty(failing(newPath(kIpAssignmentClass), mode, run), kNoAssignmentPath);
      expectEmpty(failing(newPath(under.className), mode, run, 3), component.noPath);
    }
    expectEmpty(failing("enumerateInstanceNames", Mode::RcAndNull, run), kNoAssignments);
    expectEmpty(failing("enumerateInstanceNames", Mode::SetRc, run), kNoAssignments);
    expectEmpty(losingHandles(settingClass, under.className, run), kBadSetting);
  }
}

TEST_P(ComponentOfAssignments, BuilderWithoutSettingPathsMarksItsExitAsAnOperationDoes) {
  const Outcome outcome = failing(newPath(settingClass), Mode::RcAndNull, [this] { return enumerateInstances(); });
  EXPECT_EQ(tell({entry(operation("EnumInstances")),
                  {"log 3000 ENTERING " + under.builder + component.parameters, newPath(kIpAssignmentClass),
                   "enumerateInstanceNames(OP1)", newPath(settingClass) + " fails: rc set and null",
                   error(component.noSettingsInBuilder)},
                  exitMark(under.builder),
                  done(operation("EnumInstances"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

// --- The settings as the far end

TEST_P(ComponentOfAssignments, FailedFetchOfSettingPathsIsLoggedAndLeavesTheResultOpen) {
  for (const Operation& run : pathsFrom(kAssignment)) {
    const Outcome outcome = failing(newPath(settingClass), Mode::RcAndNull, run, 2);  // the far end is the first
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "not done, not marked", component.noSettingPaths));
    EXPECT_EQ(0U, handedOut(outcome));
  }
}

TEST_P(ComponentOfAssignments, SettingThatCannotBeMadeNeverReachesTheClientAsAnError) {
  const Outcome outcome = failing("newInstance(", Mode::RcAndNull, [this] { return associators(kAssignment); });
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  EXPECT_THAT(outcome.instances(), IsEmpty());
}

}  // namespace
}  // namespace ZV::Test
