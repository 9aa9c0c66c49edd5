// Who may use which operation in which namespace.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimom/testing/ServiceHarness.h"

namespace zorva::cimom {
namespace {

using access::Role;
using testing::className;
using ::testing::HasSubstr;
using testing::instanceName;
using ::testing::Not;
using testing::parameter;
using testing::text;

constexpr const char* kDenied = "<ERROR CODE=\"2\"";

struct Case {
  const char* operation;
  std::string parameters;
  Role needs;
};

std::string thing(const std::string& name = "a") { return instanceName("T_Thing", {{"Name", name}}); }

std::vector<Case> operations() {
  const std::string ofClass = className("ClassName", "T_Thing");
  const std::string ofInstance = parameter("InstanceName", thing());
  const std::string ofObject = parameter("ObjectName", thing());
  const std::string context = text("EnumerationContext", "x");
  const std::string instance = R"(<INSTANCE CLASSNAME="T_Thing"><PROPERTY NAME="Name" TYPE="string"><VALUE>n</VALUE>)"
                               R"(</PROPERTY></INSTANCE>)";
  const std::string named = "<VALUE.NAMEDINSTANCE>" + thing() + instance + "</VALUE.NAMEDINSTANCE>";
  return {
      {"EnumerateClasses", "", Role::Read},
      {"EnumerateClassNames", "", Role::Read},
      {"GetClass", ofClass, Role::Read},
      {"GetQualifier", text("QualifierName", "Key"), Role::Read},
      {"EnumerateQualifiers", "", Role::Read},
      {"EnumerateInstances", ofClass, Role::Read},
      {"EnumerateInstanceNames", ofClass, Role::Read},
      {"GetInstance", ofInstance, Role::Read},
      {"GetProperty", ofInstance + text("PropertyName", "Size"), Role::Read},
      {"Associators", ofObject, Role::Read},
      {"AssociatorNames", ofObject, Role::Read},
      {"References", ofObject, Role::Read},
      {"ReferenceNames", ofObject, Role::Read},
      {"OpenEnumerateInstances", ofClass, Role::Read},
      {"OpenEnumerateInstancePaths", ofClass, Role::Read},
      {"OpenAssociatorInstances", ofInstance, Role::Read},
      {"OpenAssociatorInstancePaths", ofInstance, Role::Read},
      {"OpenReferenceInstances", ofInstance, Role::Read},
      {"OpenReferenceInstancePaths", ofInstance, Role::Read},
      {"PullInstancesWithPath", context + text("MaxObjectCount", "1"), Role::Read},
      {"PullInstancePaths", context + text("MaxObjectCount", "1"), Role::Read},
      {"CloseEnumeration", context, Role::Read},
      {"EnumerationCount", context, Role::Read},
      {"CreateInstance", parameter("NewInstance", instance), Role::Operate},
      {"ModifyInstance", parameter("ModifiedInstance", named), Role::Operate},
      {"modifyinstance", parameter("ModifiedInstance", named), Role::Operate},
      {"SetProperty", ofInstance + text("PropertyName", "Size") + text("NewValue", "7"), Role::Operate},
      {"DeleteInstance", ofInstance, Role::Operate},
  };
}

access::ClientPtr client(const access::Grants& grants, const std::string& user = "alice") {
  return std::make_shared<const access::Client>(access::Client{user, access::Proof::Password, grants});
}

class Roles : public ::testing::Test {
 protected:
  std::string ask(const access::ClientPtr& who, const std::string& operation, const std::string& parameters,
                  const std::string& nameSpace = "root/cimv2") {
    http::HttpRequest asked = testing::request(operation, parameters, nameSpace);
    asked.who = who;
    return service_.ask(asked).body;
  }

  std::string invoke(const access::ClientPtr& who, const std::string& method) {
    http::HttpRequest asked = testing::post(
        testing::message(testing::extrinsic(method, thing(), "")),
        {{"CIMOperation", "MethodCall"}, {"CIMMethod", method}, {"CIMObject", "root/cimv2:T_Thing.Name=\"a\""}});
    asked.who = who;
    return service_.ask(asked).body;
  }

