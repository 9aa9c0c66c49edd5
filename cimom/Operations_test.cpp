// Each operation as a client sees it: the request as XML, and the response as XML. Every response is validated.

#include "cimom/Operations.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimom/testing/ServiceHarness.h"

namespace zorva::cimom {
namespace {

using testing::className;
using ::testing::Contains;
using ::testing::HasSubstr;
using testing::instanceName;
using testing::names;
using ::testing::Not;
using testing::parameter;
using testing::text;

/// How often a piece occurs in a text.
std::size_t count(const std::string& all, const std::string& piece) {
  std::size_t found = 0;
  for (std::size_t at = all.find(piece); at != std::string::npos; at = all.find(piece, at + 1)) ++found;
  return found;
}

class OperationsTest : public ::testing::Test {
 protected:
  std::string ask(const std::string& operation, const std::string& parameters,
                  const std::string& nameSpace = "root/cimv2") {
    return service_.ask(operation, parameters, nameSpace);
  }

  /// The status of an operation that fails, and its description: "6 there is no …".
  std::string errorOf(const std::string& operation, const std::string& parameters,
                      const std::string& nameSpace = "root/cimv2") {
    const std::string response = ask(operation, parameters, nameSpace);
    const std::size_t code = response.find("<ERROR CODE=\"");
    const std::size_t description = response.find("DESCRIPTION=\"");
    EXPECT_NE(code, std::string::npos) << response;
    EXPECT_NE(description, std::string::npos) << response;
    if (code == std::string::npos || description == std::string::npos) return "no error";
    const auto until = [&](std::size_t from) { return response.substr(from, response.find('"', from) - from); };
    return until(code + 13) + " " + until(description + 13);
  }

  static std::string thing(const std::string& name) { return instanceName("T_Thing", {{"Name", name}}); }

  std::string invoke(const std::string& method, const std::string& instance, const std::string& parameters) {
    http::HttpRequest asked = testing::post(
        testing::message(testing::extrinsic(method, instance, parameters)),
        {{"CIMOperation", "MethodCall"}, {"CIMMethod", method}, {"CIMObject", "root/cimv2:T_Thing.Name=\"a\""}});
    const testing::CollectingSink sink = service_.ask(asked);
    EXPECT_EQ(sink.status, 200) << sink.body;
    return sink.body;
  }

