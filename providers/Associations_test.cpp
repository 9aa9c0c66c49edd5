// Common to all eight associations: where a request may lead, and which parts of a request they ignore.

#include <algorithm>
#include <cctype>

#include "providers/testing/AssociationTest.h"

namespace ZV::Test {
namespace {

std::string changed(std::string text, int (*change)(int)) {
  std::transform(text.begin(), text.end(), text.begin(),
                 [change](unsigned char letter) { return static_cast<char>(change(letter)); });
  return text;
}
std::string lowerCase(const std::string& text) { return changed(text, &std::tolower); }
std::string upperCase(const std::string& text) { return changed(text, &std::toupper); }

// The standard class that a provider's own class implements; a result class may name it.
std::string standardNameOf(const std::string& className) {
  return (className == kEndpointClass ? "CIM_DNSProtocolEndpoint" : "CIM_" + className.substr(6));
}

// Each association on one host, with an object at either end that the other providers serve.
class EveryAssociation : public AssociationTest, public ::testing::WithParamInterface<Provider> {
 protected:
  EveryAssociation() : AssociationTest(GetParam()) {
    world.host("host1").nic("eth0", usualNic()).nic("eth1").bmc().nic("bmc0").install();
    for (const Path& end : {under.left, under.right}) {
      if (isServedElsewhere(end)) broker.serve(end.className, {objectOf(end)});
    }
  }

  static bool isServedElsewhere(const Path& end) {
    return end.className == kSystemClass || end.className == kIpEndpointClass || end.className == kIpAssignmentClass;
  }

  struct Direction {
    Path source;
    Path farEnd;
  };
  std::vector<Direction> directions() const { return {{under.left, under.right}, {under.right, under.left}}; }

