#include "cli/session/Paths.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "broker/objects/PathText.h"
#include "cli/output/Failure.h"

namespace zorva::cli {
namespace {

using broker::ObjectPath;
using broker::Value;
using testing::EndsWith;
using testing::HasSubstr;

std::string refusal(std::string_view text) {
  try {
    readPath(text);
    return {};
  } catch (const Failure& failure) {
    EXPECT_EQ(failure.exitCode(), ExitCode::WrongUsage);
    return failure.what();
  }
}

TEST(ReadPath, MarksTheQuotesThatAreNotClosed) {
  EXPECT_THAT(refusal(R"(C.Name="eth0)"), EndsWith("\n  C.Name=\"eth0\n         ^"));
}

TEST(ReadPath, MarksWhatIsMissingAtTheEnd) {
  EXPECT_THAT(refusal("C.Name="), EndsWith("\n  C.Name=\n         ^"));
  EXPECT_THAT(refusal(""), EndsWith("\n  \n  ^"));
}

TEST(ReadPath, MarksThePlaceAfterWideCharacters) {
  EXPECT_THAT(refusal("\xE7\xB6\xB2.K=?"), EndsWith("\n  \xE7\xB6\xB2.K=?\n       ^"));
}

TEST(ReadPath, ShowsControlCharactersAndStillMarksThePlace) {
  EXPECT_THAT(refusal("\x1B[2J"), EndsWith("\n  \\x1B[2J\n  ^"));
}

TEST(ReadPath, ShowsTheSurroundingsOfThePlaceInALongText) {
  const std::string text = "C.K=\"" + std::string(500, 'x') + "\",,L=1" + std::string(500, ' ');
  const std::string message = refusal(text);
  EXPECT_THAT(message, HasSubstr("at byte 508"));
  EXPECT_THAT(message, HasSubstr("\n  ...xxx"));
  EXPECT_LT(message.size(), 350U);
}

TEST(ReadPath, RefusesAMegabyteWithAShortError) {
  const std::string message = refusal("C.K=\"" + std::string(1U << 20U, 'x') + "\"");
  EXPECT_THAT(message, HasSubstr("1048582 bytes long"));
  EXPECT_LT(message.size(), 400U);
}

TEST(ReadPath, NeverCutsACharacterOfALongText) {
  std::string text = "C.K=\"";
  for (int i = 0; i < 300; ++i) text += "\xE7\xB6\xB2";
  EXPECT_THAT(refusal(text + "\"x"), testing::Not(HasSubstr("\\x")));
}

TEST(ReadClassName, RefusesAnInstance) {
  EXPECT_EQ(readClassName("root/cimv2:C").className, "C");
  EXPECT_THROW(readClassName(R"(C.K="v")"), Failure);
}

ObjectPath path(std::vector<broker::NamedValue> keys) { return {"", "", "C", std::move(keys)}; }

TEST(KeysMatch, IfTheGivenOnesAreAmongThoseFound) {
  const ObjectPath found = path({{"Name", Value::text("eth0")}, {"SystemName", Value::text("h")}});
  EXPECT_TRUE(keysMatch(path({}), found));
  EXPECT_TRUE(keysMatch(path({{"name", Value::text("eth0")}}), found));
  EXPECT_FALSE(keysMatch(path({{"Name", Value::text("ETH0")}}), found)) << "values are told apart by case";
  EXPECT_FALSE(keysMatch(path({{"Other", Value::text("eth0")}}), found));
}

TEST(KeysMatch, ComparesReferencesByTheSameRule) {
  const ObjectPath far{"h", "root/cimv2", "D", {{"Name", Value::text("x")}, {"SystemName", Value::text("h")}}};
  const ObjectPath found = path({{"Antecedent", Value::reference(far)}});
  const auto given = [](const char* className, const char* name) {
    return path({{"Antecedent", Value::reference({"", "", className, {{"Name", Value::text(name)}}})}});
  };
  EXPECT_TRUE(keysMatch(given("d", "x"), found));
  EXPECT_FALSE(keysMatch(given("E", "x"), found));
  EXPECT_FALSE(keysMatch(given("D", "y"), found));
}

}  // namespace
}  // namespace zorva::cli