  testing::TestService service_;
};

// Instances.

TEST_F(OperationsTest, EnumerateInstanceNamesGivesNamesAlone) {
  const std::string response = ask("EnumerateInstanceNames", className("ClassName", "t_thing"));
  EXPECT_EQ(count(response, "<INSTANCENAME "), 3U);
  EXPECT_THAT(response, HasSubstr("<IMETHODRESPONSE NAME=\"EnumerateInstanceNames\"><IRETURNVALUE><INSTANCENAME "
                                  "CLASSNAME=\"T_Thing\"><KEYBINDING NAME=\"Name\"><KEYVALUE VALUETYPE=\"string\" "
                                  "TYPE=\"string\">a</KEYVALUE></KEYBINDING></INSTANCENAME>"));
}

TEST_F(OperationsTest, EnumerateInstancesGivesNamedInstances) {
  const std::string response =
      ask("EnumerateInstances", className("ClassName", "T_Thing") + text("LocalOnly", "false"));
  EXPECT_EQ(count(response, "<VALUE.NAMEDINSTANCE>"), 3U);
  EXPECT_EQ(count(response, "NAME=\"Extra\""), 1U);
  EXPECT_THAT(response, HasSubstr("<PROPERTY NAME=\"Size\" TYPE=\"uint16\"><VALUE>7</VALUE></PROPERTY>"));
  EXPECT_THAT(response, Not(HasSubstr("CLASSORIGIN")));
  EXPECT_THAT(response, Not(HasSubstr("<QUALIFIER")));
}

TEST_F(OperationsTest, LocalOnlyCountsAsFalseWhateverIsSent) {
  for (const std::string& localOnly : {std::string(), text("LocalOnly", "true"), text("LocalOnly", "false")}) {
    SCOPED_TRACE(localOnly);
    for (const std::string& response : {ask("EnumerateInstances", className("ClassName", "T_Thing") + localOnly),
                                        ask("GetInstance", parameter("InstanceName", thing("a")) + localOnly)}) {
      EXPECT_THAT(response, HasSubstr("<PROPERTY NAME=\"Name\"")) << "inherited from T_Base";
      EXPECT_THAT(response, HasSubstr("<PROPERTY NAME=\"Size\""));
    }
  }
}

TEST_F(OperationsTest, WithoutDeepInheritanceThereAreNoPropertiesOfSubclasses) {
  const std::string response =
      ask("EnumerateInstances",
          className("ClassName", "T_Thing") + text("DeepInheritance", "false") + text("LocalOnly", "false"));
  EXPECT_EQ(count(response, "<VALUE.NAMEDINSTANCE>"), 3U);
  EXPECT_THAT(response, Not(HasSubstr("Extra")));
}

TEST_F(OperationsTest, APropertyListNamesWhatIsGiven) {
  const std::string all = text("LocalOnly", "false");
  const std::string one =
      ask("EnumerateInstances", className("ClassName", "T_Thing") + all + names("PropertyList", {"SIZE", "NoSuch"}));
  EXPECT_EQ(count(one, "<PROPERTY"), 3U);
  EXPECT_EQ(count(one, "NAME=\"Size\""), 3U);
  const std::string none =
      ask("EnumerateInstances", className("ClassName", "T_Thing") + all + names("PropertyList", {}));
  EXPECT_EQ(count(none, "<PROPERTY"), 0U);
  EXPECT_EQ(count(none, "<KEYVALUE"), 3U);
}

TEST_F(OperationsTest, QualifiersAndClassOriginsAreReturnedOnRequest) {
  const std::string response =
      ask("GetInstance", parameter("InstanceName", thing("a")) + text("LocalOnly", "false") +
                             text("IncludeQualifiers", "true") + text("IncludeClassOrigin", "true"));
  EXPECT_THAT(response, HasSubstr("<INSTANCE CLASSNAME=\"T_Thing\"><QUALIFIER NAME=\"Description\""));
  EXPECT_THAT(response, HasSubstr("<PROPERTY NAME=\"Name\" TYPE=\"string\" CLASSORIGIN=\"T_Base\"><QUALIFIER "
                                  "NAME=\"Key\" TYPE=\"boolean\" PROPAGATED=\"true\""));
}

TEST_F(OperationsTest, GetInstanceTakesAKeyWithoutAName) {
  const std::string response =
      ask("GetInstance",
          parameter("InstanceName", R"(<INSTANCENAME CLASSNAME="T_Thing"><KEYVALUE>b</KEYVALUE></INSTANCENAME>)"));
  EXPECT_THAT(response, HasSubstr("<IRETURNVALUE><INSTANCE CLASSNAME=\"T_Thing\">"));
  EXPECT_THAT(
      errorOf("GetInstance",
              parameter("InstanceName", R"(<INSTANCENAME CLASSNAME="T_Two"><KEYVALUE>b</KEYVALUE></INSTANCENAME>)")),
      HasSubstr("4 T_Two has 2 keys"));
}

TEST_F(OperationsTest, GetInstanceReportsWhyThereIsNone) {
  EXPECT_THAT(errorOf("GetInstance", parameter("InstanceName", thing("zz"))), HasSubstr("6 there is no instance"));
  EXPECT_THAT(errorOf("GetInstance", parameter("InstanceName", instanceName("T_None", {}))),
              HasSubstr("5 there is no class"));
  EXPECT_THAT(errorOf("GetInstance", parameter("InstanceName", instanceName("T_Thing", {{"No", "x"}}))),
              HasSubstr("4 T_Thing has no key No"));
  EXPECT_THAT(errorOf("GetInstance", parameter("InstanceName", instanceName("T_Unserved", {{"Name", "x"}}))),
              HasSubstr("7 no provider serves T_Unserved"));
  EXPECT_THAT(errorOf("GetInstance", parameter("InstanceName", instanceName("T_Absent", {{"Name", "x"}}))),
              HasSubstr("1 "));
}

TEST_F(OperationsTest, CreateInstanceGivesTheNameOfWhatWasMade) {
  const std::string response = ask(
      "CreateInstance", parameter("NewInstance", R"(<INSTANCE CLASSNAME="T_Thing"><PROPERTY NAME="Name" TYPE="string">)"
                                                 R"(<VALUE>new</VALUE></PROPERTY></INSTANCE>)"));
  EXPECT_THAT(response, HasSubstr("<IRETURNVALUE><INSTANCENAME CLASSNAME=\"T_Thing\">"));
  EXPECT_THAT(response, HasSubstr("new-made"));
}

TEST_F(OperationsTest, ModifyInstancePassesTheChangesOn) {
  const std::string modified =
      "<VALUE.NAMEDINSTANCE>" + thing("a") +
      R"(<INSTANCE CLASSNAME="T_Thing"><PROPERTY NAME="Size" TYPE="uint16"><VALUE>9</VALUE></PROPERTY></INSTANCE>)"
      "</VALUE.NAMEDINSTANCE>";
  const std::string response =
      ask("ModifyInstance", parameter("ModifiedInstance", modified) + text("IncludeQualifiers", "false") +
                                names("PropertyList", {"size"}));
  EXPECT_THAT(response, HasSubstr("<IMETHODRESPONSE NAME=\"ModifyInstance\"></IMETHODRESPONSE>"));
  EXPECT_THAT(service_.lines(), Contains("ModifyInstance root/cimv2:T_Thing.Name [Size] Size 9 Labels x y"));
}

TEST_F(OperationsTest, ModifyInstanceRefusesValuesAndPropertiesThatDoNotFit) {
  const auto modify = [&](const std::string& property) {
    return errorOf("ModifyInstance", parameter("ModifiedInstance", "<VALUE.NAMEDINSTANCE>" + thing("a") +
                                                                       "<INSTANCE CLASSNAME=\"T_Thing\">" + property +
                                                                       "</INSTANCE></VALUE.NAMEDINSTANCE>"));
  };
  EXPECT_THAT(modify(R"(<PROPERTY NAME="Size" TYPE="uint16"><VALUE>70000</VALUE></PROPERTY>)"),
              HasSubstr("13 T_Thing.Size: 70000 is no uint16"));
  EXPECT_THAT(modify(R"(<PROPERTY NAME="Nope" TYPE="uint16"/>)"), HasSubstr("12 T_Thing has no property Nope"));
}

TEST_F(OperationsTest, ModifyInstanceFailsIfNothingWasStored) {
  const std::string modified =
      "<VALUE.NAMEDINSTANCE>" + thing("stubborn") +
      R"(<INSTANCE CLASSNAME="T_Thing"><PROPERTY NAME="Size" TYPE="uint16"><VALUE>9</VALUE></PROPERTY></INSTANCE>)"
      "</VALUE.NAMEDINSTANCE>";
  EXPECT_EQ(errorOf("ModifyInstance", parameter("ModifiedInstance", modified)),
            "1 Size was not stored: the provider took it and still says otherwise");
  EXPECT_EQ(errorOf("SetProperty", parameter("InstanceName", thing("stubborn")) + text("PropertyName", "Size") +
                                       text("NewValue", "9")),
            "1 Size was not stored: the provider took it and still says otherwise");
}

TEST_F(OperationsTest, AnInstanceHasAPropertyElementForEachProperty) {
  const std::string response = ask("GetInstance", parameter("InstanceName", thing("a")) + text("LocalOnly", "false"));
  EXPECT_THAT(response, HasSubstr("<PROPERTY NAME=\"Tiny\" TYPE=\"uint8\"></PROPERTY>"));
  EXPECT_THAT(response, HasSubstr("<PROPERTY.ARRAY NAME=\"Numbers\" TYPE=\"uint16\"></PROPERTY.ARRAY>"));
  EXPECT_EQ(count(response, "<PROPERTY"), 17U);
}

TEST_F(OperationsTest, DeleteInstanceDeletes) {
  EXPECT_THAT(ask("DeleteInstance", parameter("InstanceName", thing("a"))),
              HasSubstr("<IMETHODRESPONSE NAME=\"DeleteInstance\"></IMETHODRESPONSE>"));
  EXPECT_EQ(errorOf("DeleteInstance", parameter("InstanceName", thing("b"))), "6 no such thing");
}

TEST_F(OperationsTest, GetPropertyGivesOneValue) {
  const std::string instance = parameter("InstanceName", thing("a"));
  EXPECT_THAT(ask("GetProperty", instance + text("PropertyName", "size")),
              HasSubstr("<IRETURNVALUE><VALUE>7</VALUE></IRETURNVALUE>"));
  EXPECT_THAT(ask("GetProperty", instance + text("PropertyName", "Labels")),
              HasSubstr("<IRETURNVALUE><VALUE.ARRAY><VALUE>x</VALUE><VALUE>y</VALUE></VALUE.ARRAY></IRETURNVALUE>"));
  EXPECT_THAT(ask("GetProperty", instance + text("PropertyName", "Huge")),
              HasSubstr("<IMETHODRESPONSE NAME=\"GetProperty\"></IMETHODRESPONSE>"));
  EXPECT_THAT(errorOf("GetProperty", instance + text("PropertyName", "Nope")), HasSubstr("12 T_Thing has no property"));
  EXPECT_THAT(errorOf("GetProperty", instance), HasSubstr("4 GetProperty: the parameter PropertyName is missing"));
}

TEST_F(OperationsTest, SetPropertyChangesOneProperty) {
  const std::string what = parameter("InstanceName", thing("a")) + text("PropertyName", "Size");
  EXPECT_THAT(ask("SetProperty", what + text("NewValue", "12")),
              HasSubstr("<IMETHODRESPONSE NAME=\"SetProperty\"></IMETHODRESPONSE>"));
  EXPECT_THAT(service_.lines(), Contains("ModifyInstance root/cimv2:T_Thing.Name [Size] Size 12 Labels x y"));
  ask("SetProperty", what);
  EXPECT_THAT(service_.lines(), Contains("ModifyInstance root/cimv2:T_Thing.Name [Size] Size null Labels x y"));
  EXPECT_THAT(errorOf("SetProperty", what + text("NewValue", "many")), HasSubstr("13 T_Thing.Size"));
}

TEST_F(OperationsTest, TextsWithControlCharactersReachNoProvider) {
  const std::string modified = "<VALUE.NAMEDINSTANCE>" + thing("a") +
                               "<INSTANCE CLASSNAME=\"T_Thing\"><PROPERTY.ARRAY NAME=\"Labels\" "
                               "TYPE=\"string\"><VALUE.ARRAY><VALUE>x&#10;CONFIG=y"
                               "</VALUE></VALUE.ARRAY></PROPERTY.ARRAY></INSTANCE></VALUE.NAMEDINSTANCE>";
  EXPECT_THAT(errorOf("ModifyInstance", parameter("ModifiedInstance", modified)),
              HasSubstr("4 the property Labels has the control character U+000A"));
  EXPECT_THAT(errorOf("SetProperty", parameter("InstanceName", thing("a")) + text("PropertyName", "Labels") +
                                         names("NewValue", {"x&#13;"})),
              HasSubstr("4 the property Labels has the control character U+000D"));
  EXPECT_THAT(
      invoke("Echo", thing("a"), "<PARAMVALUE NAME=\"Text\" PARAMTYPE=\"string\"><VALUE>a&#127;</VALUE></PARAMVALUE>"),
      HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"the parameter Text has the control character U+007F"));
  EXPECT_THAT(service_.lines(), Not(Contains(HasSubstr("ModifyInstance root/cimv2:T_Thing"))));
}

// Associations.

TEST_F(OperationsTest, AssociatorsGivesInstancesWithTheirWholePaths) {
  const std::string response = ask("Associators", parameter("ObjectName", thing("a")));
  EXPECT_EQ(count(response, "<VALUE.OBJECTWITHPATH><INSTANCEPATH>"), 1U);
  EXPECT_THAT(response, HasSubstr("<NAMESPACEPATH><HOST>this</HOST>"));
  EXPECT_THAT(ask("AssociatorNames", parameter("ObjectName", thing("a"))),
              HasSubstr("<IRETURNVALUE><OBJECTPATH><INSTANCEPATH><NAMESPACEPATH><HOST>this</HOST>"));
}

TEST_F(OperationsTest, ReferencesGivesTheAssociations) {
  EXPECT_THAT(ask("References", parameter("ObjectName", thing("a"))),
              HasSubstr("<INSTANCE CLASSNAME=\"T_ThingOther\"><PROPERTY.REFERENCE NAME=\"Left\" REFERENCECLASS"));
  EXPECT_THAT(ask("ReferenceNames", parameter("ObjectName", thing("a"))),
              HasSubstr("<INSTANCENAME CLASSNAME=\"T_ThingOther\">"));
}

TEST_F(OperationsTest, AssociationsAreFiltered) {
  const std::string a = parameter("ObjectName", thing("a"));
  EXPECT_EQ(count(ask("AssociatorNames", a + className("AssocClass", "T_Link") + text("Role", "Left") +
                                             className("ResultClass", "T_Other") + text("ResultRole", "Right")),
                  "<OBJECTPATH>"),
            1U);
  EXPECT_EQ(count(ask("AssociatorNames", a + text("Role", "Right")), "<OBJECTPATH>"), 0U);
  EXPECT_EQ(count(ask("ReferenceNames", a + className("ResultClass", "T_ThingTrouble")), "<OBJECTPATH>"), 0U);
  EXPECT_THAT(errorOf("Associators", a + className("AssocClass", "T_None")),
              HasSubstr("4 AssocClass: there is no class"));
}

TEST_F(OperationsTest, AssociationsOfClassesComeFromTheSchema) {
  const std::string ofThing = parameter("ObjectName", "<CLASSNAME NAME=\"T_Thing\"/>");
  EXPECT_THAT(ask("AssociatorNames", ofThing),
              HasSubstr("<OBJECTPATH><CLASSPATH><NAMESPACEPATH><HOST>this</HOST><LOCALNAMESPACEPATH><NAMESPACE "
                        "NAME=\"root\"/><NAMESPACE NAME=\"cimv2\"/></LOCALNAMESPACEPATH></NAMESPACEPATH><CLASSNAME"));
  const std::string others = ask("Associators", ofThing + className("AssocClass", "T_ThingOther"));
  EXPECT_EQ(count(others, "<CLASS NAME="), 1U);
  EXPECT_THAT(others, HasSubstr("<CLASS NAME=\"T_Other\" SUPERCLASS=\"T_Base\">"));
  EXPECT_EQ(count(ask("ReferenceNames", ofThing + text("Role", "Left")), "<CLASSNAME"), 4U);
  EXPECT_EQ(count(ask("References", ofThing + className("ResultClass", "T_ThingAbsent")), "<CLASS "), 1U);
  EXPECT_THAT(errorOf("AssociatorNames", parameter("ObjectName", "<CLASSNAME NAME=\"No\"/>")),
              HasSubstr("4 ObjectName: there is no class"));
  EXPECT_THAT(errorOf("AssociatorNames", ofThing + className("ResultClass", "No")), HasSubstr("4 ResultClass"));
}

TEST_F(OperationsTest, AssociationsOfAnUnknownClassHaveAWrongParameter) {
  const std::string none = instanceName("T_None", {{"Name", "a"}});
  for (const char* operation : {"Associators", "AssociatorNames", "References", "ReferenceNames"}) {
    EXPECT_THAT(errorOf(operation, parameter("ObjectName", none)), HasSubstr("4 there is no class")) << operation;
    EXPECT_THAT(errorOf(operation, parameter("ObjectName", "<CLASSNAME NAME=\"T_None\"/>")),
                HasSubstr("4 ObjectName: there is no class"))
        << operation;
  }
  for (const char* operation : {"OpenAssociatorInstances", "OpenAssociatorInstancePaths", "OpenReferenceInstances",
                                "OpenReferenceInstancePaths"}) {
    EXPECT_THAT(errorOf(operation, parameter("InstanceName", none)), HasSubstr("4 there is no class")) << operation;
  }
}

// Classes.

TEST_F(OperationsTest, GetClassGivesTheClass) {
  const std::string response = ask("GetClass", className("ClassName", "t_SpecialThing") + text("LocalOnly", "false") +
                                                   text("IncludeClassOrigin", "true"));
  EXPECT_THAT(response, HasSubstr("<CLASS NAME=\"T_SpecialThing\" SUPERCLASS=\"T_Thing\">"));
  EXPECT_THAT(response, HasSubstr("CLASSORIGIN=\"T_Base\" PROPAGATED=\"true\""));
  EXPECT_THAT(response, HasSubstr("<METHOD NAME=\"Echo\""));
  EXPECT_EQ(count(ask("GetClass", className("ClassName", "T_SpecialThing")), "<PROPERTY"), 1U);
  EXPECT_THAT(ask("GetClass", className("ClassName", "T_Thing") + names("PropertyList", {"Size"}) +
                                  text("IncludeQualifiers", "false")),
              Not(HasSubstr("QUALIFIER")));
  EXPECT_THAT(errorOf("GetClass", className("ClassName", "T_None")), HasSubstr("6 there is no class"));
}

TEST_F(OperationsTest, EnumerateClassesGivesThoseBelow) {
  EXPECT_EQ(count(ask("EnumerateClassNames", ""), "<CLASSNAME"), 4U);
  EXPECT_EQ(count(ask("EnumerateClassNames", text("DeepInheritance", "true")), "<CLASSNAME"), 14U);
  EXPECT_EQ(count(ask("EnumerateClassNames", className("ClassName", "T_Thing")), "<CLASSNAME"), 1U);
  EXPECT_EQ(count(ask("EnumerateClassNames", className("ClassName", "T_Keyless")), "<CLASSNAME"), 0U);
  EXPECT_EQ(count(ask("EnumerateClasses", text("DeepInheritance", "true")), "<CLASS "), 14U);
  EXPECT_EQ(count(ask("EnumerateClasses", className("ClassName", "T_Base") + text("LocalOnly", "false")), "<CLASS "),
            6U);
  EXPECT_THAT(errorOf("EnumerateClasses", className("ClassName", "No")), HasSubstr("5 there is no class"));
}

TEST_F(OperationsTest, QualifierTypesCanBeRead) {
  EXPECT_THAT(ask("GetQualifier", text("QualifierName", "key")),
              HasSubstr("<IRETURNVALUE><QUALIFIER.DECLARATION NAME=\"Key\" TYPE=\"boolean\""));
  EXPECT_EQ(count(ask("EnumerateQualifiers", ""), "<QUALIFIER.DECLARATION"), 13U);
  EXPECT_THAT(errorOf("GetQualifier", text("QualifierName", "No")), HasSubstr("6 there is no qualifier type"));
}

// Methods.

TEST_F(OperationsTest, AMethodGivesItsValueAndItsOutput) {
  const std::string response = invoke("Echo", thing("a"),
                                      R"(<PARAMVALUE NAME="text" PARAMTYPE="string"><VALUE>hi</VALUE></PARAMVALUE>)"
                                      R"(<PARAMVALUE NAME="Times"><VALUE>3</VALUE></PARAMVALUE>)");
  EXPECT_THAT(response, HasSubstr("<METHODRESPONSE NAME=\"Echo\"><RETURNVALUE PARAMTYPE=\"uint32\"><VALUE>3</VALUE>"
                                  "</RETURNVALUE><PARAMVALUE NAME=\"Said\" PARAMTYPE=\"string\"><VALUE>hi</VALUE>"
                                  "</PARAMVALUE></METHODRESPONSE>"));
  EXPECT_THAT(invoke("Echo", thing("a"), ""), HasSubstr("<METHODRESPONSE NAME=\"Echo\"></METHODRESPONSE>"));
}

TEST_F(OperationsTest, AMethodCallThatIsWrongIsAnError) {
  EXPECT_THAT(invoke("Nope", thing("a"), ""), HasSubstr("<ERROR CODE=\"17\""));
  EXPECT_THAT(invoke("Echo", thing("a"), "<PARAMVALUE NAME=\"X\"/>"), HasSubstr("<ERROR CODE=\"4\""));
  EXPECT_THAT(invoke("Echo", thing("a"), "<PARAMVALUE NAME=\"Times\"><VALUE>x</VALUE></PARAMVALUE>"),
              HasSubstr("<ERROR CODE=\"4\""));
  EXPECT_THAT(invoke("Call", thing("a"), ""), HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"Call: the parameter Text"));
}

