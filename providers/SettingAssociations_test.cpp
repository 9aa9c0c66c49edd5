// Tests that hold for all four associations of DNS settings.
#include "providers/testing/SettingAssociations.h"

#include <cctype>

namespace ZV::Test {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

struct End {
  Path path;  // of an object at this end
  const char* ownName;
  const char* cimName;
  const char* baseName;   // of a base class of it
  std::size_t reachable;  // how many objects of the other end it reaches
};

// Another association of the library, named in a request to this provider.
struct Stranger {
  const char* association;
  Path source;
  std::vector<std::string> end;  // as endOf() returns it
  std::size_t results;
};

struct Association {
  AssociationUnderTest provider;
  const char* prefix;
  End left;
  End right;
  std::size_t pairs;
  std::vector<Stranger> strangers;
};

const Path kBmcEndpoint = pathOnSystem("ZORVA_DNSProtocolEndPoint", "bmc0", "BMC:-1");

void PrintTo(const Association& association, std::ostream* out) { *out << association.provider.stem; }

std::string changed(std::string text, int (*change)(int)) {
  std::transform(text.begin(), text.end(), text.begin(),
                 [change](unsigned char letter) { return static_cast<char>(change(letter)); });
  return text;
}
std::string lowerCase(const std::string& text) { return changed(text, &std::tolower); }
std::string upperCase(const std::string& text) { return changed(text, &std::toupper); }

std::vector<Association> allAssociations() {
  const End endpoint = {endpointPath("eth0"), kEndpointClass, "CIM_DNSProtocolEndpoint", "CIM_ServiceAccessPoint", 1};
  const End setting = {settingPath("Computer%eth0"), kSettingClass, "CIM_DNSSettingData", "CIM_SettingData", 1};
  const End assignment = {ipAssignmentPath("Computer%eth0%ipv4"), kIpAssignmentClass, "CIM_IPAssignmentSettingData",
                          "CIM_SettingData", 1};
  End general = {generalSettingPath(), kGeneralSettingClass, "CIM_DNSGeneralSettingData", "CIM_SettingData", 3};
  const std::vector<std::string> neither = {"CMPI_RC_OK", "done, marked"};
  const std::vector<std::string> malformed = {"CMPI_RC_OK", "not done, not marked",
                                              "Incorrect InstanceID in the Source ObjectPath"};
  return {
      {genEndpointElementSettingData(),
       "DNSGenEndPointElementSettingDataProvider",
       endpoint,
       general,
       3,
       {{"ZORVA_DNSEndPointElementSettingData", endpoint.path, neither, 0},
        {"ZORVA_DNSEndPointElementSettingData", setting.path, neither, 3},
        {"ZORVA_DNSGeneralElementSettingData", systemPath("host1"), neither, 1}}},
      {endpointElementSettingData(),
       "DNSEndPointElementSettingDataProvider",
       endpoint,
       setting,
       3,
       {{"ZORVA_DNSGenEndPointElementSettingData", endpoint.path, neither, 0},
        {"ZORVA_DNSGenEndPointElementSettingData", general.path, malformed, 0}}},
      {generalOrderedComponent(),
       "DNSGeneralOrderedComponentProvider",
       assignment,
       general,
       3,
       {{"ZORVA_DNSOrderedComponent", assignment.path, neither, 0},
        {"ZORVA_DNSOrderedComponent", setting.path, neither, 3}}},
      {orderedComponent(),
       "DNSOrderedComponentProvider",
       assignment,
       setting,
       3,
       {{"ZORVA_DNSGenOrderedComponent", assignment.path, neither, 0},
        {"ZORVA_DNSGenOrderedComponent", general.path, neither, 0}}},
  };
}

class SettingAssociation : public AssociationTest, public ::testing::WithParamInterface<Association> {
 protected:
  SettingAssociation() : AssociationTest(GetParam().provider), association(GetParam()) {
    world.host().nic("eth0").nic("eth1").bmc().nic("bmc0").install();
    broker.serve(kIpAssignmentClass,
                 {objectOf(ipAssignmentPath("Computer%eth0%ipv4")), objectOf(ipAssignmentPath("Computer%eth1%ipv4")),
                  objectOf(ipAssignmentPath("BMC%bmc0%ipv6"))});
  }

  struct Direction {
    const End& source;
    const End& farEnd;
  };
  std::vector<Direction> directions() const {
    return {{association.left, association.right}, {association.right, association.left}};
  }

