// JSON, MOF and the text of the tree.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "agent/Agent.h"
#include "cli/output/JsonOutput.h"
#include "cli/output/MofOutput.h"
#include "cli/output/TreeText.h"
#include "schema/Mof.h"

namespace zorva::cli {
namespace {

using broker::Instance;
using broker::Scalar;
using broker::Value;
using testing::HasSubstr;

Instance instanceOf(std::vector<broker::Property> properties) {
  Instance instance;
  instance.path = {"h", "root/cimv2", "C", {{"K", Value::text("v")}}};
  instance.properties = std::move(properties);
  return instance;
}

nlohmann::json jsonOf(const Value& value) {
  return nlohmann::json::parse(instanceJson(instanceOf({{"P", value, nullptr}}), 4))["properties"]["P"];
}

TEST(JsonOutput, HasAJsonTypeForEachType) {
  EXPECT_EQ(jsonOf(Value::text("a\n\"")), "a\n\"");
  EXPECT_EQ(jsonOf(Value::boolean(true)), true);
  EXPECT_EQ(jsonOf(Value::unsignedNumber(18446744073709551615U)), 18446744073709551615U);
  EXPECT_EQ(jsonOf(Value::signedNumber(-1)), -1);
  EXPECT_EQ(jsonOf(Value::null(schema::Type::Uint8)), nullptr);
  EXPECT_EQ(jsonOf(Value::textArray({"a", "b"})), (nlohmann::json{"a", "b"}));
  EXPECT_EQ(jsonOf(Value::textArray({})), nlohmann::json::array());
  EXPECT_EQ(jsonOf(Value::array(schema::Type::String, {Scalar()})), (nlohmann::json{nullptr}));
  EXPECT_EQ(jsonOf(Value::reference({"", "n", "D", {}})), "n:D");
}

TEST(JsonOutput, IsUtf8WhateverTheValuesAre) { EXPECT_EQ(jsonOf(Value::text("a\xFF")), "a\xF4\x8E\xBB\xBF"); }

TEST(JsonOutput, KeepsTheOrderOfTheProperties) {
  const std::string text =
      instanceJson(instanceOf({{"Z", Value::text("1"), nullptr}, {"A", Value::text("2"), nullptr}}), 0);
  EXPECT_LT(text.find("\"Z\""), text.find("\"A\""));
}

/// Takes the first instance of a MOF text.
class OneInstance : public schema::MofSink {
 public:
  Expected<void, schema::SchemaError> qualifierType(schema::QualifierType, std::string_view) override { return {}; }
  Expected<void, schema::SchemaError> classDeclaration(schema::ClassDeclaration, std::string_view) override {
    return {};
  }
  Expected<void, schema::SchemaError> instance(schema::InstanceDeclaration instance, std::string_view) override {
    found = std::move(instance);
    return {};
  }
  schema::InstanceDeclaration found;
};

TEST(MofOutput, IsReadBackAsTheSameInstance) {
  const Instance instance = instanceOf({{"T", Value::text("a\"\n\xFF"), nullptr},
                                        {"N", Value::unsignedNumber(7), nullptr},
                                        {"R", Value::reference({"", "", "D", {{"K", Value::text("x")}}}), nullptr},
                                        {"L", Value::textArray({"a", "b"}), nullptr},
                                        {"U", Value::null(schema::Type::String), nullptr}});
  OneInstance sink;
  const auto outcome = schema::parseMof(instanceMof(instance), "written", sink);
  ASSERT_TRUE(outcome) << outcome.error().text();
  EXPECT_EQ(sink.found.className, "C");
  ASSERT_EQ(sink.found.properties.size(), 5U);
  EXPECT_EQ(schema::textOf(sink.found.properties[0].value), "a\"\n\xF4\x8E\xBB\xBF");
  EXPECT_EQ(schema::textOf(sink.found.properties[2].value), R"(D.K="x")");
  EXPECT_EQ(sink.found.properties[3].value.elements.size(), 2U);
  EXPECT_TRUE(sink.found.properties[4].value.isNull);
}

TEST(TreeText, MarksAValueThatWasSet) {
  zorva::agent::TreeBuilder builder("h");
  const std::size_t system = builder.add(0, zorva::agent::NodeType::System, "system", "BMC");
  const std::size_t port = builder.add(system, zorva::agent::NodeType::Port, "e\x1Bth");
  const std::size_t node = builder.add(port, zorva::agent::NodeType::NetworkIPConfig, "ip");
  builder.set(node, ZV::NodeLexicon::PROP_NAME, std::string("eth"));
  builder.set(node, ZV::NodeLexicon::PROP_DOMAIN_NAME, std::string("set.example"), true);
  EXPECT_EQ(treeText(*builder.finish(), {}),
            "h\n"
            "  system  System, \"BMC\"\n"
            "    e\\x1Bth  Port\n"
            "      ip  NetworkIPConfig\n"
            "          name         eth\n"
            "          domain_name  set.example  (set; not the host's own)\n");
}

}  // namespace
}  // namespace zorva::cli
