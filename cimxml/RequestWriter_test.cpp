#include "cimxml/RequestWriter.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cimxml/testing/Grammar.h"

namespace zorva::cimxml {
namespace {

using broker::ObjectPath;
using broker::Value;
using ::testing::HasSubstr;

ObjectPath path() {
  ObjectPath far{"h", "root/cimv2", "D", {{"Name", Value::text("a\"<")}}};
  return {"", "root/cimv2", "C", {{"K", Value::text("v&")}, {"R", Value::reference(std::move(far))}}};
}

std::string messageOf(IntrinsicCall call) { return call.message(); }

TEST(RequestWriter, LeavesOutWhatIsNotGiven) {
  IntrinsicCall call("Associators", "root/cimv2");
  call.className("AssocClass", "").text("Role", "").propertyList(std::nullopt);
  EXPECT_EQ(messageOf(std::move(call)),
            "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n"
            R"(<CIM CIMVERSION="2.0" DTDVERSION="2.3"><MESSAGE ID="1" PROTOCOLVERSION="1.0"><SIMPLEREQ>)"
            R"(<IMETHODCALL NAME="Associators"><LOCALNAMESPACEPATH><NAMESPACE NAME="root"/><NAMESPACE NAME="cimv2"/>)"
            "</LOCALNAMESPACEPATH></IMETHODCALL></SIMPLEREQ></MESSAGE></CIM>\n");
}

TEST(RequestWriter, AsksForNoPropertyAtAllByAnEmptyList) {
  IntrinsicCall call("GetInstance", "n");
  call.propertyList(std::vector<std::string>());
  EXPECT_THAT(call.message(),
              HasSubstr(R"(<IPARAMVALUE NAME="PropertyList"><VALUE.ARRAY></VALUE.ARRAY></IPARAMVALUE>)"));
}

TEST(RequestWriter, IsValid) {
  IntrinsicCall read("Associators", "root/cimv2");
  read.instanceName("ObjectName", path()).className("AssocClass", "CIM_A").text("Role", "<R>").boolean("X", true);
  read.propertyList(std::vector<std::string>{"A", "B"});
  broker::Instance instance;
  instance.path = path();
  instance.properties = {{"P", Value::text("]]>"), nullptr}, {"L", Value::textArray({"a", "b"}), nullptr}};
  IntrinsicCall write("ModifyInstance", "root/cimv2");
  write.modifiedInstance(instance);
  const std::string call = methodCall(
      path(), "M",
      {{"A", Value::textArray({"x"})}, {"R", Value::reference(path())}, {"N", Value::null(schema::Type::Uint16)}});
  for (const std::string& message : {read.message(), write.message(), call}) {
    EXPECT_EQ(testing::grammarProblem(message), "") << message;
  }
}

}  // namespace
}  // namespace zorva::cimxml
