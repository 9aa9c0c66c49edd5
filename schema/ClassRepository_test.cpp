#include "schema/ClassRepository.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "schema/Mof.h"

namespace zorva::schema {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;

constexpr std::string_view kQualifiers = R"(
Qualifier Abstract : boolean = false, Scope(class, association), Flavor(EnableOverride, Restricted);
Qualifier Association : boolean = false, Scope(association), Flavor(DisableOverride, ToSubclass);
Qualifier Description : string = null, Scope(any), Flavor(EnableOverride, ToSubclass, Translatable);
Qualifier Deprecated : string[], Scope(any), Flavor(EnableOverride, Restricted);
Qualifier Key : boolean = false, Scope(property, reference), Flavor(DisableOverride, ToSubclass);
Qualifier MaxLen : uint32 = null, Scope(property);
Qualifier Override : string = null, Scope(property, reference, method), Flavor(EnableOverride, Restricted);
)";

class ClassRepositoryTest : public ::testing::Test {
 protected:
  ClassRepositoryTest() { load(kQualifiers); }

  void load(std::string_view text) { EXPECT_EQ(errorOf(text), "no error"); }

  std::string errorOf(std::string_view text) {
    RepositorySink sink(repository_);
    const auto outcome = parseMof(text, "t.mof", sink);
    return outcome ? "no error" : outcome.error().text();
  }

  const Class& get(std::string_view name) {
    const Class* found = repository_.find(name);
    if (found == nullptr) throw std::runtime_error("no class " + std::string(name));
    return *found;
  }

  ClassRepository repository_;
};

std::vector<std::string> names(const std::vector<const Class*>& classes) {
  std::vector<std::string> all;
  for (const Class* one : classes) all.push_back(one->name());
  return all;
}

template <typename Element>
std::vector<std::string> names(const std::vector<const Element*>& elements) {
  std::vector<std::string> all;
  for (const Element* one : elements) all.push_back(one->name);
  return all;
}

TEST_F(ClassRepositoryTest, FindsAClassInAnyCaseAndKnowsItsSpelling) {
  load("class X_Thing { string Name; };");
  ASSERT_NE(repository_.find("x_tHING"), nullptr);
  EXPECT_EQ(repository_.find("x_tHING")->name(), "X_Thing");
  EXPECT_EQ(repository_.find("X_Thin"), nullptr);
  EXPECT_EQ(get("X_Thing").findProperty("NAME")->name, "Name");
  EXPECT_EQ(get("X_Thing").findProperty("Nam"), nullptr);
}

TEST_F(ClassRepositoryTest, InheritsPropertiesAndMethodsInOrder) {
  load(R"(class A { [Key] string Id; string Name; uint32 Go(); };
          class B : A { uint8 Size; uint32 Stop(); };
          class C : b { [Override("Name"), MaxLen(5)] string Name; [Override("Go")] uint32 Go(); };)");
  const Class& c = get("C");
  EXPECT_EQ(c.superclass(), &get("B"));
  EXPECT_THAT(names(c.properties()), ElementsAre("Id", "Name", "Size"));
  EXPECT_THAT(names(c.methods()), ElementsAre("Go", "Stop"));
  EXPECT_EQ(c.findProperty("Name")->origin, &c);
  EXPECT_EQ(c.findProperty("Size")->origin, &get("B"));
  EXPECT_EQ(c.findMethod("gO")->origin, &c);
  EXPECT_EQ(c.findMethod("stop")->origin, &get("B"));
  EXPECT_EQ(c.findMethod("run"), nullptr);
  EXPECT_THAT(names(c.keys()), ElementsAre("Id"));
}