  // Runs the four association operations from a source.
  std::vector<std::pair<const char*, Outcome>> fourFrom(const Path& source, const AssociationQuery& query = {}) {
    return {{"Associators", associators(source, query)},
            {"AssociatorNames", associatorNames(source, query)},
            {"References", references(source, query)},
            {"ReferenceNames", referenceNames(source, query)}};
  }
  static std::size_t results(const Outcome& outcome) { return outcome.instances().size() + outcome.paths().size(); }

  std::vector<Request> requests() {
    return allRequests(enumerateInstanceNames().paths().at(0), association.left.path, association.right.path);
  }

  const Association& association;
};

INSTANTIATE_TEST_SUITE_P(All, SettingAssociation, ::testing::ValuesIn(allAssociations()),
                         [](const auto& one) { return one.param.provider.stem; });

// --- The frame

TEST_P(SettingAssociation, TablesHaveTheirNamesAndAreMadeWithoutAStatus) {
  const std::string prefix = association.prefix;
  EXPECT_EQ("instance" + prefix, instanceProvider.mi()->ft->miName);
  EXPECT_EQ("association" + prefix, associationProvider.mi()->ft->miName);
}

TEST_P(SettingAssociation, ChangesAreRefusedWithoutAWordOrACall) {
  const Path path = associationClass();
  const Instance instance(path.className);
  for (const Outcome& outcome :
       {instanceProvider.createInstance(path, instance), instanceProvider.modifyInstance(path, instance),
        instanceProvider.deleteInstance(path), instanceProvider.execQuery(path, "SELECT", "WQL")}) {
    EXPECT_EQ(CMPI_RC_ERR_NOT_SUPPORTED, outcome.rc);
    EXPECT_THAT(outcome.calls, IsEmpty());
    EXPECT_THAT(outcome.lines, IsEmpty());
  }
}

TEST_P(SettingAssociation, CleanupsAreAnsweredWithSuccess) {
  EXPECT_EQ(CMPI_RC_OK, instanceProvider.cleanup().rc);
  EXPECT_EQ(CMPI_RC_OK, associationProvider.cleanup(false).rc);
}

// --- Which far end

TEST_P(SettingAssociation, SourceOfNeitherEndIsLoggedAndLeavesTheResultOpen) {
  const std::string name = association.provider.className;
  for (const auto& [operationName, outcome] : fourFrom(serverPath("192.0.2.1"))) {
    SCOPED_TRACE(operationName);
    const bool isReference = std::string_view(operationName).starts_with("Reference");
    // The path of the association is made before the far end is looked up; the names of one have the class of the
    // sibling association.
    const bool isSister =
        std::string_view(operationName) == "ReferenceNames" && name == "ZORVA_DNSGenEndPointElementSettingData";
    EXPECT_EQ(
        tell({entry(operation(operationName)),
              isReference ? Story{newPath(isSister ? "ZORVA_DNSEndPointElementSettingData" : name)} : Story(),
              {error(isReference ? "Object Path is NULL in References." : "Object Path is NULL in Associators.")}}),
        storyOf(outcome));
    EXPECT_EQ(CMPI_RC_OK, outcome.rc);
  }
}

TEST_P(SettingAssociation, SourceClassIsComparedExactly) {
  for (const Direction& direction : directions()) {
    std::string lowerCase = direction.source.ownName;
    std::transform(lowerCase.begin(), lowerCase.end(), lowerCase.begin(),
                   [](unsigned char c) { return std::tolower(c); });
    for (const std::string& name : {lowerCase, std::string(direction.source.cimName)}) {
      Path source = direction.source.path;
      source.className = name;
      for (const auto& [operationName, outcome] : fourFrom(source)) {
        EXPECT_THAT(complaintsOf(outcome), SizeIs(1)) << name << ", " << operationName;
        EXPECT_EQ(0U, results(outcome));
      }
    }
  }
}

TEST_P(SettingAssociation, AssociationClassSpelledOtherwiseHasNoFarEnd) {
  for (const char* name : {"zorva_dnsorderedcomponent", "CIM_OrderedComponent", "CIM_ElementSettingData", ""}) {
    const AssociationQuery query{.assocClass = name};
    for (const Outcome& outcome :
         {associators(association.left.path, query), associatorNames(association.left.path, query)}) {
      EXPECT_THAT(endOf(outcome),
                  ElementsAre("CMPI_RC_OK", "not done, not marked", "Object Path is NULL in Associators."));
    }
  }
}

TEST_P(SettingAssociation, OmittedAssociationClassIsTheProvidersOwn) {
  for (const Direction& direction : directions()) {
    const Path& source = direction.source.path;
    EXPECT_EQ(associators(source).instances(), associationProvider.associators(source, {}).instances());
    EXPECT_EQ(associatorNames(source).paths(), associationProvider.associatorNames(source, {}).paths());
    EXPECT_EQ(direction.source.reachable, associationProvider.associatorNames(source, {}).paths().size());
  }
}

// The far end of the other association is looked up: it is not one of this association's ends, or is the same by
// chance.
TEST_P(SettingAssociation, OtherAssociationOfTheLibraryIsLookedUpAsItIs) {
  for (const Stranger& stranger : association.strangers) {
    SCOPED_TRACE(std::string(stranger.association) + " from " + describe(stranger.source));
    const AssociationQuery query{.assocClass = stranger.association};
    for (const Outcome& outcome : {associators(stranger.source, query), associatorNames(stranger.source, query)}) {
      EXPECT_EQ(stranger.end, endOf(outcome));
      EXPECT_EQ(stranger.results, results(outcome));
    }
  }
}

// --- The arguments of a request

TEST_P(SettingAssociation, ResultClassPassesByTheOwnAndTheCimNameInAnyCase) {
  for (const Direction& direction : directions()) {
    for (const std::string name : {direction.farEnd.ownName, direction.farEnd.cimName}) {
      for (const std::string& spelled : {name, lowerCase(name), upperCase(name)}) {
        SCOPED_TRACE(spelled);
        const AssociationQuery query{.resultClass = spelled.c_str()};
        for (const Outcome& outcome :
             {associators(direction.source.path, query), associatorNames(direction.source.path, query)}) {
          EXPECT_EQ(direction.source.reachable, results(outcome));
          EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
        }
      }
    }
  }
}

TEST_P(SettingAssociation, AnyOtherResultClassEndsTheOperationAtOnceWithoutAWord) {
  for (const Direction& direction : directions()) {
    for (const char* name : {direction.farEnd.baseName, "CIM_ManagedElement", direction.source.ownName, ""}) {
      SCOPED_TRACE(name);
      const AssociationQuery query{.resultClass = name};
      for (const auto& [operationName, outcome] :
           {std::pair("Associators", associators(direction.source.path, query)),
            std::pair("AssociatorNames", associatorNames(direction.source.path, query))}) {
        EXPECT_EQ(tell({entry(operation(operationName)), newHostPath("OP1", direction.farEnd.ownName)}),
                  storyOf(outcome));
        EXPECT_EQ(CMPI_RC_OK, outcome.rc);
      }
    }
  }
}

TEST_P(SettingAssociation, RolesThatTheAssociationLacksChangeNothing) {
  const AssociationQuery query{.role = "Nobody", .resultRole = "Nothing"};
  for (const Direction& direction : directions()) {
    const auto usual = fourFrom(direction.source.path);
    const auto asked = fourFrom(direction.source.path, query);
    for (std::size_t i = 0; i < usual.size(); ++i) {
      EXPECT_EQ(usual[i].second.calls.lines(), asked[i].second.calls.lines()) << usual[i].first;
      EXPECT_EQ(direction.source.reachable, results(asked[i].second)) << usual[i].first;
    }
  }
}

TEST_P(SettingAssociation, ReferencesReadNeitherResultClassNorProperties) {
  const AssociationQuery query{.resultClass = "CIM_Nothing", .properties = {"Nothing"}};
  for (const Direction& direction : directions()) {
    const Path& source = direction.source.path;
    EXPECT_EQ(references(source).calls.lines(), references(source, query).calls.lines());
    EXPECT_EQ(referenceNames(source).calls.lines(), referenceNames(source, query).calls.lines());
  }
}

TEST_P(SettingAssociation, NamespaceIsThatOfTheSource) {
  for (const Direction& direction : directions()) {
    for (const auto& [operationName, outcome] : fourFrom(direction.source.path.in("root/other"))) {
      SCOPED_TRACE(operationName);
      EXPECT_EQ(direction.source.reachable, results(outcome));
      for (const Path& path : outcome.paths()) EXPECT_EQ("root/other", path.nameSpace);
      for (const Instance& instance : outcome.instances()) EXPECT_EQ("root/other", instance.path.nameSpace);
    }
  }
}

TEST_P(SettingAssociation, NamespaceOfEnumerationsIsThatOfTheClass) {
  const Path path = associationClass().in("root/other");
  const Outcome names = instanceProvider.enumerateInstanceNames(path);
  const Outcome instances = instanceProvider.enumerateInstances(path);
  ASSERT_EQ(association.pairs, names.paths().size());
  ASSERT_EQ(association.pairs, instances.instances().size());
  for (const Path& one : names.paths()) {
    EXPECT_EQ("root/other", one.nameSpace);
    EXPECT_EQ("root/other", one[under.left].path().nameSpace);
    EXPECT_EQ("root/other", one[under.right].path().nameSpace);
  }
  for (const Instance& one : instances.instances()) {
    EXPECT_EQ("root/other", one.path.nameSpace);
    EXPECT_EQ("root/other", one[under.left].path().nameSpace);
    EXPECT_EQ("root/other", one[under.right].path().nameSpace);
  }
}

// --- Enumerations and single instances

TEST_P(SettingAssociation, EveryPairHasANameAndAnInstance) {
  const Outcome names = enumerateInstanceNames();
  const Outcome instances = enumerateInstances();
  EXPECT_EQ(association.pairs, names.paths().size());
  EXPECT_EQ(pairsOf(names), pairsOf(instances));
  for (const Outcome& outcome : {names, instances})
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
}

TEST_P(SettingAssociation, PropertyListNarrowsInstancesToItAndTheKeys) {
  const std::string own = enumerateInstances().instances().at(0).names().at(2);
  const Outcome narrowed = enumerateInstances({own});
  const Outcome bare = enumerateInstances(PropertyList(std::vector<std::string>()));
  EXPECT_THAT(narrowed.instances(), SizeIs(association.pairs));
  EXPECT_THAT(bare.instances(), SizeIs(association.pairs));
  for (const Instance& instance : narrowed.instances()) {
    EXPECT_THAT(instance.names(), ElementsAre(under.left, under.right, own));
  }
  for (const Instance& instance : bare.instances()) {
    EXPECT_THAT(instance.names(), ElementsAre(under.left, under.right));
  }
}

TEST_P(SettingAssociation, EachNameFindsItsInstance) {
  const std::vector<Instance> all = enumerateInstances().instances();
  const std::vector<Path> names = enumerateInstanceNames().paths();
  ASSERT_EQ(all.size(), names.size());
  for (std::size_t i = 0; i < names.size(); ++i) {
    const Outcome outcome = getInstance(names[i]);
    EXPECT_THAT(outcome.instances(), ElementsAre(all[i]));
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
  }
}

TEST_P(SettingAssociation, NameIsFoundWithItsKeysTurnedAroundAndFromAnotherHost) {
  const Path name = enumerateInstanceNames().paths().at(1);
  const Path turned =
      associationClass().on("elsewhere").key(under.right, name[under.right]).key(under.left, name[under.left]);
  EXPECT_EQ(getInstance(name).instances(), getInstance(turned).instances());
  EXPECT_THAT(getInstance(turned).instances(), SizeIs(1));
}

TEST_P(SettingAssociation, InstanceIsNarrowedByThePropertyList) {
  const Path name = enumerateInstanceNames().paths().at(0);
  EXPECT_THAT(getInstance(name, {"Nothing"}).instances().at(0).names(), ElementsAre(under.left, under.right));
}

TEST_P(SettingAssociation, NameOfNoPairIsNotFoundAndNoError) {
  const Path name = enumerateInstanceNames().paths().at(0);
  const Value nobody = ref(settingPath("Computer%nobody"));
  const Value asText = text(describe(name[under.left].path()));
  for (const Path& path : {name.key(under.left, nobody), name.key(under.right, nobody), name.key(under.left, asText),
                           name.key("Another", "key"), associationClass().key(under.left, name[under.left])}) {
    const Outcome outcome = getInstance(path);
    EXPECT_THAT(outcome.instances(), IsEmpty()) << path;
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
  }
}

TEST_P(SettingAssociation, NameWithoutKeysIsAnErrorLineAndAnEmptyResult) {
  const Outcome outcome = getInstance(associationClass());
  EXPECT_EQ(tell({entry(operation("GetInstance")),
                  {error("At least one key should be passed")},
                  done(operation("GetInstance"))}),
            storyOf(outcome));
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

TEST_P(SettingAssociation, PairThatCannotBeMadeIsLeftOutWithoutAWord) {
  const std::vector<Instance> all = enumerateInstances().instances();
  for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull}) {
    const Outcome outcome = failing(
        "newInstance(", mode, [this] { return enumerateInstances(); }, 2);
    EXPECT_THAT(outcome.instances(), ElementsAre(all[0], all[2])) << nameOf(mode);
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
  }
}

