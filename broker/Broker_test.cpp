#include "broker/Broker.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <mutex>
#include <thread>

#include "broker/objects/PathText.h"
#include "broker/testing/TestClasses.h"

namespace zorva::broker {
namespace {

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::StartsWith;

/// A broker over the test provider, with what was logged.
class BrokerTest : public ::testing::Test {
 protected:
  BrokerTest() {
    BrokerOptions options = testing::testOptions(
        ZORVA_LIB_DIR, {testing::testProvider("T_Thing", "Thing", InstanceMi | MethodMi),
                        testing::testProvider("T_SpecialThing", "Thing", InstanceMi),
                        testing::testProvider("T_Other", "Other", InstanceMi),
                        testing::testProvider("T_Trouble", "Trouble", InstanceMi),
                        testing::testProvider("T_Calling", "Calling", InstanceMi),
                        ProviderEntry{"T_Absent", "Absent", "no-such-library", InstanceMi},
                        testing::testProvider("T_Two", "Missing", InstanceMi),
                        testing::testProvider("T_ThingOther", "Link", InstanceMi | AssociationMi),
                        testing::testProvider("T_ThingTrouble", "Refusing", AssociationMi),
                        ProviderEntry{"T_ThingAbsent", "Absent", "no-such-library", AssociationMi}});
    options.log = [this](LogLevel, std::string_view text) {
      const std::lock_guard lock(mutex_);
      lines_.emplace_back(text);
    };
    broker_.emplace(testing::testClasses(), std::move(options));
  }

  std::vector<std::string> names(const std::string& className) {
    std::vector<std::string> found;
    status_ = broker_->enumerateInstanceNames("root/cimv2", className, [&](const ObjectPath& path) {
      found.push_back(pathText(path));
      return true;
    });
    return found;
  }

  std::vector<Instance> instances(const std::string& className, const Selection& selection = {}) {
    std::vector<Instance> found;
    status_ = broker_->enumerateInstances("root/cimv2", className, selection, [&](const Instance& instance) {
      found.push_back(instance);
      return true;
    });
    return found;
  }

  /// The properties that have a value.
  static std::vector<std::string> propertyNames(const Instance& instance) {
    std::vector<std::string> found;
    for (const Property& property : instance.properties) {
      if (!property.value.isNull) found.push_back(property.name);
    }
    return found;
  }

  static ObjectPath path(const std::string& text) {
    const auto read = parsePathText(text);
    EXPECT_TRUE(read) << read.error().message;
    return read.value_or(ObjectPath());
  }

  /// The result, with its status in status_.
  template <typename Result>
  Result keep(Expected<Result, Status> outcome) {
    status_ = outcome ? Status() : outcome.error();
    return outcome.value_or(Result());
  }

  MethodResult invoke(const std::string& text, std::string_view method, const std::vector<NamedValue>& input = {}) {
    return keep(broker_->invokeMethod(path(text), method, input));
  }

  Instance get(const std::string& text, const Selection& selection = {}, const Caller& caller = {}) {
    return keep(broker_->getInstance(path(text), selection, caller));
  }

  std::vector<std::string> associatorNames(const std::string& text, const AssociationFilter& filter = {}) {
    std::vector<std::string> found;
    status_ = broker_->associatorNames(path(text), filter, [&](const ObjectPath& name) {
      found.push_back(pathText(name));
      return true;
    });
    return found;
  }

  std::vector<std::string> lines() {
    const std::lock_guard lock(mutex_);
    return lines_;
  }

