#include "cimxml/ResponseReader.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "broker/objects/PathText.h"
#include "schema/Schema.h"

namespace zorva::cimxml {
namespace {

using broker::Value;
using ::testing::HasSubstr;
using ::testing::StartsWith;

const schema::ClassRepository& classes() {
  static const auto builtIn = schema::loadBuiltInClasses();
  return *builtIn;
}

std::string responseWith(const std::string& content) {
  return R"(<?xml version="1.0"?><CIM CIMVERSION="2.0" DTDVERSION="2.0"><MESSAGE ID="1" PROTOCOLVERSION="1.0">)"
         R"(<SIMPLERSP>)" +
         content + "</SIMPLERSP></MESSAGE></CIM>";
}

CimResponse read(const std::string& content) {
  return readResponse(responseWith("<IMETHODRESPONSE NAME=\"X\">" + content + "</IMETHODRESPONSE>"), classes()).value();
}

CimResponse results(const std::string& content) { return read("<IRETURNVALUE>" + content + "</IRETURNVALUE>"); }

std::string refusal(const std::string& text) {
  const auto response = readResponse(text, classes());
  return response ? std::string() : response.error().message;
}

TEST(ResponseReader, ReadsAnError) {
  const CimResponse response = read(R"(<ERROR CODE="6" DESCRIPTION="no &lt;such&gt;"/>)");
  EXPECT_EQ(response.status.rc, 6);
  EXPECT_EQ(response.status.message, "no <such>");
}

TEST(ResponseReader, TakesAnErrorWithoutACodeForAFailure) {
  EXPECT_EQ(read("<ERROR/>").status.rc, 1);
  EXPECT_EQ(read(R"(<ERROR CODE="0"/>)").status.rc, 1);
}

TEST(ResponseReader, KeepsWhatCameBeforeAnError) {
  const CimResponse response = read(R"(<ERROR CODE="1"/><IRETURNVALUE><INSTANCENAME CLASSNAME="C"/></IRETURNVALUE>)");
  EXPECT_EQ(response.status.rc, 1);
  EXPECT_EQ(response.paths.size(), 1U);
}

TEST(ResponseReader, ReadsNamesInEachForm) {
  const std::string name = R"(<INSTANCENAME CLASSNAME="C"><KEYBINDING NAME="K"><KEYVALUE>v</KEYVALUE></KEYBINDING>)"
                           "</INSTANCENAME>";
  const std::string nameSpace =
      R"(<LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="x"/></LOCALNAMESPACEPATH>)";
  const CimResponse response = results(name + "<LOCALINSTANCEPATH>" + nameSpace + name + "</LOCALINSTANCEPATH>" +
                                       "<OBJECTPATH><INSTANCEPATH><NAMESPACEPATH><HOST> h </HOST>" + nameSpace +
                                       "</NAMESPACEPATH>" + name + "</INSTANCEPATH></OBJECTPATH>");
  ASSERT_EQ(response.paths.size(), 3U);
  EXPECT_EQ(broker::pathText(response.paths[0]), R"(C.K="v")");
  EXPECT_EQ(broker::pathText(response.paths[1]), R"(root/x:C.K="v")");
  EXPECT_EQ(broker::pathText(response.paths[2]), R"(//h/root/x:C.K="v")");
}

TEST(ResponseReader, ReadsKeysOfEachKind) {
  const CimResponse response =
      results(R"(<INSTANCENAME CLASSNAME="C">)"
              R"(<KEYBINDING NAME="S"><KEYVALUE VALUETYPE="string"> a b </KEYVALUE></KEYBINDING>)"
              R"(<KEYBINDING NAME="B"><KEYVALUE VALUETYPE="boolean">true</KEYVALUE></KEYBINDING>)"
              R"(<KEYBINDING NAME="N"><KEYVALUE VALUETYPE="numeric">-7</KEYVALUE></KEYBINDING>)"
              R"(<KEYBINDING NAME="X"><KEYVALUE VALUETYPE="numeric">0x10</KEYVALUE></KEYBINDING>)"
              R"(<KEYBINDING NAME="T"><KEYVALUE VALUETYPE="numeric" TYPE="uint8">3</KEYVALUE></KEYBINDING>)"
              R"(<KEYBINDING NAME="R"><VALUE.REFERENCE><INSTANCENAME CLASSNAME="D"/></VALUE.REFERENCE></KEYBINDING>)"
              "</INSTANCENAME>");
  const broker::ObjectPath& path = response.paths.at(0);
  EXPECT_EQ(path.key("S")->asText(), " a b ");
  EXPECT_EQ(*path.key("B"), Value::boolean(true));
  EXPECT_EQ(*path.key("N"), Value::signedNumber(-7));
  EXPECT_EQ(*path.key("X"), Value::unsignedNumber(16));
  EXPECT_EQ(*path.key("T"), Value::unsignedNumber(3, schema::Type::Uint8));
  EXPECT_EQ(*path.key("R"), Value::reference({"", "", "D", {}}));
}

TEST(ResponseReader, NamesTheOnlyKeyOfAClassThatComesWithoutItsName) {
  const CimResponse response =
      results(R"(<INSTANCENAME CLASSNAME="ZORVA_DNSSettingData"><KEYVALUE>x</KEYVALUE></INSTANCENAME>)");
  EXPECT_EQ(broker::pathText(response.paths.at(0)), R"(ZORVA_DNSSettingData.InstanceID="x")");
}

TEST(ResponseReader, ReadsPropertiesOfEachType) {
  const CimResponse response = results(
      R"(<VALUE.NAMEDINSTANCE><INSTANCENAME CLASSNAME="C"/><INSTANCE CLASSNAME="C">)"
      R"(<PROPERTY NAME="T" TYPE="string"><VALUE>a<![CDATA[<b>]]>&amp;</VALUE></PROPERTY>)"
      R"(<PROPERTY NAME="W" TYPE="string"><VALUE> </VALUE></PROPERTY>)"
      R"(<PROPERTY NAME="U" TYPE="uint64"><VALUE>18446744073709551615</VALUE></PROPERTY>)"
      R"(<PROPERTY NAME="I" TYPE="sint8"><VALUE> -1 </VALUE></PROPERTY>)"
      R"(<PROPERTY NAME="B" TYPE="boolean"><VALUE>TRUE</VALUE></PROPERTY>)"
      R"(<PROPERTY NAME="F" TYPE="real64"><VALUE>1.5E3</VALUE></PROPERTY>)"
      R"(<PROPERTY NAME="C" TYPE="char16"><VALUE>A</VALUE></PROPERTY>)"
      R"(<PROPERTY NAME="Z" TYPE="uint16"/>)"
      R"(<PROPERTY.ARRAY NAME="L" TYPE="uint16"><VALUE.ARRAY><VALUE>1</VALUE><VALUE.NULL/></VALUE.ARRAY>)"
      "</PROPERTY.ARRAY>"
      R"(<PROPERTY.ARRAY NAME="M" TYPE="string"/>)"
      R"(<PROPERTY.REFERENCE NAME="R"><VALUE.REFERENCE><LOCALINSTANCEPATH><LOCALNAMESPACEPATH><NAMESPACE NAME="n"/>)"
      R"(</LOCALNAMESPACEPATH><INSTANCENAME CLASSNAME="D"/></LOCALINSTANCEPATH></VALUE.REFERENCE></PROPERTY.REFERENCE>)"
      "</INSTANCE></VALUE.NAMEDINSTANCE>");
  const broker::Instance& instance = response.instances.at(0);
  EXPECT_EQ(instance.property("T")->asText(), "a<b>&");
  EXPECT_EQ(instance.property("W")->asText(), " ");
  EXPECT_EQ(*instance.property("U"), Value::unsignedNumber(18446744073709551615U));
  EXPECT_EQ(*instance.property("I"), Value::signedNumber(-1, schema::Type::Sint8));
  EXPECT_EQ(*instance.property("B"), Value::boolean(true));
  EXPECT_EQ(std::get<double>(instance.property("F")->scalar), 1500);
  EXPECT_EQ(std::get<char16_t>(instance.property("C")->scalar), u'A');
  EXPECT_EQ(*instance.property("Z"), Value::null(schema::Type::Uint16));
  EXPECT_EQ(*instance.property("L"),
            Value::array(schema::Type::Uint16, {broker::Scalar(std::uint64_t{1}), broker::Scalar()}));
  EXPECT_EQ(*instance.property("M"), Value::null(schema::Type::String, true));
  EXPECT_EQ(*instance.property("R"), Value::reference({"", "n", "D", {}}));
}

TEST(ResponseReader, RefersToTheDeclarationsOfClassesThatAreKnown) {
  const CimResponse response = results(
      R"(<INSTANCE CLASSNAME="zorva_dnsprotocolendpoint"><PROPERTY NAME="enabledstate" TYPE="uint16"><VALUE>2</VALUE>)"
      "</PROPERTY></INSTANCE>");
  EXPECT_EQ(response.instances.at(0).declaration->name(), "ZORVA_DNSProtocolEndPoint");
  EXPECT_EQ(response.instances.at(0).properties.at(0).declaration->name, "EnabledState");
}

TEST(ResponseReader, ReadsWhatAMethodGaveBack) {
  const CimResponse response =
      readResponse(
          responseWith(
              R"(<METHODRESPONSE NAME="M"><RETURNVALUE PARAMTYPE="uint32"><VALUE>4</VALUE></RETURNVALUE>)"
              R"(<PARAMVALUE NAME="O" PARAMTYPE="string"><VALUE.ARRAY><VALUE>x</VALUE></VALUE.ARRAY></PARAMVALUE>)"
              "</METHODRESPONSE>"),
          classes())
          .value();
  EXPECT_EQ(response.method.returnValue, Value::unsignedNumber(4, schema::Type::Uint32));
  ASSERT_EQ(response.method.output.size(), 1U);
  EXPECT_EQ(response.method.output[0].value, Value::textArray({"x"}));
}

TEST(ResponseReader, ReadsAClassAsFarAsAClientNeedsIt) {
  const CimResponse response = results(
      R"(<CLASS NAME="X_A" SUPERCLASS="CIM_Y"><QUALIFIER NAME="Association" TYPE="boolean"><VALUE>TRUE</VALUE>)"
      R"(</QUALIFIER><QUALIFIER NAME="Odd" TYPE="string"><VALUE>?</VALUE></QUALIFIER>)"
      R"(<PROPERTY.REFERENCE NAME="R" REFERENCECLASS="CIM_Z"><QUALIFIER NAME="Key" TYPE="boolean"><VALUE>TRUE</VALUE>)"
      R"(</QUALIFIER></PROPERTY.REFERENCE><PROPERTY.ARRAY NAME="L" TYPE="uint8"/>)"
      R"(<METHOD NAME="M" TYPE="uint32"><PARAMETER.ARRAY NAME="P" TYPE="string"/></METHOD></CLASS>)");
  const schema::ClassDeclaration& declared = response.classes.at(0);
  EXPECT_EQ(declared.name, "X_A");
  EXPECT_TRUE(schema::hasQualifier(declared.qualifiers, "Association"));
  EXPECT_EQ(declared.qualifiers.size(), 1U);
  EXPECT_EQ(declared.properties.at(0).referenceClass, "CIM_Z");
  EXPECT_TRUE(schema::hasQualifier(declared.properties.at(0).qualifiers, "Key"));
  EXPECT_TRUE(declared.properties.at(1).isArray);
  EXPECT_TRUE(declared.methods.at(0).parameters.at(0).isArray);
}

TEST(ResponseReader, PassesOverWhatItDoesNotKnow) {
  EXPECT_EQ(results(R"(<FROB X="1"><FOO/></FROB><INSTANCENAME CLASSNAME="C"><BAR/></INSTANCENAME>)").paths.size(), 1U);
}

TEST(ResponseReader, RefusesWhatIsNoResponse) {
  EXPECT_THAT(refusal("<html><body>404</body></html>"), HasSubstr("no element CIM/MESSAGE/SIMPLERSP"));
  EXPECT_THAT(refusal(responseWith("")), HasSubstr("neither an IMETHODRESPONSE nor a METHODRESPONSE"));
  for (const char* text : {"", "hello", "<CIM>", "<CIM><MESSAGE></CIM>", "<CIM>\xFF</CIM>", "<CIM>&evil;</CIM>",
                           "<!DOCTYPE CIM [<!ENTITY a \"b\">]><CIM>&a;</CIM>"}) {
    EXPECT_NE(refusal(text), "") << text;
  }
}

TEST(ResponseReader, RefusesValuesThatAreNotOfTheirType) {
  const auto property = [](const std::string& type, const std::string& value) {
    return responseWith(R"(<IMETHODRESPONSE NAME="X"><IRETURNVALUE><INSTANCE CLASSNAME="C"><PROPERTY NAME="P" TYPE=")" +
                        type + "\"><VALUE>" + value +
                        "</VALUE></PROPERTY></INSTANCE></IRETURNVALUE></IMETHODRESPONSE>");
  };
  EXPECT_THAT(refusal(property("uint16", "x")), HasSubstr("'x' in PROPERTY is no whole number"));
  EXPECT_THAT(refusal(property("uint16", "")), HasSubstr("is no whole number"));
  EXPECT_THAT(refusal(property("uint64", "-1")), HasSubstr("is no whole number"));
  EXPECT_THAT(refusal(property("sint64", "--1")), HasSubstr("is no whole number"));
  EXPECT_THAT(refusal(property("real32", "1,5")), HasSubstr("is no number"));
  EXPECT_THAT(refusal(property("frob", "1")), HasSubstr("'frob' is no CIM type"));
}

TEST(ResponseReader, RefusesPathsWithoutAClass) {
  EXPECT_THAT(refusal(responseWith("<IMETHODRESPONSE NAME=\"X\"><IRETURNVALUE><OBJECTPATH/></IRETURNVALUE>"
                                   "</IMETHODRESPONSE>")),
              HasSubstr("names no class"));
}

TEST(ResponseReader, RefusesADepthThatWouldExhaustTheStack) {
  std::string deep;
  std::string end;
  for (int i = 0; i < 100000; ++i) {
    deep += "<KEYBINDING>";
    end += "</KEYBINDING>";
  }
  EXPECT_THAT(refusal(responseWith(deep + end)), StartsWith("line 1, column "));
}

TEST(ResponseReader, EndsWhereverATextIsCut) {
  const std::string whole = responseWith(
      R"(<IMETHODRESPONSE NAME="X"><IRETURNVALUE><VALUE.OBJECTWITHPATH><INSTANCEPATH><NAMESPACEPATH><HOST>h</HOST>)"
      R"(<LOCALNAMESPACEPATH><NAMESPACE NAME="n"/></LOCALNAMESPACEPATH></NAMESPACEPATH><INSTANCENAME CLASSNAME="C"/>)"
      R"(</INSTANCEPATH><INSTANCE CLASSNAME="C"/></VALUE.OBJECTWITHPATH></IRETURNVALUE></IMETHODRESPONSE>)");
  EXPECT_EQ(refusal(whole), "");
  for (std::size_t length = 0; length < whole.size(); ++length)
    EXPECT_NE(refusal(whole.substr(0, length)), "") << length;
}

}  // namespace
}  // namespace zorva::cimxml