TEST_P(SettingAssociation, StatusOfABuiltPairIsNotLookedAt) {
  const std::vector<Instance> all = enumerateInstances().instances();
  const Outcome outcome = failing(
      "newInstance(", Mode::SetRc, [this] { return enumerateInstances(); }, 2);
  EXPECT_EQ(all, outcome.instances());
  EXPECT_EQ(CMPI_RC_OK, outcome.rc);
}

// The reference itself is not checked: if a broker makes none, it gets null as argument, and its code is the
// operation's.
TEST_P(SettingAssociation, ReferenceThatCannotBeMadeIsPassedOnUnchanged) {
  for (const Direction& direction : directions()) {
    const auto run = [this, &direction] { return references(direction.source.path); };
    const std::size_t last = run().calls.count("newInstance");
    const Outcome outcome = failing("newInstance(", Mode::ReturnNull, run);
    EXPECT_EQ(direction.source.reachable - 1, outcome.instances().size());
    EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
    EXPECT_EQ("returnInstance(null)", outcome.calls.only({"returnInstance"}).at(0));
    const Outcome names =
        failing("newInstance(", Mode::NullHandle, [this, &direction] { return referenceNames(direction.source.path); });
    EXPECT_EQ("returnObjectPath(null)", names.calls.only({"returnObjectPath"}).at(0));
    EXPECT_LE(1U, last);
  }
}

