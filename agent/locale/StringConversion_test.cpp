#include "agent/interface/StringConversion.h"

#include <gtest/gtest.h>

namespace {

using ZV::make_string;
using ZV::make_wstring;
using ZV::stripSpaces;

TEST(StringConversion, Utf8BecomesUtf32AndComesBack) {
  const std::string text = "a\xC3\xBC\xE2\x82\xAC\xF0\x9F\x8C\x90";
  EXPECT_EQ(make_wstring(text), (std::wstring{L'a', 0xFC, 0x20AC, 0x1F310}));
  EXPECT_EQ(make_string(make_wstring(text)), text);
}

TEST(StringConversion, EveryPairOfBytesComesBackAsItWas) {
  for (int first = 0; first < 256; ++first) {
    for (int second = 0; second < 256; ++second) {
      const std::string text{static_cast<char>(first), static_cast<char>(second)};
      ASSERT_EQ(make_string(make_wstring(text)), text) << first << ' ' << second;
    }
  }
}

TEST(StringConversion, OverlongFormsSurrogatesAndWhatLiesPastUnicodeComeBackAsTheyWere) {
  for (const char* text : {"\xC0\xAF", "\xE0\x80\xAF", "\xED\xB2\x80", "\xED\xA0\x80", "\xF4\x90\x80\x80",
                           "\xF8\x88\x80\x80\x80", "\xE2\x82", "\xF0\x9F\x8C", "\xFF\xFE"}) {
    const std::wstring wide = make_wstring(text);
    EXPECT_EQ(wide.size(), std::string(text).size()) << "each byte is a character of its own";
    EXPECT_EQ(make_string(wide), text);
  }
}

TEST(StringConversion, NulIsACharacterLikeAnyOther) {
  const std::string text("a\0b", 3);
  EXPECT_EQ(make_string(make_wstring(text)), text);
}

TEST(StringConversion, NoTextAtAllIsEmptyText) { EXPECT_EQ(make_wstring(static_cast<const char*>(nullptr)), L""); }

TEST(StringConversion, WideCharactersThatAreNoTextBecomeTheReplacementCharacter) {
  const std::string replacement = "\xEF\xBF\xBD";
  EXPECT_EQ(make_string(std::wstring{static_cast<wchar_t>(0xD800)}), replacement);
  EXPECT_EQ(make_string(std::wstring{static_cast<wchar_t>(0x110000)}), replacement);
  EXPECT_EQ(make_string(std::wstring{static_cast<wchar_t>(-1)}), replacement);
}

TEST(StripSpaces, TakesBlanksAndTabsOffBothEndsOnly) {
  EXPECT_EQ(stripSpaces(" \t example .org\t "), "example .org");
  EXPECT_EQ(stripSpaces("example.org"), "example.org");
  EXPECT_EQ(stripSpaces("\n"), "\n");
}

TEST(StripSpaces, NothingIsLeftOfBlanksAlone) {
  EXPECT_EQ(stripSpaces("  \t "), "");
  EXPECT_EQ(stripSpaces(""), "");
}

}  // namespace