TEST_F(ClassRepositoryTest, QualifiersTravelByTheirFlavor) {
  load(R"([Abstract, Description("a")]
          class A { [Key, MaxLen(9), Description("id"), Deprecated{"A.X"}] string Id; };
          class B : A { [Override("Id"), MaxLen(5)] string Id; };
          class C : B { };)");
  EXPECT_NE(findQualifier(get("A").qualifiers(), "Abstract"), nullptr);
  EXPECT_EQ(findQualifier(get("B").qualifiers(), "Abstract"), nullptr);
  EXPECT_EQ(textOf(*findQualifier(get("C").qualifiers(), "description")->value), "a");
  EXPECT_TRUE(findQualifier(get("C").qualifiers(), "description")->propagated);
  EXPECT_FALSE(findQualifier(get("A").qualifiers(), "description")->propagated);

  const Qualifiers& own = get("A").findProperty("Id")->qualifiers;
  EXPECT_NE(findQualifier(own, "Deprecated"), nullptr);
  const Qualifiers& overriding = get("B").findProperty("Id")->qualifiers;
  EXPECT_EQ(findQualifier(overriding, "Deprecated"), nullptr);
  EXPECT_NE(findQualifier(overriding, "Override"), nullptr);
  EXPECT_EQ(findQualifier(overriding, "MaxLen")->value, Value::of(std::uint64_t{5}));
  EXPECT_TRUE(findQualifier(overriding, "Key")->propagated);
  const Qualifiers& inherited = get("C").findProperty("Id")->qualifiers;
  EXPECT_EQ(findQualifier(inherited, "Override"), nullptr);
  EXPECT_EQ(findQualifier(inherited, "MaxLen")->value, Value::of(std::uint64_t{5}));
  EXPECT_TRUE(get("C").keys().at(0)->isKey);
}

TEST_F(ClassRepositoryTest, StatedFlavorsWinOverTheType) {
  load(R"([Description("a") : Restricted] class A { [MaxLen(9) : DisableOverride] string S; };
          class B : A { };)");
  EXPECT_EQ(findQualifier(get("B").qualifiers(), "Description"), nullptr);
  EXPECT_THAT(errorOf(R"(class C : A { [Override("S"), MaxLen(5)] string S; };)"),
              HasSubstr("DisableOverride forbids"));
}

TEST_F(ClassRepositoryTest, FillsInTheValuesOfBareQualifiers) {
  load("class A { [Key, Description] string Id; };");
  const Qualifiers& qualifiers = get("A").findProperty("Id")->qualifiers;
  EXPECT_EQ(findQualifier(qualifiers, "Key")->value, Value::of(true));
  EXPECT_TRUE(findQualifier(qualifiers, "Description")->value->isNull);
}

TEST_F(ClassRepositoryTest, GivesQualifiersTheSpellingOfTheirType) {
  load("class A { [KEY, maxlen(4)] string Id; };");
  EXPECT_EQ(get("A").findProperty("Id")->qualifiers[0].name, "Key");
  EXPECT_EQ(get("A").findProperty("Id")->qualifiers[1].name, "MaxLen");
}

TEST_F(ClassRepositoryTest, AnOverrideKeepsTheSpellingAndTheDefault) {
  load(R"(class A { uint8 Size = 3; };
          class B : A { [Override("A.size")] uint8 SIZE; };)");
  EXPECT_EQ(get("B").findProperty("size")->name, "Size");
  EXPECT_EQ(get("B").findProperty("size")->defaultValue, Value::of(std::uint64_t{3}));
}

constexpr std::string_view kNet = R"(
class E { [Key] string Id; };
class Host : E { };
class Port : E { };
class FastPort : Port { };
[Association, Abstract] class Link { [Key] E REF Left; [Key] E REF Right; };
[Association] class HostPort : Link { [Override("Left")] host REF Left; [Override("Right")] Port REF Right; string Why; };
[Association] class PortPort : Link { [Override("Left")] Port REF Left; [Override("Right")] Port REF Right; };
[Association] class FastHost : HostPort { [Override("Right")] FastPort REF Right; };
)";