TEST_P(SettingAssociation, AssociationPathOfReferencesIsNotTested) {
  for (const Direction& direction : directions()) {
    for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle}) {
      const Outcome outcome = failing(
          "newObjectPath", mode, [&] { return references(direction.source.path); }, 2);
      EXPECT_THAT(endOf(outcome), ElementsAre("CMPI_RC_OK", "done, marked"));
      EXPECT_THAT(outcome.instances(), IsEmpty());
      EXPECT_EQ(direction.source.reachable, outcome.calls.count("returnInstance"));
    }
  }
}

TEST_P(SettingAssociation, FarEndThatCannotBeMadeIsLoggedAndShowsTheBrokersCode) {
  for (const Direction& direction : directions()) {
    const Path& source = direction.source.path;
    for (const Mode mode : {Mode::ReturnNull, Mode::NullHandle, Mode::RcAndNull}) {
      SCOPED_TRACE(nameOf(mode));
      const char* code = mode == Mode::RcAndNull ? "CMPI_RC_ERR_FAILED" : "CMPI_RC_OK";
      const auto fails = [&](const std::function<Outcome()>& run) {
        return endOf(failing("newObjectPath", mode, run));
      };
      EXPECT_THAT(fails([&] { return associators(source); }),
                  ElementsAre(code, "not done, not marked", "Object Path is NULL in Associators."));
      EXPECT_THAT(fails([&] { return associatorNames(source); }),
                  ElementsAre(code, "not done, not marked", "Object Path is NULL in Associators."));
      // The association's path is made after it, and the operation ends with the code that this leaves in the status.
      EXPECT_THAT(fails([&] { return references(source); }),
                  ElementsAre("CMPI_RC_OK", "not done, not marked", "Object Path is NULL in References."));
      EXPECT_THAT(fails([&] { return referenceNames(source); }),
                  ElementsAre("CMPI_RC_OK", "not done, not marked", "Object Path is NULL in References."));
    }
  }
}