  testing::TestService service_;
};

TEST_F(Roles, EachOperationNeedsItsRole) {
  for (const Case& one : operations()) {
    for (const Role role : {Role::None, Role::Read, Role::Operate}) {
      SCOPED_TRACE(std::string(one.operation) + " with role " + std::to_string(static_cast<int>(role)));
      const std::string response = ask(client(access::Grants(role)), one.operation, one.parameters);
      if (role >= one.needs) {
        EXPECT_THAT(response, Not(HasSubstr(kDenied)));
      } else {
        EXPECT_THAT(response, HasSubstr(kDenied));
        EXPECT_THAT(response, Not(HasSubstr("T_Thing")));
      }
    }
  }
}

TEST_F(Roles, AMethodNeedsOperate) {
  EXPECT_THAT(invoke(client(access::Grants(Role::None)), "Echo"), HasSubstr(kDenied));
  EXPECT_THAT(invoke(client(access::Grants(Role::Read)), "Echo"), HasSubstr(kDenied));
  EXPECT_THAT(invoke(client(access::Grants(Role::Operate)), "Echo"), Not(HasSubstr("<ERROR")));
}

TEST_F(Roles, ARefusalSaysWhoMayNotDoWhat) {
  const std::string of = parameter("InstanceName", thing());
  EXPECT_THAT(ask(client(access::Grants(Role::Read)), "DeleteInstance", of),
              HasSubstr("alice may only read in root/cimv2"));
  EXPECT_THAT(ask(client(access::Grants(Role::Read), ""), "DeleteInstance", of),
              HasSubstr("a client without a login may only read in root/cimv2"));
  EXPECT_THAT(ask(client(access::Grants(Role::None)), "GetInstance", of),
              HasSubstr("alice may not use the namespace root/cimv2"));
}

TEST_F(Roles, ARoleMayDifferInANamespace) {
  access::Grants grants(Role::Read);
  grants.set("ROOT/cimv2", Role::Operate);
  grants.set("root/other", Role::None);
  const auto who = client(grants);
  EXPECT_THAT(ask(who, "DeleteInstance", parameter("InstanceName", thing())), Not(HasSubstr("<ERROR")));
  EXPECT_THAT(ask(who, "EnumerateClassNames", "", "root/other"), HasSubstr(kDenied));
  EXPECT_THAT(ask(who, "EnumerateClassNames", "", "/Root/OTHER/"), HasSubstr(kDenied));
}

TEST_F(Roles, EachOperationOfABatchIsChecked) {
  http::HttpRequest asked =
      testing::post(testing::message("<MULTIREQ>" + testing::intrinsic("EnumerateClassNames", "") +
                                     testing::intrinsic("DeleteInstance", parameter("InstanceName", thing())) +
                                     testing::intrinsic("EnumerateClassNames", "", "root/other") + "</MULTIREQ>"),
                    {{"CIMOperation", "MethodCall"}, {"CIMBatch", ""}});
  access::Grants grants(Role::Read);
  grants.set("root/other", Role::None);
  asked.who = client(grants);
  const std::string response = service_.ask(asked).body;
  EXPECT_THAT(response, HasSubstr("<IMETHODRESPONSE NAME=\"EnumerateClassNames\"><IRETURNVALUE><CLASSNAME"));
  EXPECT_THAT(response, HasSubstr("<IMETHODRESPONSE NAME=\"DeleteInstance\"><ERROR CODE=\"2\""));
  EXPECT_THAT(response, HasSubstr("<IMETHODRESPONSE NAME=\"EnumerateClassNames\"><ERROR CODE=\"2\""));
}

TEST_F(Roles, AssociationsDoNotLeadIntoANamespaceThatIsClosed) {
  access::Grants closed(Role::Read);
  closed.set("root/other", Role::None);
  const std::string object = parameter("ObjectName", thing("abroad"));
  const std::string instance = parameter("InstanceName", thing("abroad")) + text("MaxObjectCount", "10");
  for (const auto& [operation, of] :
       {std::pair("Associators", object), std::pair("AssociatorNames", object),
        std::pair("OpenAssociatorInstances", instance), std::pair("OpenAssociatorInstancePaths", instance)}) {
    SCOPED_TRACE(operation);
    EXPECT_THAT(ask(client(access::Grants(Role::Read)), operation, of), HasSubstr("T_Other"));
    const std::string response = ask(client(closed), operation, of);
    EXPECT_THAT(response, Not(HasSubstr("T_Other")));
    EXPECT_THAT(response, Not(HasSubstr("<ERROR")));
  }
}

}  // namespace
}  // namespace zorva::cimom