TEST_F(OperationsTest, ATypeThatAClientNamesIsTheDeclaredOne) {
  const auto echo = [&](const std::string& name, const std::string& type, const std::string& value) {
    return invoke("Echo", thing("a"),
                  "<PARAMVALUE NAME=\"" + name + "\" PARAMTYPE=\"" + type + "\">" + value + "</PARAMVALUE>");
  };
  const std::string five = "<VALUE>5</VALUE>";
  EXPECT_THAT(echo("text", "uint32", five),
              HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"Echo: the parameter Text is a string, but comes as a uint32"));
  EXPECT_THAT(echo("Times", "string", five), HasSubstr("<ERROR CODE=\"4\""));
  EXPECT_THAT(echo("Times", "uint32", five), HasSubstr("<ERROR CODE=\"4\""));
  EXPECT_THAT(echo("Target", "string", "<VALUE.REFERENCE>" + thing("a") + "</VALUE.REFERENCE>"),
              HasSubstr("<ERROR CODE=\"4\""));
  EXPECT_THAT(echo("Times", "uint16", five), Not(HasSubstr("<ERROR")));
  EXPECT_THAT(echo("Target", "reference", "<VALUE.REFERENCE>" + thing("a") + "</VALUE.REFERENCE>"),
              Not(HasSubstr("<ERROR")));
}

