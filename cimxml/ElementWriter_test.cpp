#include "cimxml/ElementWriter.h"

#include <gtest/gtest.h>

#include <cmath>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "schema/Mof.h"

namespace zorva::cimxml {
namespace {

using broker::Instance;
using broker::ObjectPath;
using broker::Property;
using broker::Scalar;
using broker::Value;

std::string elementOf(const Value& value) {
  std::string out;
  appendValue(out, value);
  return out;
}

std::string pathElement(const ObjectPath& path) {
  std::string out;
  appendInstancePath(out, path);
  return out;
}

std::string instanceElement(const Property& property, bool classOrigin = false) {
  Instance instance;
  instance.path.className = "C";
  instance.properties.push_back(property);
  std::string out;
  appendInstance(out, instance, {classOrigin, nullptr});
  return out;
}

Value embedded(const char* className) {
  Instance inner;
  inner.path.className = className;
  Value value = Value::text("");
  value.scalar = broker::Boxed<Instance>(inner);
  return value;
}

TEST(XmlValue, IsNothingIfItIsNull) { EXPECT_EQ(elementOf(Value::null(schema::Type::String)), ""); }

TEST(XmlValue, HasOneElementForEachElementOfAnArray) {
  EXPECT_EQ(elementOf(Value::array(schema::Type::Uint16, {Scalar(std::uint64_t{8}), Scalar()})),
            "<VALUE.ARRAY><VALUE>8</VALUE><VALUE.NULL/></VALUE.ARRAY>");
  EXPECT_EQ(elementOf(Value::textArray({})), "<VALUE.ARRAY></VALUE.ARRAY>");
}

TEST(XmlValue, WritesEachTypeAsTheStandardSpellsIt) {
  EXPECT_EQ(elementOf(Value::boolean(true)), "<VALUE>TRUE</VALUE>");
  EXPECT_EQ(elementOf(Value::signedNumber(-5)), "<VALUE>-5</VALUE>");
  EXPECT_EQ(elementOf(Value::unsignedNumber(18446744073709551615U)), "<VALUE>18446744073709551615</VALUE>");
  Value character = Value::text("");
  character.type = schema::Type::Char16;
  character.scalar = u'<';
  EXPECT_EQ(elementOf(character), "<VALUE>&lt;</VALUE>");
  character.scalar = static_cast<char16_t>(0xD800);
  EXPECT_EQ(elementOf(character), "<VALUE>\xEF\xBF\xBD</VALUE>");
  Value real = Value::text("");
  real.type = schema::Type::Real64;
  const std::pair<double, const char*> reals[] = {{0.5, "0.5"},        {5.0, "5.0"},      {1e300, "1.0e+300"},
                                                  {-INFINITY, "-INF"}, {INFINITY, "INF"}, {NAN, "NaN"}};
  for (const auto& [number, text] : reals) {
    real.scalar = number;
    EXPECT_EQ(elementOf(real), "<VALUE>" + std::string(text) + "</VALUE>");
  }
}

TEST(XmlPath, SaysAsMuchAsThePathDoes) {
  ObjectPath path{"", "", "C", {{"K", Value::text("v")}}};
  const std::string name =
      R"(<INSTANCENAME CLASSNAME="C"><KEYBINDING NAME="K"><KEYVALUE VALUETYPE="string" TYPE="string">v</KEYVALUE></KEYBINDING></INSTANCENAME>)";
  EXPECT_EQ(pathElement(path), name);
  path.nameSpace = "root/cimv2";
  const std::string nameSpace =
      R"(<LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="cimv2"/></LOCALNAMESPACEPATH>)";
  EXPECT_EQ(pathElement(path), "<LOCALINSTANCEPATH>" + nameSpace + name + "</LOCALINSTANCEPATH>");
  path.host = "h";
  EXPECT_EQ(pathElement(path),
            "<INSTANCEPATH><NAMESPACEPATH><HOST>h</HOST>" + nameSpace + "</NAMESPACEPATH>" + name + "</INSTANCEPATH>");
}

TEST(XmlPath, WithoutKeysIsAnEmptyInstanceName) {
  EXPECT_EQ(pathElement({"", "", "C", {}}), R"(<INSTANCENAME CLASSNAME="C"></INSTANCENAME>)");
}

TEST(XmlPath, WritesNumbersAndReferencesAmongItsKeys) {
  const ObjectPath path{
      "",
      "",
      "C",
      {{"N", Value::unsignedNumber(3)}, {"B", Value::boolean(false)}, {"R", Value::reference({"", "", "D", {}})}}};
  EXPECT_EQ(
      pathElement(path),
      R"(<INSTANCENAME CLASSNAME="C"><KEYBINDING NAME="N"><KEYVALUE VALUETYPE="numeric" TYPE="uint64">3</KEYVALUE>)"
      R"(</KEYBINDING><KEYBINDING NAME="B"><KEYVALUE VALUETYPE="boolean" TYPE="boolean">FALSE</KEYVALUE></KEYBINDING>)"
      R"(<KEYBINDING NAME="R"><VALUE.REFERENCE><INSTANCENAME CLASSNAME="D"></INSTANCENAME></VALUE.REFERENCE>)"
      R"(</KEYBINDING></INSTANCENAME>)");
}

TEST(XmlInstance, NamesTheTypeOfEachProperty) {
  EXPECT_EQ(instanceElement({"P", Value::text("a<b"), nullptr}),
            R"(<INSTANCE CLASSNAME="C"><PROPERTY NAME="P" TYPE="string"><VALUE>a&lt;b</VALUE></PROPERTY></INSTANCE>)");
  EXPECT_EQ(instanceElement({"P", Value::null(schema::Type::Uint8), nullptr}),
            R"(<INSTANCE CLASSNAME="C"><PROPERTY NAME="P" TYPE="uint8"></PROPERTY></INSTANCE>)");
  EXPECT_EQ(instanceElement({"P", Value::null(schema::Type::String, true), nullptr}),
            R"(<INSTANCE CLASSNAME="C"><PROPERTY.ARRAY NAME="P" TYPE="string"></PROPERTY.ARRAY></INSTANCE>)");
}

TEST(XmlInstance, WritesTheClassOfAReferenceAndTheOriginOfAProperty) {
  const auto classes = std::make_unique<schema::ClassRepository>();
  schema::ClassProperty declaration;
  declaration.referenceClass = "D";
  EXPECT_EQ(instanceElement({"R", Value::reference({"", "", "E", {}}), &declaration}),
            R"(<INSTANCE CLASSNAME="C"><PROPERTY.REFERENCE NAME="R" REFERENCECLASS="D"><VALUE.REFERENCE>)"
            R"(<INSTANCENAME CLASSNAME="E"></INSTANCENAME></VALUE.REFERENCE></PROPERTY.REFERENCE></INSTANCE>)");

  schema::ClassDeclaration base;
  base.name = "Base";
  base.properties.emplace_back().name = "P";
  ASSERT_TRUE(classes->add(base));
  const schema::ClassProperty* known = classes->find("Base")->findProperty("P");
  EXPECT_EQ(
      instanceElement({"P", Value::text("v"), known}, true),
      R"(<INSTANCE CLASSNAME="C"><PROPERTY NAME="P" TYPE="string" CLASSORIGIN="Base"><VALUE>v</VALUE></PROPERTY></INSTANCE>)");
}

TEST(XmlInstance, WritesTheQualifiersOfItsClassAndProperties) {
  schema::ClassRepository classes;
  schema::QualifierType type;
  type.name = "Q";
  type.scope = schema::ScopeAny;
  ASSERT_TRUE(classes.add(type));
  schema::ClassDeclaration base;
  base.name = "Base";
  base.properties.emplace_back().name = "P";
  base.properties.back().qualifiers.emplace_back().name = "q";
  ASSERT_TRUE(classes.add(base));
  schema::ClassDeclaration derived;
  derived.name = "C";
  derived.superclass = "Base";
  derived.qualifiers.emplace_back().name = "Q";
  ASSERT_TRUE(classes.add(derived));
  Instance instance;
  instance.path.className = "C";
  instance.declaration = classes.find("C");
  instance.properties.push_back({"P", Value::text("v"), instance.declaration->findProperty("P")});
  std::string out;
  appendInstance(out, instance, {false, &classes});
  EXPECT_EQ(
      out,
      R"(<INSTANCE CLASSNAME="C"><QUALIFIER NAME="Q" TYPE="boolean"><VALUE>TRUE</VALUE></QUALIFIER>)"
      R"(<PROPERTY NAME="P" TYPE="string"><QUALIFIER NAME="Q" TYPE="boolean" PROPAGATED="true"><VALUE>TRUE</VALUE>)"
      R"(</QUALIFIER><VALUE>v</VALUE></PROPERTY></INSTANCE>)");
}

TEST(XmlInstance, IsTheSameAfterAnyOther) {
  const auto classes = std::make_shared<schema::ClassRepository>();
  schema::RepositorySink sink(*classes);
  ASSERT_TRUE(schema::parseMof("class A { string Name; uint16 State; string List[]; }; class B : A { string More; };",
                               "t.mof", sink));
  const schema::Class& a = *classes->find("A");
  const schema::Class& b = *classes->find("B");
  const auto instance = [](const schema::Class& declared, std::vector<std::pair<const char*, Value>> properties) {
    Instance made;
    made.path.className = declared.name();
    made.declaration = &declared;
    for (auto& [name, value] : properties)
      made.properties.push_back({name, std::move(value), declared.findProperty(name)});
    return made;
  };
  const Value none = Value::null(schema::Type::String);
  const Value state = Value::unsignedNumber(2, schema::Type::Uint16);
  const std::vector<Instance> instances = {
      instance(a, {{"Name", Value::text("eth0")}, {"State", state}, {"List", Value::textArray({"x"})}}),
      instance(a, {{"Name", none}, {"State", state}, {"List", Value::null(schema::Type::String, true)}}),
      instance(a, {{"State", state}, {"Name", Value::text("<&>")}}),
      instance(a, {{"State", state}}),
      instance(b, {{"State", state}}),
      instance(b, {{"State", state}, {"More", none}, {"NoSuch", Value::text("1")}}),
      instance(b, {{"State", state}, {"More", none}, {"Other", Value::text("2")}}),
      instance(b, {{"More", embedded("C")}}),
      instance(b, {{"More", Value::text("plain")}}),
      instance(a, {}),
  };
  for (const InstanceDetail& detail : {InstanceDetail(), InstanceDetail{true, classes.get()}}) {
    InstanceWriter writer(detail);
    for (const Instance& before : instances) {
      for (const Instance& after : instances) {
        std::string alone;
        std::string second;
        appendInstance(alone, after, detail);
        writer.append(second, before);
        second.clear();
        writer.append(second, after);
        EXPECT_EQ(second, alone);
      }
    }
  }
}

TEST(XmlMethod, WritesWhatItGaveBack) {
  std::string out;
  appendReturnValue(out, Value::unsignedNumber(0, schema::Type::Uint32));
  appendParameter(out, {"Job", Value::reference({"", "", "J", {}})});
  appendParameter(out, {"Text", Value::null(schema::Type::String)});
  EXPECT_EQ(out, R"(<RETURNVALUE PARAMTYPE="uint32"><VALUE>0</VALUE></RETURNVALUE><PARAMVALUE NAME="Job" )"
                 R"(PARAMTYPE="reference"><VALUE.REFERENCE><INSTANCENAME CLASSNAME="J"></INSTANCENAME>)"
                 R"(</VALUE.REFERENCE></PARAMVALUE><PARAMVALUE NAME="Text" PARAMTYPE="string"></PARAMVALUE>)");
}

TEST(XmlInstance, HoldsAnEmbeddedInstanceAsItsText) {
  EXPECT_EQ(instanceElement({"E", embedded("I"), nullptr}),
            R"(<INSTANCE CLASSNAME="C"><PROPERTY NAME="E" TYPE="string" EmbeddedObject="instance"><VALUE>)"
            R"(&lt;INSTANCE CLASSNAME=&quot;I&quot;&gt;&lt;/INSTANCE&gt;</VALUE></PROPERTY></INSTANCE>)");
}

}  // namespace
}  // namespace zorva::cimxml