TEST_F(ClassRepositoryTest, KnowsAssociationsAndTheirEnds) {
  load(kNet);
  const Class& hostPort = get("HostPort");
  EXPECT_TRUE(hostPort.isAssociation());
  EXPECT_FALSE(get("Host").isAssociation());
  EXPECT_THAT(names(hostPort.references()), ElementsAre("Left", "Right"));
  EXPECT_THAT(names(hostPort.keys()), ElementsAre("Left", "Right"));
  EXPECT_EQ(hostPort.findProperty("LEFT")->reference, &get("Host"));
  EXPECT_EQ(hostPort.findProperty("LEFT")->referenceClass, "Host");
  EXPECT_NE(findQualifier(get("Link").qualifiers(), "Abstract"), nullptr);
  EXPECT_EQ(findQualifier(hostPort.qualifiers(), "Abstract"), nullptr);
}

TEST_F(ClassRepositoryTest, KnowsWhatIsBelowWhat) {
  load(kNet);
  EXPECT_TRUE(get("FastPort").isA("e"));
  EXPECT_TRUE(get("FastPort").isA(get("FastPort")));
  EXPECT_FALSE(get("Port").isA(get("FastPort")));
  EXPECT_FALSE(get("Port").isA("Nothing"));
  EXPECT_THAT(names(get("E").subclasses()), ElementsAre("Host", "Port"));
  EXPECT_THAT(names(repository_.subclasses(&get("E"), false)), ElementsAre("Host", "Port"));
  EXPECT_THAT(names(repository_.subclasses(&get("E"), true)), ElementsAre("Host", "Port", "FastPort"));
  EXPECT_THAT(names(repository_.subclasses(nullptr, false)), ElementsAre("E", "Link"));
  EXPECT_EQ(repository_.subclasses(nullptr, true).size(), 8U);
}

TEST_F(ClassRepositoryTest, FindsTheConcreteAssociationsOfAClass) {
  load(kNet);
  EXPECT_THAT(names(repository_.associationsOf(get("Host"))), ElementsAre("HostPort", "FastHost"));
  EXPECT_THAT(names(repository_.associationsOf(get("Port"))), ElementsAre("HostPort", "PortPort"));
  EXPECT_THAT(names(repository_.associationsOf(get("FastPort"))), ElementsAre("HostPort", "PortPort", "FastHost"));
  EXPECT_THAT(names(repository_.associationsOf(get("FastPort"), &get("HostPort"))),
              ElementsAre("HostPort", "FastHost"));
  EXPECT_THAT(names(repository_.associationsOf(get("Host"), &get("Link"))), ElementsAre("HostPort", "FastHost"));
  EXPECT_THAT(names(repository_.associationsOf(get("Host"), &get("PortPort"))), IsEmpty());
}

TEST_F(ClassRepositoryTest, AReferenceMayNameItsOwnClass) {
  load("[Association] class Chain { [Key] Chain REF Up; [Key] Chain REF Down; };");
  EXPECT_EQ(get("Chain").findProperty("Up")->reference, &get("Chain"));
}

TEST_F(ClassRepositoryTest, DeclarationGivesBackWhatTheClassItselfSays) {
  load(kNet);
  EXPECT_EQ(writeMof(get("FastHost").declaration()),
            "[Association]\n"
            "class FastHost : HostPort {\n"
            "  [Override(\"Right\")]\n"
            "  FastPort REF Right;\n"
            "};\n");
}

