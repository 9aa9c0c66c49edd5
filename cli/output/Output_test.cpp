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

TEST(JsonOutput, HasAWordForEachElementOfAnArrayThatHasOne) {
  schema::ClassProperty declared;
  for (const auto& [name, texts] :
       {std::pair("ValueMap", std::vector<schema::Scalar>{std::string("2"), std::string("5..9")}),
        std::pair("Values", std::vector<schema::Scalar>{std::string("OK"), std::string("Bad")})}) {
    schema::Qualifier qualifier;
    qualifier.name = name;
    qualifier.value = schema::Value::array(texts);
    declared.qualifiers.push_back(qualifier);
  }
  const auto numbers = [](std::vector<Scalar> list) { return Value::array(schema::Type::Uint16, std::move(list)); };
  const auto wordsOf = [&declared](const Value& value) {
    return nlohmann::json::parse(instanceDocument(instanceOf({{"P", value, &declared}})))["words"];
  };
  const auto number = [](std::uint64_t value) { return Scalar(value); };
  EXPECT_EQ(wordsOf(numbers({number(2), number(7), number(3)})),
            nlohmann::json::parse(R"({"P": ["OK", "Bad", null]})"));
  EXPECT_EQ(wordsOf(numbers({number(3)})), nlohmann::json::object());
  EXPECT_EQ(wordsOf(Value::unsignedNumber(2)), nlohmann::json::parse(R"({"P": "OK"})"));
  EXPECT_EQ(wordsOf(Value::unsignedNumber(3)), nlohmann::json::object());
}

TEST(JsonOutput, IsADocumentWithItsVersionFirst) {
  EXPECT_TRUE(instanceDocument(instanceOf({})).starts_with("{\n  \"version\": 1,\n  \"class\": \"C\""));
  EXPECT_EQ(textsJson({"a"}), "{\n  \"version\": 1,\n  \"results\": [\n    \"a\"\n  ]\n}");
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