TEST_F(OperationsTest, AMethodOfAClassThatDoesNotExistIsNotFound) {
  const auto call = [&](const std::string& target, const std::string& method, const std::string& object) {
    const std::string content =
        "<SIMPLEREQ><METHODCALL NAME=\"" + method + "\">" + target + "</METHODCALL></SIMPLEREQ>";
    return service_
        .ask(testing::post(testing::message(content),
                           {{"CIMOperation", "MethodCall"}, {"CIMMethod", method}, {"CIMObject", object}}))
        .body;
  };
  const auto ofClass = [](const std::string& name) {
    return "<LOCALCLASSPATH>" + testing::localNamespace("root/cimv2") + "<CLASSNAME NAME=\"" + name +
           "\"/></LOCALCLASSPATH>";
  };
  EXPECT_THAT(call("<LOCALINSTANCEPATH>" + testing::localNamespace("root/cimv2") +
                       instanceName("T_None", {{"Name", "a"}}) + "</LOCALINSTANCEPATH>",
                   "Echo", "root/cimv2:T_None.Name=\"a\""),
              HasSubstr("<ERROR CODE=\"6\""));
  EXPECT_THAT(call(ofClass("T_None"), "Echo", "root/cimv2:T_None"), HasSubstr("<ERROR CODE=\"6\""));
  EXPECT_THAT(call(ofClass("T_Thing"), "Echo", "root/cimv2:T_Thing"),
              HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"Echo is a method of the instances"));
  EXPECT_THAT(call(ofClass("T_Thing"), "CallAll", "root/cimv2:T_Thing"), Not(HasSubstr("<ERROR")));
}