// Each row: an addition to kNet, and why it is refused.
TEST_F(ClassRepositoryTest, RefusesWhatDoesNotHoldTogether) {
  load(kNet);
  const std::size_t before = repository_.classes().size();
  const std::pair<const char*, const char*> rows[] = {
      {"class host { };", "t.mof:1:7: class 'host' is declared a second time"},
      {"Qualifier key : boolean, Scope(any);", "t.mof:1:1: qualifier 'key' is declared a second time"},
      {"class X : Y { };", "t.mof:1:7: superclass 'Y' of class 'X' is not declared"},
      {"class X : X { };", "t.mof:1:7: superclass 'X' of class 'X' is not declared"},
      {"[Association] class X { Y REF A; E REF B; };", "t.mof:1:31: class 'Y' of reference 'A' is not declared"},
      {"class X { uint8 F(Y REF P); };", "t.mof:1:25: class 'Y' of parameter 'P' of method 'F' is not declared"},
      {"class X { E REF A; };", "t.mof:1:17: reference 'A' is in a class without the Association qualifier"},
      {"[Association] class X { E REF A; };", "t.mof:1:21: association 'X' has 1 references; it needs two at least"},
      {"class X { string A; uint8 a; };", "t.mof:1:27: property 'a' is declared twice"},
      {"class X { uint8 F(); uint8 f(); };", "t.mof:1:28: method 'f' is declared twice"},
      {"class X { uint8 F(uint8 a, uint8 A); };", "t.mof:1:34: parameter 'A' of method 'F' is declared twice"},
      {"class X : E { string Id; };", "t.mof:1:22: property 'Id' is inherited already and has no Override qualifier"},
      {"class X : E { [Override(\"Id\")] uint8 Id; };",
       "t.mof:1:38: property 'Id' is of type uint8 and overrides string of class 'E'"},
      {"class X : E { [Override(\"Id\")] string Id[]; };",
       "t.mof:1:39: property 'Id' is of type string[] and overrides string of class 'E'"},
      {"[Association] class X : HostPort { [Override(\"Left\")] Port REF Left; };",
       "t.mof:1:64: property 'Left' is of type Port REF and overrides Host REF of class 'HostPort'"},
      {"[Association] class X : HostPort { [Override(\"Left\")] E REF Left; };",
       "t.mof:1:61: property 'Left' is of type E REF and overrides Host REF of class 'HostPort'"},
      {"class X : E { [Override(\"Name\")] string Name; };",
       "t.mof:1:16: property 'Name' overrides 'Name', which it does not inherit"},
      {"class X : E { [Override(\"Name\")] string Id; };",
       "t.mof:1:16: property 'Id' overrides 'Name', which it does not inherit"},
      {"class X : E { [Override(\"Id\"), Key(false)] string Id; };",
       "t.mof:1:32: qualifier 'Key' on property 'Id' changes the inherited value, which its flavor DisableOverride "
       "forbids"},
      {"class X : E { [Key] string Other; };",
       "t.mof:1:28: property 'Other' is a further key: class 'E' has its keys already"},
      {"[Wrong] class X { };", "t.mof:1:2: qualifier 'Wrong' on class 'X' is not declared"},
      {"[Key] class X { };",
       "t.mof:1:2: qualifier 'Key' on class 'X' does not belong there: its scope leaves that out"},
      {"class X { [Association] string A; };",
       "t.mof:1:12: qualifier 'Association' on property 'A' does not belong there: its scope leaves that out"},
      {"class X { uint8 F([Key] uint8 P); };",
       "t.mof:1:20: qualifier 'Key' on parameter 'P' of method 'F' does not belong there: its scope leaves that out"},
      {"class X { [MaxLen(1), maxlen(2)] string A; };",
       "t.mof:1:23: qualifier 'maxlen' on property 'A' is given twice"},
      {"class X { [MaxLen(\"5\")] string A; };",
       "t.mof:1:12: qualifier 'MaxLen' on property 'A': a text is no value of type uint32"},
      {"class X { [MaxLen{5}] string A; };",
       "t.mof:1:12: qualifier 'MaxLen' on property 'A': an array is given where a single uint32 belongs"},
      {"class X { [MaxLen(4294967296)] string A; };",
       "t.mof:1:12: qualifier 'MaxLen' on property 'A': 4294967296 does not fit in uint32"},
      {"instance of Host { Id = \"a\"; };", "t.mof:1:13: an instance of 'Host' is among the classes"},
  };
  for (const auto& [text, error] : rows) EXPECT_EQ(errorOf(text), error) << text;
  EXPECT_EQ(repository_.classes().size(), before);
  EXPECT_EQ(repository_.find("X"), nullptr);
  load("class X : E { };");
}

