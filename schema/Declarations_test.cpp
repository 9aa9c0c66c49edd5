#include "schema/Declarations.h"

#include <gtest/gtest.h>

namespace zorva::schema {
namespace {

std::string misfit(Scalar scalar, Type type) {
  Value value = Value::of(std::move(scalar));
  return fitValue(value, type, false).value_or("");
}

Scalar fitted(Scalar scalar, Type type) {
  Value value = Value::of(std::move(scalar));
  EXPECT_EQ(fitValue(value, type, false), std::nullopt);
  return value.scalar;
}

TEST(Types, HaveTheirMofKeywords) {
  EXPECT_EQ(typeName(Type::Uint16), "uint16");
  EXPECT_EQ(typeName(Type::Reference), "ref");
  EXPECT_EQ(typeFromName("DateTime"), Type::DateTime);
  EXPECT_EQ(typeFromName("real32"), Type::Real32);
  EXPECT_EQ(typeFromName("ref"), std::nullopt);
  EXPECT_EQ(typeFromName("int"), std::nullopt);
}

TEST(FitValue, TakesTheEndsOfEachIntegerRange) {
  EXPECT_EQ(misfit(std::uint64_t{255}, Type::Uint8), "");
  EXPECT_EQ(misfit(std::uint64_t{256}, Type::Uint8), "256 does not fit in uint8");
  EXPECT_EQ(misfit(std::int64_t{-1}, Type::Uint8), "-1 does not fit in uint8");
  EXPECT_EQ(misfit(std::uint64_t{127}, Type::Sint8), "");
  EXPECT_EQ(misfit(std::uint64_t{128}, Type::Sint8), "128 does not fit in sint8");
  EXPECT_EQ(misfit(std::int64_t{-128}, Type::Sint8), "");
  EXPECT_EQ(misfit(std::int64_t{-129}, Type::Sint8), "-129 does not fit in sint8");
  EXPECT_EQ(misfit(std::uint64_t{UINT32_MAX}, Type::Uint32), "");
  EXPECT_EQ(misfit(std::uint64_t{UINT32_MAX} + 1, Type::Uint32), "4294967296 does not fit in uint32");
  EXPECT_EQ(misfit(std::uint64_t{UINT64_MAX}, Type::Uint64), "");
  EXPECT_EQ(misfit(std::uint64_t{UINT64_MAX}, Type::Sint64), "18446744073709551615 does not fit in sint64");
  EXPECT_EQ(misfit(std::int64_t{INT64_MIN}, Type::Sint64), "");
}

TEST(FitValue, TurnsWholeNumbersIntoWhatTheTypeHolds) {
  EXPECT_EQ(fitted(std::uint64_t{5}, Type::Sint16), Scalar(std::int64_t{5}));
  EXPECT_EQ(fitted(std::uint64_t{5}, Type::Real64), Scalar(5.0));
  EXPECT_EQ(fitted(std::int64_t{-5}, Type::Real32), Scalar(-5.0));
}

TEST(FitValue, RefusesWhatIsOfAnotherKind) {
  EXPECT_EQ(misfit(std::string("x"), Type::Uint8), "a text is no value of type uint8");
  EXPECT_EQ(misfit(true, Type::String), "true is no value of type string");
  EXPECT_EQ(misfit(1.5, Type::Sint32), "a real number is no value of type sint32");
  EXPECT_EQ(misfit(std::uint64_t{1}, Type::Boolean), "1 is no value of type boolean");
  EXPECT_EQ(misfit(std::string("a"), Type::Char16), "a text is no value of type char16");
  EXPECT_EQ(misfit(1e300, Type::Real32), "a real number is no value of type real32");
}

TEST(FitValue, LetsNullPassAsEveryType) {
  Value value = Value::null();
  EXPECT_EQ(fitValue(value, Type::Uint8, true), std::nullopt);
  EXPECT_TRUE(value.isNull);
  EXPECT_TRUE(value.isArray);
}

TEST(FitValue, RequiresArraysWhereArraysBelong) {
  Value one = Value::of(std::uint64_t{1});
  EXPECT_EQ(fitValue(one, Type::Uint8, true), "a single value is given where an array of uint8 belongs");
  Value many = Value::array({std::uint64_t{1}});
  EXPECT_EQ(fitValue(many, Type::Uint8, false), "an array is given where a single uint8 belongs");
  Value mixed = Value::array({std::uint64_t{1}, std::string("x"), std::monostate()});
  EXPECT_EQ(fitValue(mixed, Type::Uint8, true), "a text is no value of type uint8");
  Value good = Value::array({std::uint64_t{1}, std::monostate()});
  EXPECT_EQ(fitValue(good, Type::Uint8, true), std::nullopt);
}

TEST(DateTime, IsAPointInTimeOrAnInterval) {
  EXPECT_TRUE(isDateTime("20240229235959.123456+060"));
  EXPECT_TRUE(isDateTime("20240229235959.123***-480"));
  EXPECT_TRUE(isDateTime("00000000000500.000000:000"));
  EXPECT_FALSE(isDateTime("00000000000500.000000:060"));
  EXPECT_FALSE(isDateTime("2024022923595.1234567+060"));
  EXPECT_FALSE(isDateTime("20240229235959.123456+06"));
  EXPECT_FALSE(isDateTime("20240229235959.123456 060"));
  EXPECT_FALSE(isDateTime("20240229235959.123456+06a"));
  EXPECT_FALSE(isDateTime(""));
  EXPECT_EQ(misfit(std::string("yesterday"), Type::DateTime), "\"yesterday\" is no datetime");
}

TEST(Qualifiers, AreFoundInAnyCase) {
  Qualifiers qualifiers(2);
  qualifiers[0].name = "Key";
  qualifiers[1].name = "Write";
  qualifiers[1].value = Value::of(false);
  ASSERT_NE(findQualifier(qualifiers, "KEY"), nullptr);
  EXPECT_TRUE(hasQualifier(qualifiers, "key"));
  EXPECT_FALSE(hasQualifier(qualifiers, "Write"));
  EXPECT_FALSE(hasQualifier(qualifiers, "Abstract"));
}

TEST(SchemaErrorText, LeavesOutWhatIsNotKnown) {
  EXPECT_EQ((SchemaError{"a.mof", 3, 7, "no"}).text(), "a.mof:3:7: no");
  EXPECT_EQ((SchemaError{"a.mof", 0, 0, "no"}).text(), "a.mof: no");
  EXPECT_EQ((SchemaError{"", 3, 7, "no"}).text(), "3:7: no");
  EXPECT_EQ((SchemaError{"", 0, 0, "no"}).text(), "no");
}

}  // namespace
}  // namespace zorva::schema