TEST_F(OperationsTest, AParameterThatIsThereTwiceIsAWrongOne) {
  const std::string name = className("ClassName", "T_Thing");
  EXPECT_EQ(errorOf("EnumerateInstanceNames", name + className("CLASSNAME", "T_Other")),
            "4 EnumerateInstanceNames: the parameter &quot;ClassName&quot; is there twice");
  const std::string text = "<PARAMVALUE NAME=\"Text\"><VALUE>x</VALUE></PARAMVALUE>";
  EXPECT_THAT(invoke("Echo", thing("a"), text + text),
              HasSubstr("<ERROR CODE=\"4\" DESCRIPTION=\"Echo: the parameter &quot;Text&quot; is there twice"));
}

// Changes.

TEST_F(OperationsTest, AChangeLeavesALineThatSaysWhoChangedWhat) {
  const auto modify = [&](const std::string& more) {
    ask("ModifyInstance", parameter("ModifiedInstance",
                                    "<VALUE.NAMEDINSTANCE>" + thing("a") +
                                        R"(<INSTANCE CLASSNAME="T_Thing"><PROPERTY NAME="Name" TYPE="string"><VALUE>a)"
                                        R"(</VALUE></PROPERTY><PROPERTY NAME="size" TYPE="uint16"><VALUE>9</VALUE>)"
                                        R"(</PROPERTY><PROPERTY.ARRAY NAME="Labels" TYPE="string"><VALUE.ARRAY>)"
                                        "<VALUE>z</VALUE></VALUE.ARRAY></PROPERTY.ARRAY>"
                                        "</INSTANCE></VALUE.NAMEDINSTANCE>") +
                              more);
  };
  modify("");
  modify("");  // it has this value already
  modify(names("PropertyList", {}));
  ask("SetProperty", parameter("InstanceName", thing("a")) + text("PropertyName", "size") + text("NewValue", "12"));
  invoke("Call", thing("a"), "<PARAMVALUE NAME=\"Text\"><VALUE>x</VALUE></PARAMVALUE>");
  ask("DeleteInstance", parameter("InstanceName", thing("a")));
  const std::string begin = "user=\"\" login=none from=\"192.0.2.1:4711 (user 7)\" operation=";
  const std::string object = " object=\"root/cimv2:T_Thing.Name=\\\"a\\\"\" ";
  EXPECT_THAT(service_.changes(),
              ::testing::ElementsAre(begin + "ModifyInstance" + object + "change=\"Size: 7 -> 9\" change=\"Labels: " +
                                         R"({\"x\", \"y\"} -> {\"z\"}" result="done")",
                                     begin + "SetProperty" + object + "change=\"Size: 9 -> 12\" result=\"done\"",
                                     begin + "Call" + object + R"(change="Text: \"x\"" result="done")",
                                     begin + "DeleteInstance" + object + "result=\"done\""));
}