TEST_F(ClassRepositoryTest, RefusesAMethodThatReturnsAnotherType) {
  load("class A { uint32 Go(); };");
  EXPECT_EQ(errorOf("class B : A { [Override(\"Go\")] uint8 Go(); };"),
            "t.mof:1:38: method 'Go' returns uint8 and overrides one of class 'A' that returns uint32");
  EXPECT_EQ(errorOf("class B : A { uint32 go(); };"),
            "t.mof:1:22: method 'go' is inherited already and has no Override qualifier");
}

TEST_F(ClassRepositoryTest, TakesAClassThatComesFromNoText) {
  ClassDeclaration made;
  made.name = "Made";
  made.properties.emplace_back().name = "Name";
  EXPECT_TRUE(repository_.add(made));
  EXPECT_EQ(repository_.add(made).error().text(), "class 'Made' is declared a second time");
}

TEST_F(ClassRepositoryTest, KeepsQualifierTypesInOrder) {
  EXPECT_EQ(repository_.findQualifierType("maxLEN")->name, "MaxLen");
  EXPECT_EQ(repository_.findQualifierType("Nothing"), nullptr);
  EXPECT_EQ(repository_.qualifierTypes().front()->name, "Abstract");
  EXPECT_EQ(repository_.qualifierTypes().back()->name, "Override");
}

std::string properties(int count, std::string_view stem) {
  std::string text;
  for (int i = 0; i < count; ++i) text += "string " + std::string(stem) + std::to_string(i) + ";";
  return text;
}

TEST_F(ClassRepositoryTest, BoundsTheSizeOfAClass) {
  load("class A { " + properties(1000, "a") + " };");
  EXPECT_EQ(errorOf("class B : A { string One; };"), "t.mof:1:7: class 'B' has 1001 properties; at most 1000 can be");
  EXPECT_EQ(errorOf("class C { " + properties(200000, "c") + " };"),
            "t.mof:1:7: class 'C' has 200000 properties; at most 1000 can be");
  std::string many = "[Key";
  for (int i = 0; i < 100000; ++i) many += ",Key";
  EXPECT_EQ(errorOf("class D { " + many + "] string D; };"),
            "t.mof:1:7: property 'D' has 100001 qualifiers; at most 250 can be");
  std::string parameters = "uint8 p";
  for (int i = 0; i < 300; ++i) parameters += ",uint8 p" + std::to_string(i);
  EXPECT_EQ(errorOf("class E { uint8 F(" + parameters + "); };"),
            "t.mof:1:17: method 'F' has 301 parameters; at most 250 can be");
}

TEST_F(ClassRepositoryTest, BoundsTheDepthOfAChain) {
  std::string chain = "class C0 { };";
  for (int i = 1; i < 200; ++i) chain += "class C" + std::to_string(i) + " : C" + std::to_string(i - 1) + " { };";
  EXPECT_THAT(errorOf(chain), HasSubstr("class 'C101' has 101 superclasses; at most 100 can be"));
}

// Without a limit, a long description and many subclasses would take a thousand times the text's own size.
TEST_F(ClassRepositoryTest, BoundsWhatSubclassesInherit) {
  load("[Description(\"" + std::string(1U << 20U, 'x') + "\")] class Base { };");
  std::string subclasses;
  for (int i = 0; i < 1000; ++i) subclasses += "class S" + std::to_string(i) + " : Base { };";
  EXPECT_THAT(errorOf(subclasses),
              HasSubstr("bytes of what it and the classes before it inherit; at most 134217728 can be"));
}

}  // namespace
}  // namespace zorva::schema
