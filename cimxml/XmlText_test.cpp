#include "cimxml/XmlText.h"

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

namespace zorva::cimxml {
namespace {

using Cases = std::vector<std::pair<std::string, std::string>>;

std::string escaped(std::string_view text) {
  std::string out;
  appendEscaped(out, text);
  return out;
}

TEST(XmlText, HasNothingThatAnXmlReaderWouldTakeForMarkup) {
  EXPECT_EQ(escaped(R"(<a href="x">&)"), "&lt;a href=&quot;x&quot;&gt;&amp;");
}

TEST(XmlText, KeepsLineEndsAndTabsThroughAReader) { EXPECT_EQ(escaped("a\r\n\tb"), "a&#13;&#10;&#9;b"); }

TEST(XmlText, ReplacesWhatXmlCannotHold) {
  const Cases cases = {
      {std::string("a\x01", 2), "a\xEF\xBF\xBD"},
      {std::string("\0b", 2),
       "\xEF\xBF\xBD"
       "b"},
      {"\xFFz", "\xEF\xBF\xBDz"},
      {"\xEF\xBF\xBE", "\xEF\xBF\xBD"},
      {"ab\xC3", "ab\xEF\xBF\xBD"},
      {"a\x7F", "a\x7F"},
  };
  for (const auto& [text, expected] : cases) EXPECT_EQ(escaped(text), expected) << text;
}

TEST(XmlText, LeavesOtherCharactersAsTheyAre) {
  EXPECT_EQ(escaped("r\xC3\xA9seau \xF0\x9F\x8C\x90"), "r\xC3\xA9seau \xF0\x9F\x8C\x90");
}

// Long texts are tested in words: each byte must be recognized at each place in a word.
TEST(XmlText, TreatsAByteAlikeAtEachPosition) {
  const auto alone = [](int byte) { return escaped(std::string(1, static_cast<char>(byte))); };
  for (int byte = 0; byte < 256; ++byte) {
    for (std::size_t before = 0; before < 17; ++before) {
      const std::string left(before, 'a');
      const std::string right(16 - before, '~');
      ASSERT_EQ(escaped(left + static_cast<char>(byte) + right), left + alone(byte) + right)
          << byte << " at " << before;
    }
  }
}

}  // namespace
}  // namespace zorva::cimxml