TEST_F(OperationsTest, AChangeThatFailsLeavesALineWithTheReason) {
  errorOf("SetProperty", parameter("InstanceName", thing("a")) + text("PropertyName", "Size") + text("NewValue", "x"));
  errorOf("DeleteInstance", parameter("InstanceName", thing("b")));
  invoke("Echo", thing("a"), "<PARAMVALUE NAME=\"Times\"><VALUE>3</VALUE></PARAMVALUE>");  // it returns 3
  EXPECT_THAT(service_.changes(),
              ::testing::ElementsAre(HasSubstr("operation=SetProperty object=\"root/cimv2:T_Thing.Name=\\\"a\\\"\" "
                                               "result=\"CIM_ERR_TYPE_MISMATCH: "),
                                     HasSubstr("result=\"CIM_ERR_NOT_FOUND: "), HasSubstr("result=\"returned 3\"")));
}

TEST_F(OperationsTest, WhatReadsLeavesNoLine) {
  ask("EnumerateInstances", className("ClassName", "T_Thing"));
  ask("GetInstance", parameter("InstanceName", thing("b")));
  EXPECT_THAT(service_.changes(), ::testing::IsEmpty());
}

TEST_F(OperationsTest, AClientWritesNoLinesOfItsOwnIntoTheLineOfAChange) {
  const http::HttpRequest asked =
      testing::post(testing::message(testing::extrinsic("Call", thing("x&#10;2026 forged&#127;\" result=\"done"),
                                                        "<PARAMVALUE NAME=\"Text\"><VALUE>x</VALUE></PARAMVALUE>")),
                    {{"CIMOperation", "MethodCall"},
                     {"CIMMethod", "Call"},
                     {"CIMObject", "root/cimv2:T_Thing.Name=\"x%0A2026 forged%7F\\\" result=\\\"done\""}});
  EXPECT_EQ(service_.ask(asked).status, 200);
  ASSERT_THAT(service_.changes(), ::testing::SizeIs(1));
  EXPECT_THAT(service_.changes().front(),
              HasSubstr(R"(object="root/cimv2:T_Thing.Name=\"x\\n2026 forged\x7f\\\" result=)"));
}