// --- Everything at once

TEST_P(SettingAssociation, LatestBrokerIsTheOneThatBothTablesUse) {
  RecordingBroker second;
  second.serve(kIpAssignmentClass);
  const AssociationProvider other(association.provider.createAssociationMI, second);
  enumerateInstanceNames();
  EXPECT_LT(0U, second.callCount());
}

TEST_P(SettingAssociation, NoObjectIsEverReleasedOrCloned) {
  for (const Request& request : requests()) {
    const Calls calls = request.run().calls;
    EXPECT_EQ(0U, calls.count("release") + calls.count("clone")) << request.name;
  }
}

TEST_P(SettingAssociation, SurvivesEveryFailureOfTheBroker) { expectToSurviveEveryFailure(requests()); }

// Only the tree's exceptions may leave the provider. The one exception of the provider's own is allowed where a failing
// tree leaves no settings to pair.
TEST_P(SettingAssociation, SurvivesEveryFailureOfTheTree) {
  const bool mayBeOutOfRange = under.stem == "DNSGeneralOrderedComponent";
  for (const Request& request : requests()) {
    SCOPED_TRACE(request.name);
    const std::size_t tried = forEachTreeFailure([&](std::size_t, Thrown thrown) {
      try {
        expectRegularEnd(request.name, request.run());
      } catch (const std::out_of_range&) {
        EXPECT_TRUE(mayBeOutOfRange);
      } catch (const std::runtime_error& error) {
        EXPECT_STREQ("the tree failed as it was asked to", error.what());
      } catch (int) {
        EXPECT_EQ(Thrown::Int, thrown);
      }
    });
    EXPECT_LE(2U, tried);
  }
}

}  // namespace
}  // namespace ZV::Test
