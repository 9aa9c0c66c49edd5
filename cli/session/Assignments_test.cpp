#include "cli/session/Assignments.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cli/output/Failure.h"

namespace zorva::cli {
namespace {

using broker::Value;
using schema::Type;
using testing::HasSubstr;

Value valueOf(Type type, const std::vector<std::string>& texts, bool isArray = false) {
  return parseValue({"P", type, isArray}, texts);
}

/// The message with which a value is refused; empty if it is accepted.
std::string refusal(Type type, const std::vector<std::string>& texts, bool isArray = false) {
  try {
    valueOf(type, texts, isArray);
    return {};
  } catch (const Failure& failure) {
    EXPECT_EQ(failure.exitCode(), ExitCode::WrongUsage);
    return failure.what();
  }
}

TEST(Assignments, GatherTheTextsOfOneNameInOrder) {
  const std::vector<Assignment> found = parseAssignments({"A=1", "B=x=y", "a=2", "B="});
  ASSERT_EQ(found.size(), 2U);
  EXPECT_EQ(found[0].texts, (std::vector<std::string>{"1", "2"}));
  EXPECT_EQ(found[1].name, "B");
  EXPECT_EQ(found[1].texts, (std::vector<std::string>{"x=y", ""}));
}

TEST(Assignments, RefuseAWordWithoutAName) {
  EXPECT_THROW(parseAssignments({"plain"}), Failure);
  EXPECT_THROW(parseAssignments({"=value"}), Failure);
}

TEST(ParseValue, TakesTheTypeFromTheSchema) {
  EXPECT_EQ(valueOf(Type::String, {"12"}), Value::text("12"));
  EXPECT_EQ(valueOf(Type::Uint16, {"0xFFFF"}), Value::unsignedNumber(65535, Type::Uint16));
  EXPECT_EQ(valueOf(Type::Sint8, {"-128"}), Value::signedNumber(-128, Type::Sint8));
  EXPECT_EQ(valueOf(Type::Boolean, {"True"}), Value::boolean(true));
  EXPECT_EQ(std::get<double>(valueOf(Type::Real64, {"1e3"}).scalar), 1000.0);
  EXPECT_EQ(std::get<char16_t>(valueOf(Type::Char16, {"\xC3\xA9"}).scalar), u'\u00E9');
  EXPECT_EQ(valueOf(Type::DateTime, {"20260102030405.000000+060"}).asText(), "20260102030405.000000+060");
}

TEST(ParseValue, ReadsAReferenceAsAPath) {
  const Value value = valueOf(Type::Reference, {R"(C.K="v")"});
  EXPECT_EQ(std::get<broker::Boxed<broker::ObjectPath>>(value.scalar)->className, "C");
  EXPECT_THAT(refusal(Type::Reference, {R"(C.K="v)"}), HasSubstr("the path is wrong at byte 5"));
}

TEST(ParseValue, DistinguishesNullFromTheEmptyTextAndTheEmptyArray) {
  EXPECT_TRUE(valueOf(Type::String, {"null"}).isNull);
  EXPECT_EQ(valueOf(Type::String, {""}), Value::text(""));
  EXPECT_TRUE(valueOf(Type::String, {"null"}, true).isNull);
  EXPECT_EQ(valueOf(Type::String, {""}, true), Value::textArray({}));
  EXPECT_EQ(valueOf(Type::String, {"a", ""}, true), Value::textArray({"a", ""}));
  EXPECT_EQ(valueOf(Type::String, {"null", "null"}, true), Value::textArray({"null", "null"}));
}

TEST(ParseValue, NamesWhatIsWrongWithANumber) {
  EXPECT_EQ(refusal(Type::Uint8, {"256"}), "P='256': 256 does not fit in uint8");
  EXPECT_EQ(refusal(Type::Uint64, {"99999999999999999999"}), "P='99999999999999999999': does not fit in uint64");
  EXPECT_EQ(refusal(Type::Uint16, {"1x"}), "P='1x': a uint16 is wanted");
  EXPECT_NE(refusal(Type::Uint16, {"-1"}), "");
  EXPECT_NE(refusal(Type::Uint16, {""}), "");
  EXPECT_NE(refusal(Type::Uint16, {"--1"}), "");
  EXPECT_NE(refusal(Type::Sint16, {"0x-1"}), "");
  EXPECT_EQ(refusal(Type::Real32, {"many"}), "P='many': a number is wanted");
}

TEST(ParseValue, NamesWhatIsWrongWithOtherTypes) {
  EXPECT_EQ(refusal(Type::Boolean, {"yes"}), "P='yes': true or false is wanted");
  EXPECT_EQ(refusal(Type::Char16, {"ab"}), "P='ab': one character is wanted");
  EXPECT_NE(refusal(Type::DateTime, {"tomorrow"}), "");
}

TEST(ParseValue, RefusesControlCharactersAndNamesTheirPlace) {
  EXPECT_EQ(refusal(Type::String, {"a\nb"}), "P='a\\nb': byte 2 is a control character");
  EXPECT_EQ(refusal(Type::String, {std::string("a\0b", 3)}), "P='a\\x00b': byte 2 is a control character");
  EXPECT_EQ(refusal(Type::String, {"good", "\x7F"}, true), "P='\\x7F': byte 1 is a control character");
  EXPECT_EQ(refusal(Type::String, {"\xC2\x85"}), "P='\\u0085': byte 1 is a control character");
  EXPECT_EQ(refusal(Type::String, {"ab\xFF"}), "P='ab\\xFF': byte 3 is no UTF-8");
}

TEST(ParseValue, TakesQuotesAndLongTexts) {
  EXPECT_EQ(valueOf(Type::String, {R"(a"b'c\)"}).asText(), R"(a"b'c\)");
  const std::string text(1U << 20U, 'x');
  EXPECT_EQ(valueOf(Type::String, {text}).asText(), text);
  EXPECT_EQ(valueOf(Type::String, std::vector<std::string>(100000, "x"), true).elements.size(), 100000U);
}

TEST(ParseValue, ShowsOnlyTheBeginningOfALongTextThatIsWrong) {
  EXPECT_LT(refusal(Type::Uint8, {std::string(1U << 20U, 'x')}).size(), 120U);
}

TEST(ParseValue, RefusesASecondValueForAScalar) {
  EXPECT_EQ(refusal(Type::String, {"a", "b"}), "P is given 2 times and takes one value; only an array takes several");
}

}  // namespace
}  // namespace zorva::cli