// Errors.

TEST_F(OperationsTest, ParametersAreChecked) {
  const std::string ok = className("ClassName", "T_Thing");
  EXPECT_EQ(errorOf("EnumerateInstances", ""), "4 EnumerateInstances: the parameter ClassName is missing");
  EXPECT_EQ(errorOf("EnumerateInstances", ok + text("LocalOnly", "maybe")),
            "4 EnumerateInstances: the parameter LocalOnly must be TRUE or FALSE");
  EXPECT_EQ(errorOf("EnumerateInstances", ok + text("Colour", "red")), "4 EnumerateInstances has no parameter Colour");
  EXPECT_EQ(errorOf("EnumerateInstances", ok + text("PropertyList", "x")),
            "4 EnumerateInstances: the parameter PropertyList must be an array of texts");
  EXPECT_EQ(errorOf("GetInstance", className("InstanceName", "T_Thing")),
            "4 GetInstance: the parameter InstanceName must be the name of an instance");
  EXPECT_EQ(errorOf("Associators", text("ObjectName", "x")),
            "4 Associators: the parameter ObjectName must be the name of an instance or a class");
  EXPECT_EQ(errorOf("CreateInstance", text("NewInstance", "x")),
            "4 CreateInstance: the parameter NewInstance must be an instance");
}

