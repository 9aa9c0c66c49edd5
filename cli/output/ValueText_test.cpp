#include "cli/output/ValueText.h"

#include <gtest/gtest.h>

#include "schema/Schema.h"

namespace zorva::cli {
namespace {

using broker::Scalar;
using broker::Value;

const schema::ClassProperty& propertyOf(const char* className, const char* property) {
  static const auto classes = schema::loadBuiltInClasses();
  return *classes->find(className)->findProperty(property);
}

TEST(ValueText, HasTheSchemasWordAfterANumber) {
  const auto& state = propertyOf("ZORVA_DNSProtocolEndPoint", "EnabledState");
  EXPECT_EQ(valueText(Value::unsignedNumber(2, schema::Type::Uint16), &state), "2 (Enabled)");
  EXPECT_EQ(valueText(Value::unsignedNumber(40000, schema::Type::Uint16), &state), "40000 (Vendor Reserved)");
  EXPECT_EQ(valueText(Value::unsignedNumber(2, schema::Type::Uint16), nullptr), "2");
}

TEST(ValueText, FindsOpenRangesOfNumbers) {
  const auto& status = propertyOf("ZORVA_DNSProtocolEndPoint", "CommunicationStatus");
  EXPECT_EQ(valueWord(status, 0x8000), "Vendor Reserved");
  EXPECT_EQ(valueWord(status, 0xFFFF), "Vendor Reserved");
  EXPECT_EQ(valueWord(status, 4), "No Contact");
  EXPECT_EQ(valueWord(status, 5), std::nullopt) << "\"..\" is what no other entry holds, and says nothing of a number";
}

TEST(ValueText, HasTheWordAfterEachElementOfAnArray) {
  const auto& status = propertyOf("ZORVA_ComputerSystem", "OperationalStatus");
  EXPECT_EQ(
      valueText(Value::array(schema::Type::Uint16, {Scalar(std::uint64_t{2}), Scalar(std::uint64_t{3})}), &status),
      "2 (OK), 3 (Degraded)");
}

TEST(ValueText, DistinguishesNullFromEmpty) {
  EXPECT_EQ(valueText(Value::null(schema::Type::String), nullptr), "NULL");
  EXPECT_EQ(valueText(Value::text(""), nullptr), "");
  EXPECT_EQ(valueText(Value::textArray({}), nullptr), "");
}

TEST(ValueText, WritesEachType) {
  EXPECT_EQ(valueText(Value::boolean(false), nullptr), "FALSE");
  EXPECT_EQ(valueText(Value::signedNumber(-3), nullptr), "-3");
  EXPECT_EQ(scalarText(0.25), "0.25");
  EXPECT_EQ(scalarText(u'A'), "65");
  EXPECT_EQ(valueText(Value::reference({"h", "root/cimv2", "C", {{"K", Value::text("v")}}}), nullptr), R"(C.K="v")");
}

TEST(ShortPath, KeepsANamespaceThatIsNotTheUsualOne) {
  EXPECT_EQ(shortPathText({"h", "root/interop", "C", {}}), "root/interop:C");
  EXPECT_EQ(shortPathText({"h", "ROOT/CIMV2", "C", {}}), "C");
}

}  // namespace
}  // namespace zorva::cli
