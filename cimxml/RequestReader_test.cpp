#include "cimxml/RequestReader.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace zorva::cimxml {
namespace {

using ::testing::HasSubstr;
using ::testing::StartsWith;

constexpr const char* kNamespace =
    R"(<LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="cimv2"/></LOCALNAMESPACEPATH>)";

std::string message(const std::string& content) {
  return R"(<?xml version="1.0" encoding="utf-8"?><CIM CIMVERSION="2.0" DTDVERSION="2.0">)"
         R"(<MESSAGE ID="7" PROTOCOLVERSION="1.0">)" +
         content + "</MESSAGE></CIM>";
}

std::string intrinsic(const std::string& parameters, const std::string& name = "GetInstance") {
  return "<SIMPLEREQ><IMETHODCALL NAME=\"" + name + "\">" + kNamespace + parameters + "</IMETHODCALL></SIMPLEREQ>";
}

std::string parameter(const std::string& value) {
  return intrinsic("<IPARAMVALUE NAME=\"P\">" + value + "</IPARAMVALUE>");
}

std::string extrinsic(const std::string& parameters) {
  return "<SIMPLEREQ><METHODCALL NAME=\"M\"><LOCALINSTANCEPATH>" + std::string(kNamespace) +
         R"(<INSTANCENAME CLASSNAME="C"><KEYBINDING NAME="K"><KEYVALUE>k</KEYVALUE></KEYBINDING></INSTANCENAME>)"
         "</LOCALINSTANCEPATH>" +
         parameters + "</METHODCALL></SIMPLEREQ>";
}

CimRequest read(const std::string& text) {
  const auto request = readRequest(text, {});
  EXPECT_TRUE(request) << request.error().message;
  return request.value_or(CimRequest());
}

Call readCall(const std::string& content) {
  CimRequest request = read(message(content));
  return request.calls.empty() ? Call() : request.calls.front();
}

ParameterValue readParameter(const std::string& value) {
  const Call call = readCall(parameter(value));
  return call.parameters.empty() ? ParameterValue() : call.parameters.front().value;
}

RequestError errorOf(const std::string& text, const ReaderLimits& limits = {}) {
  const auto request = readRequest(text, limits);
  EXPECT_FALSE(request) << text;
  return request ? RequestError() : request.error();
}

TEST(RequestReader, ReadsAnIntrinsicCall) {
  const CimRequest request = read(message(parameter("<VALUE>TRUE</VALUE>")));
  EXPECT_EQ(request.id, "7");
  EXPECT_FALSE(request.isMultiple);
  ASSERT_EQ(request.calls.size(), 1U);
  EXPECT_FALSE(request.calls[0].isExtrinsic);
  EXPECT_EQ(request.calls[0].name, "GetInstance");
  EXPECT_EQ(request.calls[0].target.nameSpace, "root/cimv2");
  ASSERT_EQ(request.calls[0].parameters.size(), 1U);
  EXPECT_EQ(request.calls[0].parameters[0].name, "P");
  EXPECT_EQ(std::get<std::string>(request.calls[0].parameters[0].value), "TRUE");
}

TEST(RequestReader, ReadsEachKindOfParameter) {
  EXPECT_TRUE(std::holds_alternative<std::monostate>(readParameter("")));
  EXPECT_EQ(std::get<std::string>(readParameter("<VALUE> a <![CDATA[<b>]]>&amp;</VALUE>")), " a <b>&");
  EXPECT_EQ(std::get<std::string>(readParameter("<VALUE> </VALUE>")), " ");
  EXPECT_EQ(std::get<ClassName>(readParameter("<CLASSNAME NAME=\"CIM_X\"/>")).name, "CIM_X");
  const auto list = std::get<TextList>(readParameter("<VALUE.ARRAY><VALUE>a</VALUE><VALUE.NULL/></VALUE.ARRAY>"));
  EXPECT_EQ(list, (TextList{"a", std::nullopt}));
  EXPECT_TRUE(std::holds_alternative<Declaration>(readParameter("<CLASS NAME=\"X\"/>")));
  EXPECT_TRUE(
      std::holds_alternative<Declaration>(readParameter("<QUALIFIER.DECLARATION NAME=\"X\" TYPE=\"string\"/>")));
}

TEST(RequestReader, ReadsKeysWithAndWithoutTheirTypes) {
  const auto path = std::get<broker::ObjectPath>(readParameter(
      R"(<INSTANCENAME CLASSNAME="C"><KEYBINDING NAME="A"><KEYVALUE>a b</KEYVALUE></KEYBINDING>)"
      R"(<KEYBINDING NAME="B"><KEYVALUE VALUETYPE="numeric"> 12 </KEYVALUE></KEYBINDING>)"
      R"(<KEYBINDING NAME="C"><KEYVALUE VALUETYPE="boolean">true</KEYVALUE></KEYBINDING>)"
      R"(<KEYBINDING NAME="D"><KEYVALUE VALUETYPE="numeric" TYPE="uint8">0x1F</KEYVALUE></KEYBINDING>)"
      R"(<KEYBINDING NAME="E"><VALUE.REFERENCE><INSTANCENAME CLASSNAME="D"/></VALUE.REFERENCE></KEYBINDING>)"
      R"(</INSTANCENAME>)"));
  EXPECT_EQ(path.className, "C");
  EXPECT_EQ(*path.key("A"), broker::Value::text("a b"));
  EXPECT_EQ(path.key("B")->type, schema::Type::Uint64);
  EXPECT_EQ(std::get<std::string>(path.key("B")->scalar), "12");
  EXPECT_EQ(path.key("C")->type, schema::Type::Boolean);
  EXPECT_EQ(std::get<std::uint64_t>(path.key("D")->scalar), 31U);
  EXPECT_EQ(std::get<broker::Boxed<broker::ObjectPath>>(path.key("E")->scalar)->className, "D");
}

TEST(RequestReader, ReadsAnInstanceNameWithoutKeysOrWithOneThatHasNoName) {
  EXPECT_TRUE(std::get<broker::ObjectPath>(readParameter(R"(<INSTANCENAME CLASSNAME="C"/>)")).keys.empty());
  const auto path = std::get<broker::ObjectPath>(
      readParameter(R"(<INSTANCENAME CLASSNAME="C"><KEYVALUE TYPE="string">v</KEYVALUE></INSTANCENAME>)"));
  ASSERT_EQ(path.keys.size(), 1U);
  EXPECT_EQ(path.keys[0].name, "");
  EXPECT_EQ(path.keys[0].value, broker::Value::text("v"));
}

TEST(RequestReader, ReadsPathsOfOtherHosts) {
  const auto path = std::get<broker::ObjectPath>(
      readParameter(R"(<VALUE.REFERENCE><INSTANCEPATH><NAMESPACEPATH><HOST> h:5988 </HOST>)" + std::string(kNamespace) +
                    R"(</NAMESPACEPATH><INSTANCENAME CLASSNAME="C"/></INSTANCEPATH></VALUE.REFERENCE>)"));
  EXPECT_EQ(path, (broker::ObjectPath{"h:5988", "root/cimv2", "C", {}}));
}

TEST(RequestReader, ReadsInstances) {
  const auto instance = std::get<broker::Instance>(readParameter(
      R"(<INSTANCE CLASSNAME="C"><QUALIFIER NAME="Q" TYPE="boolean"/><PROPERTY NAME="A" TYPE="string">)"
      R"(<VALUE/></PROPERTY>)"
      R"(<PROPERTY NAME="B" TYPE="uint16"><VALUE> 5 </VALUE></PROPERTY><PROPERTY NAME="C" TYPE="string"></PROPERTY>)"
      R"(<PROPERTY.ARRAY NAME="D" TYPE="uint8"><VALUE.ARRAY><VALUE>1</VALUE><VALUE.NULL/></VALUE.ARRAY>)"
      R"(</PROPERTY.ARRAY>)"
      R"(<PROPERTY.REFERENCE NAME="E"><VALUE.REFERENCE><INSTANCENAME CLASSNAME="X"/></VALUE.REFERENCE>)"
      R"(</PROPERTY.REFERENCE><PROPERTY NAME="F" TYPE="char16"><VALUE>é</VALUE></PROPERTY></INSTANCE>)"));
  EXPECT_EQ(instance.path.className, "C");
  EXPECT_EQ(*instance.property("A"), broker::Value::text(""));
  EXPECT_EQ(std::get<std::string>(instance.property("B")->scalar), "5");
  EXPECT_TRUE(instance.property("C")->isNull);
  EXPECT_EQ(instance.property("D")->elements.size(), 2U);
  EXPECT_EQ(instance.property("E")->type, schema::Type::Reference);
  EXPECT_EQ(std::get<char16_t>(instance.property("F")->scalar), u'\u00E9');
}

TEST(RequestReader, ReadsAnInstanceEmbeddedInAValue) {
  const auto instance = std::get<broker::Instance>(readParameter(
      R"(<VALUE.NAMEDINSTANCE><INSTANCENAME CLASSNAME="c"><KEYBINDING NAME="K"><KEYVALUE>k</KEYVALUE></KEYBINDING>)"
      R"(</INSTANCENAME><INSTANCE CLASSNAME="C"><PROPERTY NAME="E" TYPE="string" EmbeddedObject="instance"><VALUE>)"
      R"(&lt;INSTANCE CLASSNAME=&quot;I&quot;>&lt;PROPERTY NAME="P" TYPE="string">&lt;VALUE>x&lt;/VALUE>&lt;/PROPERTY>)"
      R"(&lt;/INSTANCE></VALUE></PROPERTY></INSTANCE></VALUE.NAMEDINSTANCE>)"));
  EXPECT_EQ(instance.path.keys.size(), 1U);
  const auto& inner = std::get<broker::Boxed<broker::Instance>>(instance.property("E")->scalar);
  EXPECT_EQ(inner->path.className, "I");
  EXPECT_EQ(*inner->property("P"), broker::Value::text("x"));
}

TEST(RequestReader, ReadsAMethodCall) {
  const Call call = readCall(extrinsic(
      R"(<PARAMVALUE NAME="A" PARAMTYPE="uint16"><VALUE>2</VALUE></PARAMVALUE><PARAMVALUE NAME="B"/>)"
      R"(<PARAMVALUE NAME="C" PARAMTYPE="reference"><VALUE.REFERENCE><INSTANCENAME CLASSNAME="X"/></VALUE.REFERENCE>)"
      R"(</PARAMVALUE><PARAMVALUE NAME="D"><INSTANCE CLASSNAME="Y"/></PARAMVALUE>)"));
  EXPECT_TRUE(call.isExtrinsic);
  EXPECT_FALSE(call.onClass);
  EXPECT_EQ(call.name, "M");
  EXPECT_EQ(call.target, (broker::ObjectPath{"", "root/cimv2", "C", {{"K", broker::Value::text("k")}}}));
  ASSERT_EQ(call.input.size(), 4U);
  EXPECT_EQ(std::get<std::string>(call.input[0].value.scalar), "2");
  EXPECT_TRUE(call.input[1].value.isNull);
  EXPECT_EQ(call.input[2].value.type, schema::Type::Reference);
  EXPECT_EQ(std::get<broker::Boxed<broker::Instance>>(call.input[3].value.scalar)->path.className, "Y");
}

TEST(RequestReader, LeavesParametersThatAreThereTwiceToTheOperation) {
  EXPECT_EQ(read(message(intrinsic("<IPARAMVALUE NAME='a'/><IPARAMVALUE NAME='A'/>"))).calls[0].parameters.size(), 2U);
  EXPECT_EQ(read(message(extrinsic("<PARAMVALUE NAME='a'/><PARAMVALUE NAME='A'/>"))).calls[0].input.size(), 2U);
}

TEST(RequestReader, KeepsTheTypeThatTheClientGaveAParameter) {
  const CimRequest request =
      read(message(extrinsic("<PARAMVALUE NAME='a' PARAMTYPE='uint32'><VALUE>1</VALUE></PARAMVALUE>"
                             "<PARAMVALUE NAME='b'><VALUE>1</VALUE></PARAMVALUE>")));
  EXPECT_THAT(request.calls[0].saidTypes, ::testing::ElementsAre(schema::Type::Uint32, std::nullopt));
}

TEST(RequestReader, ReadsAMethodCallOnAClass) {
  const Call call = readCall("<SIMPLEREQ><METHODCALL NAME=\"M\"><LOCALCLASSPATH>" + std::string(kNamespace) +
                             "<CLASSNAME NAME=\"C\"/></LOCALCLASSPATH></METHODCALL></SIMPLEREQ>");
  EXPECT_TRUE(call.onClass);
  EXPECT_EQ(call.target.className, "C");
}

TEST(RequestReader, ReadsSeveralRequestsInOneMessage) {
  const CimRequest request = read(message("<MULTIREQ>" + intrinsic("", "A") + intrinsic("", "B") + "</MULTIREQ>"));
  EXPECT_TRUE(request.isMultiple);
  ASSERT_EQ(request.calls.size(), 2U);
  EXPECT_EQ(request.calls[1].name, "B");
  EXPECT_THAT(errorOf(message("<MULTIREQ>" + intrinsic("") + "</MULTIREQ>")).message, HasSubstr("fewer than two"));
  ReaderLimits limits;
  limits.calls = 2;
  EXPECT_THAT(
      errorOf(message("<MULTIREQ>" + intrinsic("") + intrinsic("") + intrinsic("") + "</MULTIREQ>"), limits).message,
      HasSubstr("more than 2 requests"));
}

TEST(RequestReader, PassesOverWhatTheDtdDoesNotKnow) {
  const Call call = readCall("<SIMPLEREQ NEW='1'><CORRELATOR/><IMETHODCALL NAME=\"N\" X='y'><EXTRA><VALUE/></EXTRA>" +
                             std::string(kNamespace) + "</IMETHODCALL></SIMPLEREQ>");
  EXPECT_EQ(call.name, "N");
}

TEST(RequestReader, ReportsWhereSomethingIsMissing) {
  const RequestError error = errorOf("<CIM CIMVERSION=\"2.0\" DTDVERSION=\"2.0\">\n  <MESSAGE ID=\"1\"/></CIM>");
  EXPECT_EQ(error.fault, Fault::NotLooselyValid);
  EXPECT_EQ(error.message, "line 2, column 4: MESSAGE lacks the attribute PROTOCOLVERSION");
}

TEST(RequestReader, RefusesWhatIsNotLooselyValid) {
  const std::pair<std::string, const char*> cases[] = {
      {"<X/>", "the root element is X"},
      {message(""), "MESSAGE has no SIMPLEREQ or MULTIREQ"},
      {message("<SIMPLEREQ/>"), "SIMPLEREQ has no IMETHODCALL or METHODCALL"},
      {message("<SIMPLEREQ><IMETHODCALL NAME='x'/></SIMPLEREQ>"), "IMETHODCALL has no LOCALNAMESPACEPATH"},
      {message("<SIMPLEREQ><IMETHODCALL NAME='x'><LOCALNAMESPACEPATH/></IMETHODCALL></SIMPLEREQ>"), "no namespace"},
      {message(parameter("<VALUE><VALUE/></VALUE>")), "VALUE within VALUE"},
      {message(parameter("<INSTANCENAME/>")), "INSTANCENAME lacks the attribute CLASSNAME"},
      {message(parameter("<INSTANCENAME CLASSNAME='C'><KEYBINDING NAME='K'/></INSTANCENAME>")), "KEYBINDING has no"},
      {message(parameter("<INSTANCENAME CLASSNAME='C'><KEYVALUE VALUETYPE='x'/></INSTANCENAME>")), "VALUETYPE is"},
      {message(parameter("<INSTANCENAME CLASSNAME='C'><KEYVALUE TYPE='uint7'/></INSTANCENAME>")), "is no CIM type"},
      {message(parameter("<VALUE.REFERENCE/>")), "VALUE.REFERENCE has no"},
      {message(parameter("<INSTANCE CLASSNAME='C'><PROPERTY NAME='A' TYPE='char16'><VALUE>ab</VALUE></PROPERTY>"
                         "</INSTANCE>")),
       "is no char16"},
      {message(parameter("<INSTANCE CLASSNAME='C'><PROPERTY NAME='A' TYPE='string'/><PROPERTY NAME='a' TYPE='string'/>"
                         "</INSTANCE>")),
       "is given twice"},
      {message(extrinsic("<PARAMVALUE NAME='a'><CLASS NAME='c'/></PARAMVALUE>")), "no value that a method takes"},
      {message(parameter("<VALUE.NAMEDINSTANCE><INSTANCENAME CLASSNAME='A'/><INSTANCE CLASSNAME='B'/>"
                         "</VALUE.NAMEDINSTANCE>")),
       "INSTANCENAME and INSTANCE are of the classes"},
      {message(extrinsic("<PARAMVALUE NAME='a' EmbeddedObject='instance'><VALUE>text</VALUE></PARAMVALUE>")),
       "in the embedded instance: "},
      {message(extrinsic("<PARAMVALUE NAME='a' EmbeddedObject='object'><VALUE>&lt;CLASS/></VALUE></PARAMVALUE>")),
       "where INSTANCE is taken"},
      {message(extrinsic("<PARAMVALUE NAME='a'><VALUE.ARRAY><X/></VALUE.ARRAY></PARAMVALUE>")), "X within VALUE.ARRAY"},
  };
  for (const auto& [text, problem] : cases) EXPECT_THAT(errorOf(text).message, HasSubstr(problem)) << text;
}

TEST(RequestReader, RefusesWhatIsNotWellFormed) {
  for (const char* text :
       {"", "hello", "<CIM>", "<CIM></CIN>", "<CIM a=b/>", "<CIM><A></CIM></A>", "<CIM a='1' a='2'/>"}) {
    EXPECT_EQ(errorOf(text).fault, Fault::NotWellFormed) << text;
  }
  EXPECT_THAT(errorOf("<CIM CIMVERSION='2.0'\n CIMVERSION='2.0'/>").message, HasSubstr("CIMVERSION twice"));
}

TEST(RequestReader, RefusesOtherVersions) {
  EXPECT_EQ(errorOf("<CIM CIMVERSION='3.0' DTDVERSION='2.0'/>").fault, Fault::UnsupportedCimVersion);
  EXPECT_EQ(errorOf("<CIM CIMVERSION='2.0' DTDVERSION='1.0'/>").fault, Fault::UnsupportedDtdVersion);
  EXPECT_EQ(errorOf("<CIM CIMVERSION='2.0' DTDVERSION='2.4'><MESSAGE ID='1' PROTOCOLVERSION='2.0'/></CIM>").fault,
            Fault::UnsupportedProtocolVersion);
  EXPECT_EQ(errorOf(message("<SIMPLEEXPREQ/>")).fault, Fault::UnsupportedOperation);
}

TEST(RequestReader, BoundsTheDepthOfEmbeddedInstances) {
  std::string inner = "x";
  for (int i = 0; i < 12; ++i) {
    std::string escaped;
    for (const char c : "<INSTANCE CLASSNAME='C'><PROPERTY NAME='P' TYPE='string' EmbeddedObject='instance'><VALUE>" +
                            inner + "</VALUE></PROPERTY></INSTANCE>") {
      if (c == '<') {
        escaped += "&lt;";
      } else if (c == '&') {
        escaped += "&amp;";
      } else {
        escaped += c;
      }
    }
    inner = std::move(escaped);
  }
  EXPECT_THAT(errorOf(message(extrinsic("<PARAMVALUE NAME='a' EmbeddedObject='instance'><VALUE>" + inner +
                                        "</VALUE></PARAMVALUE>")))
                  .message,
              HasSubstr("embedded deeper than 8"));
}

TEST(RequestReader, RefusesAMillionAttributesSoon) {
  std::string text = "<CIM";
  for (int i = 0; i < 100'000; ++i) text += " a" + std::to_string(i) + "=''";
  EXPECT_THAT(errorOf(text + "/>").message, HasSubstr("CIM has more than 32 attributes"));
}

}  // namespace
}  // namespace zorva::cimxml