TEST_F(OperationsTest, NamespacesAreChecked) {
  for (const char* operation :
       {"EnumerateClassNames", "EnumerateQualifiers", "EnumerateInstances", "CloseEnumeration"}) {
    EXPECT_EQ(errorOf(operation, "", "root/none"), "3 there is no namespace &quot;root/none&quot;");
  }
  EXPECT_EQ(count(ask("EnumerateInstanceNames", className("ClassName", "T_Other"), "ROOT/CIMv2"), "<INSTANCENAME"), 1U);
}

TEST_F(OperationsTest, WhatIsNotOfferedSaysSo) {
  for (const char* operation : {"ExecQuery", "CreateClass", "ModifyClass", "DeleteClass", "SetQualifier",
                                "DeleteQualifier", "OpenQueryInstances", "PullInstances"}) {
    EXPECT_THAT(errorOf(operation, ""), ::testing::StartsWith(std::string("7 ") + operation + ": "));
  }
  EXPECT_EQ(errorOf("MakeCoffee", ""), "7 there is no operation &quot;MakeCoffee&quot;");
}

TEST_F(OperationsTest, AProviderThatThrowsOrReturnsNothingCostsItsOwnRequestOnly) {
  const auto trouble = [&](const char* name) {
    return errorOf("GetInstance", parameter("InstanceName", instanceName("T_Trouble", {{"Name", name}})));
  };
  EXPECT_THAT(trouble("throw"),
              HasSubstr("1 Trouble (GetInstance of T_Trouble) threw an exception: thrown on purpose"));
  EXPECT_THAT(trouble("throw a number"), HasSubstr("threw an exception"));
  EXPECT_THAT(trouble("fail"), ::testing::StartsWith("2 "));
  EXPECT_EQ(trouble("error"), "11 told by an error");
  EXPECT_THAT(trouble("nothing"), HasSubstr("6 there is no instance"));
  EXPECT_THAT(errorOf("EnumerateInstances", className("ClassName", "T_Trouble")), HasSubstr("half way"));
  EXPECT_EQ(count(ask("EnumerateInstanceNames", className("ClassName", "T_Trouble")), "<INSTANCENAME"), 1U);
}

TEST_F(OperationsTest, PathsMayNameThisHostInAnyWay) {
  const auto at = [](const std::string& host) {
    return parameter("ObjectName", "<VALUE.REFERENCE><INSTANCEPATH><NAMESPACEPATH><HOST>" + host + "</HOST>" +
                                       testing::localNamespace("root/cimv2") + "</NAMESPACEPATH>" + thing("a") +
                                       "</INSTANCEPATH></VALUE.REFERENCE>");
  };
  for (const char* host : {"this", "THIS:5988", "localhost", "127.0.0.1:5988", "[::1]:5988", "this.example.org."}) {
    EXPECT_EQ(count(ask("AssociatorNames", at(host)), "<OBJECTPATH>"), 1U) << host;
  }
  EXPECT_THAT(errorOf("AssociatorNames", at("elsewhere.example.org")), HasSubstr("4 the path is of the host"));
}

}  // namespace
}  // namespace zorva::cimom