  std::mutex mutex_;
  std::vector<std::string> lines_;
  Status status_;
  std::optional<Broker> broker_;
};

TEST_F(BrokerTest, EnumeratesNamesOfAClassAndOfTheServedClassesBelowIt) {
  EXPECT_THAT(names("t_thing"), ElementsAre("root/cimv2:T_Thing.Name=\"a\"", "root/cimv2:T_Thing.Name=\"b\"",
                                            "root/cimv2:T_SpecialThing.Name=\"s\""));
  EXPECT_EQ(status_.rc, 0);
  EXPECT_THAT(lines(), Contains("EnumerateInstanceNames root/cimv2:T_Thing flags 0"));
}

TEST_F(BrokerTest, GetsAnInstanceByAnySpellingOfItsNames) {
  const Instance instance = get("ROOT/CIMV2:t_thing.NAME=\"a\"");
  EXPECT_EQ(status_.rc, 0) << status_.message;
  EXPECT_EQ(instance.path.className, "T_Thing");
  EXPECT_THAT(propertyNames(instance), ElementsAre("Name", "Size", "Labels"));
  EXPECT_THAT(lines(), Contains("GetInstance root/cimv2:T_Thing.Name all by nobody"));
}

TEST_F(BrokerTest, EnumeratesInstancesWithEachResultOnce) {
  const std::vector<Instance> found = instances("T_Thing");
  ASSERT_EQ(found.size(), 3U);
  EXPECT_EQ(pathText(found[2].path), "root/cimv2:T_SpecialThing.Name=\"s\"");
  EXPECT_THAT(propertyNames(found[2]), ElementsAre("Name", "Extra", "Size", "Labels"));
  EXPECT_EQ(found[0].property("labels")->elements, (std::vector<Scalar>{std::string("x"), std::string("y")}));
  EXPECT_EQ(*found[0].property("SIZE"), Value::unsignedNumber(7, schema::Type::Uint16));
  ASSERT_NE(found[0].properties[0].declaration, nullptr);
  EXPECT_TRUE(found[0].properties[0].declaration->isKey);
}

TEST_F(BrokerTest, AnInstanceHasEveryPropertyOfItsClass) {
  const std::vector<Instance> found = instances("T_Thing");
  ASSERT_EQ(found.size(), 3U);
  for (const Instance& instance : found) {
    ASSERT_NE(instance.declaration, nullptr);
    EXPECT_EQ(instance.properties.size(), instance.declaration->properties().size());
    for (const schema::ClassProperty* declared : instance.declaration->properties()) {
      const Value* value = instance.property(declared->name);
      ASSERT_NE(value, nullptr) << declared->name;
      EXPECT_EQ(value->type, declared->type) << declared->name;
      EXPECT_EQ(value->isArray, declared->isArray) << declared->name;
    }
    EXPECT_EQ(*instance.property("Numbers"), Value::null(schema::Type::Uint16, true));
    EXPECT_TRUE(instance.property("Tiny")->isNull) << "the default of the class is no fact";
  }
}

TEST_F(BrokerTest, APropertyListLeavesOutAlsoWhatHasNoValue) {
  Selection selection;
  selection.propertyList = {"Tiny", "size"};
  const Instance instance = get("T_Thing.Name=\"a\"", selection);
  ASSERT_EQ(instance.properties.size(), 2U);
  EXPECT_EQ(instance.properties[0].name, "Size");
  EXPECT_EQ(instance.properties[1], (Property{"Tiny", Value::null(schema::Type::Uint8)}));
}

TEST_F(BrokerTest, EnumeratesTheServedClassesBelowAnAbstractOne) {
  // T_Absent is served by a library that does not exist: only its own instances are missing.
  const std::vector<std::string> found = names("T_Base");
  EXPECT_EQ(status_.rc, 0) << status_.message;
  EXPECT_THAT(found, Contains("root/cimv2:T_Other.Name=\"o\""));
  EXPECT_THAT(found, Contains("root/cimv2:T_Trouble.Name=\"one\""));
  EXPECT_THAT(lines(), Contains(StartsWith("T_Absent is left out: there is no provider library")));
}

TEST_F(BrokerTest, FailsIfTheLibraryOfTheClassItselfIsMissing) {
  EXPECT_THAT(names("T_Absent"), IsEmpty());
  EXPECT_EQ(status_.rc, 1);
  EXPECT_THAT(status_.message, HasSubstr("libno-such-library.so.1"));
}

TEST_F(BrokerTest, FailsIfTheLibraryLacksTheCreateFunction) {
  names("T_Two");
  EXPECT_EQ(status_.rc, 1);
  EXPECT_THAT(status_.message, HasSubstr("has no function Missing_Create_InstanceMI"));
}

TEST_F(BrokerTest, RefusesWhatDoesNotExist) {
  names("T_NoSuchClass");
  EXPECT_EQ(status_.rc, 5);
  EXPECT_THAT(status_.message, HasSubstr("T_NoSuchClass"));
  names("T_Unserved");
  EXPECT_EQ(status_.rc, 7);
  status_ = broker_->enumerateInstanceNames("root/nowhere", "T_Thing", [](const ObjectPath&) { return true; });
  EXPECT_EQ(status_.rc, 3);
  get("T_Thing.Nome=\"a\"");
  EXPECT_EQ(status_.rc, 4);
  EXPECT_THAT(status_.message, HasSubstr("Nome"));
}

TEST_F(BrokerTest, TakesAnOmittedNamespaceForTheDefaultOne) {
  const Instance instance = get("T_Thing.Name=\"b\"");
  EXPECT_EQ(status_.rc, 0);
  EXPECT_EQ(instance.path.nameSpace, "root/cimv2");
}

TEST_F(BrokerTest, AnswersNotFoundIfTheProviderReturnsNothing) {
  get("T_Thing.Name=\"z\"");
  EXPECT_EQ(status_.rc, 6);
  EXPECT_THAT(status_.message, HasSubstr("T_Thing.Name=\"z\""));
  get("T_Base.Name=\"a\"");
  EXPECT_EQ(status_.rc, 6);
  get("T_Trouble.Name=\"other\"");  // an instance of another class is not returned
  EXPECT_EQ(status_.rc, 6);
}

TEST_F(BrokerTest, AppliesThePropertyListToWhatComesBack) {
  Selection selection;
  selection.propertyList = {"size", "NoSuchProperty", "SIZE"};
  const Instance instance = get("T_Thing.Name=\"a\"", selection);
  EXPECT_THAT(propertyNames(instance), ElementsAre("Size"));
  EXPECT_EQ(pathText(instance.path), "root/cimv2:T_Thing.Name=\"a\"");
  EXPECT_THAT(lines(), Contains("GetInstance root/cimv2:T_Thing.Name [Size] by nobody"));
}

TEST_F(BrokerTest, AnEmptyPropertyListLeavesNoProperties) {
  Selection selection;
  selection.propertyList.emplace();
  EXPECT_THAT(propertyNames(get("T_Thing.Name=\"a\"", selection)), IsEmpty());
  EXPECT_THAT(lines(), Contains("GetInstance root/cimv2:T_Thing.Name [] by nobody"));
}

TEST_F(BrokerTest, ShallowInheritanceGivesThePropertiesOfTheClassThatWasAskedFor) {
  Selection selection;
  selection.deepInheritance = false;
  const std::vector<Instance> found = instances("T_Thing", selection);
  ASSERT_EQ(found.size(), 3U);
  EXPECT_THAT(propertyNames(found[2]), ElementsAre("Name", "Size", "Labels"));
}

TEST_F(BrokerTest, LocalOnlyLeavesOutWhatIsInherited) {
  Selection selection;
  selection.localOnly = true;
  EXPECT_THAT(propertyNames(get("T_Thing.Name=\"a\"", selection)), ElementsAre("Size", "Labels"));
  const std::vector<Instance> found = instances("T_SpecialThing", selection);
  ASSERT_EQ(found.size(), 1U);
  EXPECT_THAT(propertyNames(found[0]), ElementsAre("Extra"));
}

TEST_F(BrokerTest, GivesProvidersTheFlagsAndTheCaller) {
  Selection selection;
  selection.localOnly = true;
  selection.includeQualifiers = true;
  instances("T_Thing", selection);
  EXPECT_THAT(lines(), Contains("EnumerateInstances root/cimv2:T_Thing all flags 7"));
  Caller caller;
  caller.principal = "alice";
  get("T_Thing.Name=\"a\"", {}, caller);
  EXPECT_THAT(lines(), Contains("GetInstance root/cimv2:T_Thing.Name all by alice"));
}

TEST_F(BrokerTest, ASinkThatHasEnoughEndsTheOperationWell) {
  int taken = 0;
  status_ = broker_->enumerateInstances("root/cimv2", "T_Thing", {}, [&](const Instance&) { return ++taken < 2; });
  EXPECT_EQ(status_.rc, 0);
  EXPECT_EQ(taken, 2);
}

TEST_F(BrokerTest, ASinkThatThrowsFailsItsRequestAlone) {
  status_ = broker_->enumerateInstances(
      "root/cimv2", "T_Thing", {}, [](const Instance&) -> bool { throw std::runtime_error("the client is gone"); });
  EXPECT_EQ(status_.rc, 1);
  EXPECT_THAT(status_.message, HasSubstr("the client is gone"));
  EXPECT_EQ(names("T_Thing").size(), 3U);
}

TEST_F(BrokerTest, DropsAndLogsWhatAProviderMustNotReturn) {
  EXPECT_THAT(names("T_Trouble"), ElementsAre("root/cimv2:T_Trouble.Name=\"one\""));
  EXPECT_EQ(status_.rc, 0);
  EXPECT_THAT(lines(), Contains("Trouble returned a null object path; it was dropped"));
  EXPECT_THAT(lines(), Contains("a provider returned a path of the unknown class \"T_NoSuchClass\"; it was dropped"));
  EXPECT_THAT(lines(), Contains("Trouble returned an instance where the operation returns none; it was dropped"));
}

TEST_F(BrokerTest, AnExceptionHalfWayKeepsWhatCameBeforeAndFails) {
  const std::vector<Instance> found = instances("T_Trouble");
  EXPECT_EQ(found.size(), 2U);
  EXPECT_EQ(status_.rc, 1);
  EXPECT_THAT(status_.message, HasSubstr("half way"));
  EXPECT_THAT(lines(), Contains("Trouble returned a null instance; it was dropped"));
  EXPECT_THAT(lines(), Contains("Trouble returned an instance that cannot be read; it was dropped"));
}

TEST_F(BrokerTest, AnExceptionBecomesAFailureWithItsText) {
  get("T_Trouble.Name=\"throw\"");
  EXPECT_EQ(status_.rc, 1);
  EXPECT_THAT(status_.message, HasSubstr("thrown on purpose"));
  get("T_Trouble.Name=\"throw a number\"");
  EXPECT_EQ(status_.rc, 1);
  EXPECT_EQ(names("T_Thing").size(), 3U);  // the process goes on
}

TEST_F(BrokerTest, PassesTheStatusOfAProviderOn) {
  get("T_Trouble.Name=\"fail\"");
  EXPECT_EQ(status_.rc, 2);
  EXPECT_THAT(status_.message, HasSubstr("CIM_ERR_ACCESS_DENIED"));
  get("T_Trouble.Name=\"fail with text\"");
  EXPECT_EQ(status_.rc, 1);
  EXPECT_EQ(status_.message, "the reason");
  get("T_Trouble.Name=\"error\"");
  EXPECT_EQ(status_.rc, 11);
  EXPECT_EQ(status_.message, "told by an error");
}

TEST_F(BrokerTest, GetTakesTheFirstOfSeveral) {
  EXPECT_EQ(get("T_Trouble.Name=\"two\"").property("Name")->asText(), "first");
  EXPECT_EQ(status_.rc, 0);
}

TEST_F(BrokerTest, ASlotThatAProviderLacksIsNotSupported) {
  get("T_Other.Name=\"o\"");
  EXPECT_EQ(status_.rc, 7);
  EXPECT_THAT(status_.message, HasSubstr("Other (GetInstance of T_Other)"));
}

TEST_F(BrokerTest, CreatesModifiesAndDeletes) {
  Instance instance;
  instance.path = path("root/cimv2:T_Thing");
  instance.properties.push_back({"name", Value::text("new"), nullptr});
  instance.properties.push_back({"size", Value::text("9"), nullptr});
  EXPECT_EQ(pathText(keep(broker_->createInstance(instance))), "root/cimv2:T_Thing.Name=\"new-made\"");
  EXPECT_THAT(lines(), Contains("CreateInstance root/cimv2:T_Thing.Name properties 2"));

  instance.properties[0].value = Value::text("quiet");
  EXPECT_EQ(pathText(keep(broker_->createInstance(instance))), "root/cimv2:T_Thing.Name=\"quiet\"");

  instance.path = path("T_Thing.Name=\"a\"");
  instance.properties.erase(instance.properties.begin());
  EXPECT_EQ(broker_->modifyInstance(instance, {{"SIZE"}}).rc, 0);
  EXPECT_THAT(lines(), Contains("ModifyInstance root/cimv2:T_Thing.Name [Size] Size 9 Labels x y"));

  EXPECT_EQ(broker_->deleteInstance(path("T_Thing.Name=\"a\"")).rc, 0);
  const Status refused = broker_->deleteInstance(path("T_Thing.Name=\"z\""));
  EXPECT_EQ(refused.rc, 6);
  EXPECT_EQ(refused.message, "no such thing");
}

TEST_F(BrokerTest, RefusesPropertiesThatTheClassLacksOrDeclaresOtherwise) {
  Instance instance;
  instance.path = path("T_Thing.Name=\"a\"");
  instance.properties.push_back({"Nothing", Value::text("x"), nullptr});
  EXPECT_EQ(broker_->modifyInstance(instance, std::nullopt).rc, 12);
  instance.properties[0] = {"Size", Value::text("many"), nullptr};
  Status refused = broker_->modifyInstance(instance, std::nullopt);
  EXPECT_EQ(refused.rc, 13);
  EXPECT_EQ(refused.message, "T_Thing.Size: \"many\" is no uint16");
  instance.properties[0] = {"Size", Value::unsignedNumber(70000), nullptr};
  EXPECT_EQ(broker_->modifyInstance(instance, std::nullopt).rc, 13);
  instance.properties[0] = {"Labels", Value::text("x"), nullptr};
  EXPECT_EQ(broker_->modifyInstance(instance, std::nullopt).rc, 13);
}

TEST_F(BrokerTest, InvokesAMethodUnderTheSchemasNamesAndTypes) {
  const MethodResult result =
      invoke("T_Thing.Name=\"a\"", "ECHO", {{"TEXT", Value::text("hello")}, {"times", Value::text("3")}});
  EXPECT_EQ(status_.rc, 0) << status_.message;
  EXPECT_EQ(result.returnValue, Value::unsignedNumber(3, schema::Type::Uint32));
  EXPECT_THAT(result.output, ElementsAre(NamedValue{"Said", Value::text("hello")}));
  EXPECT_THAT(lines(), Contains("InvokeMethod root/cimv2:T_Thing.Name Echo 2 Text"));
  EXPECT_THAT(lines(), Contains("made in root/cimv2"));
}

TEST_F(BrokerTest, AMethodMayReturnNothing) {
  const MethodResult result = invoke("T_Thing.Name=\"a\"", "Echo");
  EXPECT_EQ(status_.rc, 0);
  EXPECT_TRUE(result.returnValue.isNull);
  EXPECT_THAT(result.output, IsEmpty());
}

TEST_F(BrokerTest, RefusesMethodsAndParametersThatDoNotExist) {
  invoke("T_Thing.Name=\"a\"", "Sing");
  EXPECT_EQ(status_.rc, 17);
  invoke("T_SpecialThing.Name=\"s\"", "Echo");
  EXPECT_EQ(status_.rc, 16);
  invoke("T_Thing.Name=\"a\"", "Echo", {{"Tone", Value::text("C")}});
  EXPECT_EQ(status_.rc, 4);
  EXPECT_EQ(status_.message, "Echo has no parameter Tone");
}

TEST_F(BrokerTest, RefusesParametersThatDoNotFitOrAreMissing) {
  const auto call = [&](std::string_view method, const std::vector<NamedValue>& input) {
    invoke("T_Thing.Name=\"a\"", method, input);
    return std::to_string(status_.rc) + " " + status_.message;
  };
  EXPECT_EQ(call("Echo", {{"Times", Value::text("many")}}), "4 Echo.Times: \"many\" is no uint16");
  EXPECT_EQ(call("Echo", {{"Text", Value::unsignedNumber(5)}}), "4 Echo.Text: 5 is no string");
  EXPECT_EQ(call("Echo", {{"Text", Value::textArray({"a"})}}), "4 Echo.Text: an array where one value is declared");
  EXPECT_EQ(call("Echo", {{"Text", Value::text("a")}, {"TEXT", Value::text("b")}}),
            "4 Echo: the parameter TEXT is there twice");
  EXPECT_EQ(call("Call", {}), "4 Call: the parameter Text is missing");
  EXPECT_EQ(call("Call", {{"Text", Value::null(schema::Type::String)}}), "4 Call: the parameter Text is missing");
  EXPECT_EQ(call("Call", {{"text", Value::text("")}}), "0 ");
}

TEST_F(BrokerTest, AClassHasStaticMethodsAlone) {
  invoke("T_Thing", "CallAll");
  EXPECT_EQ(status_.rc, 0);
  invoke("T_Thing.Name=\"a\"", "CallAll");
  EXPECT_EQ(status_.rc, 0);
  invoke("T_Thing", "Echo");
  EXPECT_EQ(status_.rc, 4);
  EXPECT_EQ(status_.message, "Echo is a method of the instances of T_Thing; the class itself does not have it");
}

TEST_F(BrokerTest, AnUnknownClassHasTheStatusOfItsOperation) {
  invoke("T_None.Name=\"a\"", "Echo");
  EXPECT_EQ(status_.rc, 6);
  const ObjectPath none = path("T_None.Name=\"a\"");
  const auto instance = [](const Instance&) { return true; };
  const auto name = [](const ObjectPath&) { return true; };
  EXPECT_EQ(broker_->associators(none, {}, {}, instance).rc, 4);
  EXPECT_EQ(broker_->associatorNames(none, {}, name).rc, 4);
  EXPECT_EQ(broker_->references(none, {}, {}, instance).rc, 4);
  EXPECT_EQ(broker_->referenceNames(none, {}, name).rc, 4);
  EXPECT_EQ(broker_->enumerateInstanceNames("", "T_None", name).rc, 5);
}

TEST_F(BrokerTest, AsksEachAssociationThatFitsUnderItsOwnName) {
  EXPECT_THAT(associatorNames("T_Thing.Name=\"a\""), ElementsAre("root/cimv2:T_Other.Name=\"o\""));
  // The refusing one and the one without a library are skipped.
  EXPECT_EQ(status_.rc, 0) << status_.message;
  EXPECT_THAT(lines(), Contains("AssociatorNames root/cimv2:T_Thing.Name T_ThingOther - - -"));
  EXPECT_THAT(lines(), Contains(StartsWith("T_ThingAbsent is left out: there is no provider library")));
}

TEST_F(BrokerTest, ASuperclassOfAnAssociationMeansThoseBelowIt) {
  AssociationFilter filter;
  filter.associationClass = "t_link";
  EXPECT_THAT(associatorNames("T_Thing.Name=\"a\"", filter), ElementsAre("root/cimv2:T_Other.Name=\"o\""));
  EXPECT_THAT(lines(), Contains("AssociatorNames root/cimv2:T_Thing.Name T_ThingOther - - -"));
}

TEST_F(BrokerTest, OneAssociationThatCannotAnswerIsTheStatus) {
  AssociationFilter filter;
  filter.associationClass = "T_ThingTrouble";
  EXPECT_THAT(associatorNames("T_Thing.Name=\"a\"", filter), IsEmpty());
  EXPECT_EQ(status_.rc, 7);
  filter.associationClass = "T_ThingAbsent";
  associatorNames("T_Thing.Name=\"a\"", filter);
  EXPECT_EQ(status_.rc, 1);
}

TEST_F(BrokerTest, AFailureOfOneAssociationLetsTheOthersAnswer) {
  std::vector<std::string> found;
  status_ = broker_->associators(path("T_Thing.Name=\"fail\""), {}, {}, [&](const Instance& instance) {
    found.push_back(pathText(instance.path));
    return true;
  });
  EXPECT_THAT(found, ElementsAre("root/cimv2:T_Other.Name=\"o\""));
  EXPECT_EQ(status_.rc, 1);
}

TEST_F(BrokerTest, FiltersTheFarEndsByClassItself) {
  AssociationFilter filter;
  filter.resultClass = "t_specialthing";
  EXPECT_THAT(associatorNames("T_Other.Name=\"o\"", filter), ElementsAre("root/cimv2:T_SpecialThing.Name=\"s\""));
  EXPECT_THAT(lines(), Contains("AssociatorNames root/cimv2:T_Other.Name T_ThingOther - - -"));
  filter.resultClass = "T_Base";
  EXPECT_EQ(associatorNames("T_Other.Name=\"o\"", filter).size(), 2U);
}

TEST_F(BrokerTest, DoesNotAskIfTheFarEndCannotBeOfTheResultClass) {
  AssociationFilter filter;
  filter.resultClass = "T_Unserved";
  EXPECT_THAT(associatorNames("T_Thing.Name=\"a\"", filter), IsEmpty());
  EXPECT_EQ(status_.rc, 0);
  EXPECT_THAT(lines(), IsEmpty());
}

TEST_F(BrokerTest, RefusesClassesInTheFilterThatDoNotExist) {
  AssociationFilter filter;
  filter.resultClass = "T_NoSuchClass";
  associatorNames("T_Thing.Name=\"a\"", filter);
  EXPECT_EQ(status_.rc, 4);
  EXPECT_EQ(status_.message, "ResultClass: there is no class \"T_NoSuchClass\"");
  filter = {};
  filter.associationClass = "T_NoSuchLink";
  associatorNames("T_Thing.Name=\"a\"", filter);
  EXPECT_EQ(status_.rc, 4);
}

TEST_F(BrokerTest, ChecksRolesAndPassesThemOnInTheSchemasSpelling) {
  AssociationFilter filter;
  filter.role = "left";
  filter.resultRole = "RIGHT";
  EXPECT_EQ(associatorNames("T_Thing.Name=\"a\"", filter).size(), 1U);
  EXPECT_THAT(lines(), Contains("AssociatorNames root/cimv2:T_Thing.Name T_ThingOther - Left Right"));
  filter.role = "Right";
  filter.resultRole = "";
  EXPECT_THAT(associatorNames("T_Thing.Name=\"a\"", filter), IsEmpty());
  EXPECT_EQ(status_.rc, 0);
}

TEST_F(BrokerTest, PassesOnThePropertiesThatTheFarEndMayHave) {
  Selection selection;
  selection.propertyList = {"extra", "note", "SIZE"};
  AssociationFilter filter;
  filter.associationClass = "T_ThingOther";
  std::vector<Instance> found;
  broker_->associators(path("T_Other.Name=\"o\""), filter, selection, [&](const Instance& instance) {
    found.push_back(instance);
    return true;
  });
  EXPECT_THAT(lines(), Contains("Associators root/cimv2:T_Other.Name T_ThingOther - - - [Extra Size]"));
  ASSERT_EQ(found.size(), 2U);
  EXPECT_THAT(propertyNames(found[1]), ElementsAre("Extra", "Size"));
}

TEST_F(BrokerTest, ReferencesNameTheAssociationAndKeepThePropertyList) {
  Selection selection;
  selection.propertyList = {"Rank"};
  std::vector<Instance> found;
  AssociationFilter filter;
  filter.associationClass = "T_ThingOther";
  filter.role = "LEFT";
  status_ = broker_->references(path("T_Thing.Name=\"a\""), filter, selection, [&](const Instance& instance) {
    found.push_back(instance);
    return true;
  });
  EXPECT_EQ(status_.rc, 0);
  EXPECT_THAT(lines(), Contains("References root/cimv2:T_Thing.Name T_ThingOther Left [Rank]"));
  ASSERT_EQ(found.size(), 1U);
  EXPECT_THAT(propertyNames(found[0]), ElementsAre("Rank"));
  EXPECT_EQ(pathText(found[0].path),
            "root/cimv2:T_ThingOther.Left=\"root/cimv2:T_Thing.Name=\\\"a\\\"\","
            "Right=\"root/cimv2:T_Other.Name=\\\"o\\\"\"");
}

TEST_F(BrokerTest, ReferenceNamesHaveTheKeysOfTheInstance) {
  std::vector<ObjectPath> found;
  status_ = broker_->referenceNames(path("T_Other.Name=\"o\""), {}, [&](const ObjectPath& name) {
    found.push_back(name);
    return true;
  });
  ASSERT_EQ(found.size(), 1U);
  EXPECT_EQ(found[0].nameSpace, "root/cimv2");  // the provider left it out
  ASSERT_NE(found[0].key("right"), nullptr);
  EXPECT_EQ(found[0].key("right")->type, schema::Type::Reference);
}

TEST_F(BrokerTest, ReferenceNamesAreFilteredByWhatTheClientAskedFor) {
  std::vector<std::string> found;
  const auto ask = [&](const std::string& resultClass) {
    found.clear();
    AssociationFilter filter;
    filter.associationClass = resultClass;
    status_ = broker_->referenceNames(path("T_Other.Name=\"sister\""), filter, [&](const ObjectPath& name) {
      found.push_back(name.className);
      return true;
    });
    EXPECT_EQ(status_.rc, 0);
  };
  ask("");  // the provider of T_ThingOther names the class of another association
  EXPECT_THAT(found, ElementsAre("T_ThingTrouble"));
  ask("T_Link");
  EXPECT_THAT(found, ElementsAre("T_ThingTrouble"));
  EXPECT_THAT(lines(), ::testing::Not(Contains(HasSubstr("dropped"))));
  ask("T_ThingOther");
  EXPECT_THAT(found, IsEmpty());
  EXPECT_THAT(lines(), Contains("a provider returned objects of T_ThingTrouble, which is not T_ThingOther or below it; "
                                "they were dropped"));
}

TEST_F(BrokerTest, UpCallsRunNestedAndTheirResultsStay) {
  EXPECT_THAT(names("T_Calling"),
              ElementsAre("root/cimv2:T_Calling.Name=\"of a\"", "root/cimv2:T_Calling.Name=\"of b\"",
                          "root/cimv2:T_Calling.Name=\"of s\""));
  EXPECT_THAT(lines(), Contains("EnumerateInstanceNames root/cimv2:T_Thing flags 2"));
}

TEST_F(BrokerTest, UpCallsGiveTheListedPropertiesAndTheKeys) {
  const std::vector<Instance> found = instances("T_Calling");
  ASSERT_EQ(found.size(), 3U);
  EXPECT_EQ(found[0].property("Name")->asText(), "a 7 of 2");
  EXPECT_EQ(found[2].property("Name")->asText(), "s 7 of 2");
}

TEST_F(BrokerTest, AFailedUpCallGivesItsCodeToTheProvider) {
  get("T_Calling.Name=\"absent\"");
  EXPECT_EQ(status_.rc, 1);
  EXPECT_THAT(status_.message, HasSubstr("libno-such-library.so.1"));
  get("T_Calling.Name=\"unserved\"");
  EXPECT_EQ(status_.rc, 7);
}

TEST_F(BrokerTest, ProvidersThatCallInACircleEndInAFailure) {
  get("T_Calling.Name=\"circle\"");
  EXPECT_EQ(status_.rc, 1);
  EXPECT_THAT(status_.message, HasSubstr("32 deep"));
}

TEST_F(BrokerTest, CanonicalPathsHaveTheSchemasNamesTypesAndOrder) {
  const auto two = broker_->canonicalPath(path("t_two.second=\"5\",FIRST=\"x\""));
  ASSERT_TRUE(two);
  EXPECT_EQ(pathText(*two), "root/cimv2:T_Two.First=\"x\",Second=5");
  const auto link = broker_->canonicalPath(path("T_ThingOther.Left=\"T_Thing.Name=\\\"a\\\"\""));
  ASSERT_TRUE(link);
  EXPECT_TRUE(std::holds_alternative<Boxed<ObjectPath>>(link->keys[0].value.scalar));
  const auto refused = broker_->canonicalPath(path("T_ThingOther.Left=\"T_Thing.Name=a\""));
  ASSERT_FALSE(refused);
  EXPECT_EQ(refused.error().rc, 4);
  EXPECT_THAT(refused.error().message, HasSubstr("at byte 13"));
}

TEST_F(BrokerTest, ServesManyThreadsAtOnce) {
  std::vector<std::thread> threads;
  std::atomic<int> found = 0;
  for (int i = 0; i < 4; ++i) {
    threads.emplace_back([&] {
      for (int round = 0; round < 25; ++round) {
        broker_->enumerateInstanceNames("root/cimv2", "T_Calling", [&](const ObjectPath&) {
          ++found;
          return true;
        });
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(found, 4 * 25 * 3);
}

TEST(BrokerLoading, ReportsWhyAProviderWasNotMade) {
  BrokerOptions options;
  options.registry = ProviderRegistry();
  options.registry.add({"T_Thing", "Null", "zorvabrokertestprovider", InstanceMi});
  options.registry.add({"T_Other", "Throwing", "zorvabrokertestprovider", InstanceMi});
  options.registry.add({"T_Trouble", "Thing", ZORVA_SOURCE_DIR "/broker/CMakeLists.txt", InstanceMi});
  options.providerDirectory = ZORVA_LIB_DIR;
  Broker broker(testing::testClasses(), std::move(options));
  const PathSink none = [](const ObjectPath&) { return true; };
  EXPECT_THAT(broker.enumerateInstanceNames("", "T_Thing", none).message, HasSubstr("not today"));
  EXPECT_THAT(broker.enumerateInstanceNames("", "T_Other", none).message, HasSubstr("no provider here"));
  EXPECT_THAT(broker.enumerateInstanceNames("", "T_Trouble", none).message, HasSubstr("cannot be loaded"));
}

TEST(BuiltInRegistry, HasTheSixteenClasses) {
  const ProviderRegistry registry = ProviderRegistry::builtIn();
  EXPECT_EQ(registry.entries().size(), 16U);
  const ProviderEntry* entry = registry.find("ROOT/CIMV2", "zorva_dnsgenendpointelementsettingdata");
  ASSERT_NE(entry, nullptr);
  EXPECT_EQ(entry->prefix, "DNSGenEndPointElementSettingDataProvider");
  EXPECT_EQ(registry.nameSpace("Root/CIMv2/"), "root/cimv2");
  EXPECT_EQ(registry.nameSpace("root/other"), "");
}

}  // namespace
}  // namespace zorva::broker