  // The four association operations, of the provider's own association.
  std::vector<Outcome> allFrom(const Path& source, AssociationQuery query = {}) {
    query.assocClass = under.className;
    return {associations.associators(source, query), associations.associatorNames(source, query),
            associations.references(source, query), associations.referenceNames(source, query)};
  }
  std::vector<Outcome> enumerations(const Path& path) {
    return {instances.enumerateInstanceNames(path), instances.enumerateInstances(path)};
  }
  static std::size_t resultsOf(const Outcome& outcome) { return outcome.instances().size() + outcome.paths().size(); }
};

INSTANTIATE_TEST_SUITE_P(Of, EveryAssociation, ::testing::ValuesIn(associationProviders()), stemOf);

// --- Which far end

TEST_P(EveryAssociation, LeadsFromEachEndToTheOther) {
  for (const auto& [source, farEnd] : directions()) {
    EXPECT_THAT(associated(source), Contains(nameOf(farEnd)));
    for (const Outcome& outcome : allFrom(source)) EXPECT_LT(0U, resultsOf(outcome)) << outcome;
  }
}

TEST_P(EveryAssociation, KnowsTheClassOfASourceByItsExactName) {
  for (const auto& [source, farEnd] : directions()) {
    for (const std::string& name :
         {lowerCase(source.className), standardNameOf(source.className), std::string("ZORVA_Other")}) {
      SCOPED_TRACE(name);
      Path other = source;
      other.className = name;
      for (const Outcome& outcome : allFrom(other)) {
        EXPECT_EQ(0U, resultsOf(outcome));
        EXPECT_FALSE(outcome.markedExit());
      }
    }
  }
}

TEST_P(EveryAssociation, KnowsTheAssociationClassByItsExactNameAndTakesItsOwnIfNoneIsGiven) {
  const std::string own = under.className;
  for (const std::string& name : {lowerCase(own), "CIM_" + own.substr(6), std::string()}) {
    EXPECT_THAT(associated(under.left, {.assocClass = name.c_str()}), IsEmpty()) << name;
  }
  for (const auto& [source, farEnd] : directions()) {
    EXPECT_EQ(associated(source), associated(source, {.assocClass = own.c_str()}));
  }
}

// It leads to that association's far end, which by chance may be one of this association's as well.
TEST_P(EveryAssociation, LooksUpTheFarEndOfAnotherAssociation) {
  for (const Provider& other : associationProviders()) {
    SCOPED_TRACE(other.className);
    const auto isOurs = [&](const Path& end) {
      return end.className == under.left.className || end.className == under.right.className;
    };
    if (isOurs(other.left) || isOurs(other.right)) continue;
    for (const Path& source : {other.left, other.right}) {
      const Outcome outcome = associations.associators(source, {.assocClass = other.className});
      EXPECT_EQ(0U, resultsOf(outcome));
      EXPECT_TRUE(outcome.markedExit());
    }
  }
}

// --- The arguments of a request

TEST_P(EveryAssociation, ResultClassPassesByTheFarEndsOwnAndItsStandardNameInAnyCase) {
  for (const auto& [source, farEnd] : directions()) {
    for (const std::string& name : {farEnd.className, standardNameOf(farEnd.className)}) {
      for (const std::string& spelled : {name, lowerCase(name), upperCase(name)}) {
        EXPECT_EQ(associated(source), associated(source, {.resultClass = spelled.c_str()})) << spelled;
      }
    }
  }
}

TEST_P(EveryAssociation, NothingPassesForAnyOtherResultClass) {
  for (const auto& [source, farEnd] : directions()) {
    for (const std::string& name :
         {source.className, std::string("CIM_ManagedElement"), std::string("CIM_System"),
          std::string("CIM_SettingData"), std::string("ZORVA_SPComputerSystem"), std::string()}) {
      EXPECT_THAT(associated(source, {.resultClass = name.c_str()}), IsEmpty()) << name;
    }
  }
}

TEST_P(EveryAssociation, RolesAndAReferencesResultClassAndPropertiesAreNotRead) {
  const AssociationQuery roles = {.role = "NoSuchRole", .resultRole = "NoSuchRole"};
  const AssociationQuery all = {.resultClass = "CIM_NoSuchClass", .role = "NoSuchRole", .properties = {"NoSuch"}};
  for (const auto& [source, farEnd] : directions()) {
    const std::vector<Outcome> usual = allFrom(source);
    const std::vector<Outcome> asked = allFrom(source.on("elsewhere"), roles);
    for (std::size_t i = 0; i < usual.size(); ++i) EXPECT_EQ(usual[i].story(), asked[i].story());
    EXPECT_EQ(usual[2].story(), associations.references(source, all).story());
    EXPECT_EQ(usual[3].story(), associations.referenceNames(source, all).story());
  }
}

TEST_P(EveryAssociation, EverythingLiesInTheNamespaceOfTheRequest) {
  const auto callsOf = [this](const std::string& nameSpace) {
    std::vector<std::string> all;
    std::vector<Outcome> outcomes = enumerations(associationClass().in(nameSpace));
    for (const Path& source : {under.left.in(nameSpace), under.right.in(nameSpace)}) {
      for (const Outcome& outcome : allFrom(source)) outcomes.push_back(outcome);
    }
    for (const Outcome& outcome : outcomes) {
      for (const std::string& line : outcome.calls.lines()) all.push_back(line);
    }
    return all;
  };
  std::vector<std::string> expected = callsOf("root/cimv2");
  for (std::string& line : expected) {
    const std::size_t at = line.find("root/cimv2");
    if (at != std::string::npos) line.replace(at, std::string("root/cimv2").size(), "root/lab");
  }
  EXPECT_EQ(expected, callsOf("root/lab"));
}

// --- Names, instances and their properties

TEST_P(EveryAssociation, EachNameFindsItsInstance) {
  const std::vector<Instance> all = instances.enumerateInstances(associationClass()).instances();
  const std::vector<Path> names = instances.enumerateInstanceNames(associationClass()).paths();
  ASSERT_EQ(all.size(), names.size());
  for (std::size_t i = 0; i < names.size(); ++i) {
    EXPECT_THAT(instances.getInstance(names[i]).instances(), ElementsAre(all[i]));
    Path turned = names[i].on("elsewhere");
    std::reverse(turned.keys.begin(), turned.keys.end());
    EXPECT_THAT(instances.getInstance(turned).instances(), ElementsAre(all[i]));
  }
}

TEST_P(EveryAssociation, NameOfNoPairFindsNothing) {
  const Path name = instances.enumerateInstanceNames(associationClass()).paths().at(0);
  Path unknownEnd = name[under.rightRole].path();
  for (auto& [key, value] : unknownEnd.keys) value = text("unknown");
  for (const Path& path :
       {name.key(under.rightRole, ref(unknownEnd)), name.key(under.rightRole, "a text"),
        name.key(under.rightRole, ref(Path(unknownEnd.className))), name.key("Another", "key"), name.in("root/other"),
        associationClass().key(under.leftRole, name[under.leftRole]), associationClass()}) {
    EXPECT_THAT(instances.getInstance(path).instances(), IsEmpty()) << path;
  }
}

TEST_P(EveryAssociation, PropertyListNarrowsInstancesToItAndTheKeys) {
  const Names keys = {under.leftRole, under.rightRole};
  const Path name = instances.enumerateInstanceNames(associationClass()).paths().at(0);
  for (const std::string& own : instances.getInstance(name).instances().at(0).names()) {
    Names expected = keys;
    if (std::find(keys.begin(), keys.end(), own) == keys.end()) expected.push_back(own);
    for (const Outcome& outcome :
         {instances.enumerateInstances(associationClass(), {own}), instances.getInstance(name, {own})}) {
      EXPECT_EQ(expected, outcome.instances().at(0).names());
    }
  }
  EXPECT_EQ(keys, instances.enumerateInstances(associationClass(), {{}}).instances().at(0).names());
}

// --- Failures

// The codes of the broker reach the client, but for those of the instances, which are built first.
TEST_P(EveryAssociation, WithoutTheOtherEndsProviderNothingIsGivenAndNoInstanceOperationSaysWhy) {
  const Path& other = isServedElsewhere(under.left) ? under.left : under.right;
  if (!isServedElsewhere(other)) return;
  for (const CMPIrc rc : {CMPI_RC_ERR_INVALID_CLASS, CMPI_RC_ERR_NOT_SUPPORTED}) {
    broker.serve(other.className, {objectOf(other)}).rc = rc;  // objects beside the code
    const Outcome one = instances.getInstance(under.object());
    const Outcome all = instances.enumerateInstances(associationClass());
    for (const Outcome& outcome : {one, all}) {
      EXPECT_EQ(CMPI_RC_OK, outcome.rc);
      EXPECT_EQ(0U, resultsOf(outcome));
    }
    for (const Outcome& outcome : allFrom(&other == &under.left ? under.right : under.left)) {
      EXPECT_EQ(rc, outcome.rc);
      EXPECT_EQ(0U, resultsOf(outcome));
    }
    for (const Outcome& outcome : allFrom(other)) EXPECT_EQ(1U, std::min<std::size_t>(1U, resultsOf(outcome)));
  }
  broker.serve(other.className).nullEnumeration = true;
  EXPECT_THAT(enumerated(), IsEmpty());
  broker.serve(other.className).throws = true;
  EXPECT_THROW(built(), InjectedFailure);
}

TEST_P(EveryAssociation, InstancesCompleteWhateverTheBrokerFailsAt) {
  const auto tried = forEachFailure(broker, [&](std::size_t, Mode) {
    const Outcome all = instances.enumerateInstances(associationClass());
    EXPECT_EQ(CMPI_RC_OK, all.rc);
    EXPECT_TRUE(all.calls.count("returnDone") == 1 && all.markedExit()) << all;
  });
  EXPECT_LT(20U, tried);
}

}  // namespace
}  // namespace ZV::Test
