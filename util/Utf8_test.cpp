#include "util/Utf8.h"

#include <gtest/gtest.h>

namespace zorva::util {
namespace {

std::string appended(std::uint32_t code) {
  std::string text;
  utf8Append(text, code);
  return text;
}

TEST(Utf8, ACharacterTakesOneToFourBytes) {
  for (const std::uint32_t code : {0U, 0x7FU, 0x80U, 0x7FFU, 0x800U, 0xFFFFU, 0x10000U, 0x10FFFFU}) {
    const std::string text = appended(code);
    EXPECT_EQ(utf8Length(text), text.size()) << code;
    EXPECT_EQ(utf8Length(text + "\xFF"), text.size()) << code;
    EXPECT_EQ(utf8Decode(text), code);
  }
  EXPECT_EQ(appended(0x7F).size(), 1U);
  EXPECT_EQ(appended(0x80).size(), 2U);
  EXPECT_EQ(appended(0x800).size(), 3U);
  EXPECT_EQ(appended(0x10000).size(), 4U);
}

TEST(Utf8, OverlongFormsSurrogatesAndWhatIsPastUnicodeAreNoCharacters) {
  for (const char* text : {"\x80", "\xC0\xAF", "\xC1\xBF", "\xE0\x9F\xBF", "\xED\xA0\x80", "\xF0\x8F\xBF\xBF",
                           "\xF4\x90\x80\x80", "\xF8\x88\x80\x80\x80", "\xFF", "\xE2\x82", "\xE2\x82z", "\xC3"}) {
    EXPECT_EQ(utf8Length(text), 0U) << text;
    EXPECT_FALSE(isUtf8(std::string("a") + text)) << text;
  }
  EXPECT_EQ(utf8Length(""), 0U);
}

TEST(Utf8, ATextIsUtf8WhereEveryCharacterIs) {
  EXPECT_TRUE(isUtf8(""));
  EXPECT_TRUE(isUtf8("a\xC3\xBC\xE2\x82\xAC\xF0\x9F\x8C\x90"));
  EXPECT_TRUE(isUtf8(std::string_view("\0", 1)));
}

TEST(Utf8, ACutBreaksNoCharacter) {
  EXPECT_EQ(utf8Cut("a\xE2\x82\xAC", 4), 4U);
  EXPECT_EQ(utf8Cut("a\xE2\x82\xAC", 3), 1U);
  EXPECT_EQ(utf8Cut("a\xE2\x82\xAC", 1), 1U);
  EXPECT_EQ(utf8Cut("\xE2\x82\xAC", 2), 0U);
}

}  // namespace
}  // namespace zorva::util
