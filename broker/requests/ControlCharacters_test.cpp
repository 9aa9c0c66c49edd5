#include "broker/requests/ControlCharacters.h"

#include <cmpidt.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace zorva::broker {
namespace {

using ::testing::HasSubstr;

Instance with(Value value) {
  return {{}, {{"Plain", Value::text("a\tb é"), nullptr}, {"Odd", std::move(value), nullptr}}, nullptr};
}

TEST(ControlCharacters, AreRefusedWithTheirPropertyAndTheirNumber) {
  for (const auto& [text, number] : {std::pair("a\nb", "U+000A"),
                                     {"\r", "U+000D"},
                                     {"a\x01", "U+0001"},
                                     {"\x1F", "U+001F"},
                                     {"\x7F", "U+007F"},
                                     {"\xC2\x80", "U+0080"},
                                     {"é\xC2\x9F", "U+009F"}}) {
    const Status status = refuseControlCharacters(with(Value::text(text)), std::nullopt);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_PARAMETER) << number;
    EXPECT_THAT(status.message, HasSubstr("the property Odd has the control character " + std::string(number)));
  }
  EXPECT_FALSE(refuseControlCharacters(with(Value::text(std::string("a\0b", 3))), std::nullopt).ok());
}

TEST(ControlCharacters, AllOtherTextIsTaken) {
  for (const char* text : {"", " a\tb ", "\xC2\xA0", "\xE2\x80\xA8", "日本", "\xFF"}) {
    EXPECT_TRUE(refuseControlCharacters(with(Value::text(text)), std::nullopt).ok()) << text;
  }
}

TEST(ControlCharacters, AreFoundWhereverTheyLieInAValue) {
  ObjectPath path;
  path.keys.push_back({"K", Value::text("\n")});
  for (const Value& value : {Value::textArray({"a", "b\nc"}), Value::reference(path),
                             Value::array(schema::Type::Reference, {Boxed<ObjectPath>(path)}),
                             Value::array(schema::Type::String, {Boxed<Instance>(with(Value::text("\n")))}),
                             Value::array(schema::Type::Char16, {u'\n'})}) {
    EXPECT_THAT(refuseControlCharacters(with(value), std::nullopt).message, HasSubstr("Odd"));
  }
}

TEST(ControlCharacters, OfWhatIsNotToBeChangedDoNotMatter) {
  using Names = std::vector<std::string>;
  EXPECT_TRUE(refuseControlCharacters(with(Value::text("\n")), Names{"Plain"}).ok());
  EXPECT_TRUE(refuseControlCharacters(with(Value::text("\n")), Names{}).ok());
  EXPECT_FALSE(refuseControlCharacters(with(Value::text("\n")), Names{"ODD"}).ok());
}

TEST(ControlCharacters, OfAnArgumentAreRefusedWithItsParameter) {
  EXPECT_TRUE(refuseControlCharacters({{"DomainName", Value::text("example.org")}}).ok());
  EXPECT_THAT(refuseControlCharacters({{"A", Value::text("a")}, {"DomainName", Value::text("x\ny")}}).message,
              HasSubstr("the parameter DomainName has the control character U+000A"));
}

}  // namespace
}  // namespace zorva::broker
