#include "cli/output/Text.h"

#include <gtest/gtest.h>

namespace zorva::cli {
namespace {

using Lines = std::vector<std::string>;

TEST(Printable, ShowsControlCharactersInsteadOfSendingThem) {
  EXPECT_EQ(printable("a\x1B[31mb\n\t\r\x7F"), "a\\x1B[31mb\\n\\t\\r\\x7F");
  EXPECT_EQ(printable(std::string("\0", 1)), "\\x00");
}

TEST(Printable, ShowsBytesThatAreNoUtf8) { EXPECT_EQ(printable("a\xFF\xC3"), "a\\xFF\\xC3"); }

TEST(Printable, ShowsCharactersThatTurnTheTextAround) {
  EXPECT_EQ(printable("a\xE2\x80\xAE"
                      "b"),
            "a\\u202Eb");
  EXPECT_EQ(printable("\xC2\x9B"), "\\u009B");
  EXPECT_EQ(printable("\xE2\x80\xA8"), "\\u2028");
}

TEST(Printable, LeavesOtherCharactersAlone) {
  EXPECT_EQ(printable("\xC3\xA9\xE7\xB6\xB2 \\n"), "\xC3\xA9\xE7\xB6\xB2 \\n");
}

TEST(DisplayWidth, CountsColumnsAndNotBytes) {
  EXPECT_EQ(displayWidth("eth0"), 4U);
  EXPECT_EQ(displayWidth("r\xC3\xA9seau"), 6U);
  EXPECT_EQ(displayWidth("\xE7\xB6\xB2\xE8\xB7\xAF"), 4U) << "East Asian characters take two columns each";
  EXPECT_EQ(displayWidth("e\xCC\x81"), 1U) << "a combining accent takes none";
}

TEST(Wrapped, BreaksAtBlanks) {
  EXPECT_EQ(wrapped("one two three", 8), (Lines{"one two", "three"}));
  EXPECT_EQ(wrapped("one two three", 7), (Lines{"one two", "three"}));
}

TEST(Wrapped, BreaksWordsThatAreTooLong) { EXPECT_EQ(wrapped("abcdefgh", 3), (Lines{"abc", "def", "gh"})); }

TEST(Wrapped, NeverBreaksACharacter) {
  EXPECT_EQ(wrapped("\xE7\xB6\xB2\xE8\xB7\xAF", 3), (Lines{"\xE7\xB6\xB2", "\xE8\xB7\xAF"}));
  EXPECT_EQ(wrapped("\xE7\xB6\xB2", 1), (Lines{"\xE7\xB6\xB2"})) << "a line of its own where there is no room for it";
}

TEST(Wrapped, LosesNothing) {
  const std::string text = "a bb ccc dddd eeeee  ffffff";
  for (std::size_t width = 1; width < 30; ++width) {
    std::string back = joined(wrapped(text, width), "");
    std::erase(back, ' ');
    EXPECT_EQ(back, "abbcccddddeeeeeffffff") << "at " << width;
  }
}

TEST(Wrapped, HasOneEmptyLineForTheEmptyText) { EXPECT_EQ(wrapped("", 5), Lines{""}); }

TEST(Wrapped, TakesAMegabyteInItsStride) {
  const std::vector<std::string> lines = wrapped(std::string(1U << 20U, 'x'), 8);
  EXPECT_EQ(lines.size(), (1U << 20U) / 8);
}

TEST(CutTo, EndsInAnEllipsisWhereSomethingIsMissing) {
  EXPECT_EQ(cutTo("abc", 3), "abc");
  EXPECT_EQ(cutTo("abcd", 3), "ab\u2026");
  EXPECT_EQ(cutTo("abcd", 1), "\u2026");
  EXPECT_EQ(cutTo("abcd", 0), "abcd");
  EXPECT_EQ(cutTo("\xE7\xB6\xB2\xE8\xB7\xAF", 2), "\u2026") << "a wide character has no room beside it";
}

TEST(FirstOf, HasAsManyAsFitAndHowManyMoreThereAre) {
  const Lines texts{"aaaa", "bbbb", "cccc", "dddd"};
  EXPECT_EQ(firstOf(texts, 0), "aaaa bbbb cccc dddd");
  EXPECT_EQ(firstOf(texts, 19), "aaaa bbbb cccc dddd");
  EXPECT_EQ(firstOf(texts, 18), "aaaa and 3 more");
  EXPECT_EQ(firstOf({"aaaa", "bbbb", "cccc", std::string(40, 'd')}, 25), "aaaa bbbb cccc and 1 more");
  EXPECT_EQ(firstOf({"aaaa", "bbbb", "cccc", std::string(40, 'd')}, 24), "aaaa bbbb and 2 more");
  EXPECT_EQ(firstOf(texts, 14), "4 in all");
  EXPECT_EQ(firstOf({"aaaa"}, 3), "aa\u2026");
  EXPECT_EQ(firstOf({}, 3), "");
}

TEST(FirstOf, IsNeverWiderThanItsRoom) {
  const Lines texts(2000, "\xE7\xB6\xB2\xE8\xB7\xAF");
  for (std::size_t width = 1; width < 100; ++width) EXPECT_LE(displayWidth(firstOf(texts, width)), width);
}

TEST(AsUtf8, MarksBytesThatAreNoUtf8AsTheAgentDoes) {
  EXPECT_EQ(asUtf8("a\xFF"), "a\xF4\x8E\xBB\xBF");  // U+10EE00 + 0xFF = U+10EEFF
  EXPECT_EQ(asUtf8("\xC3\xA9"), "\xC3\xA9");
}

TEST(Counted, KnowsOneFromMany) {
  EXPECT_EQ(counted(1, "instance"), "1 instance");
  EXPECT_EQ(counted(0, "instance"), "0 instances");
}

}  // namespace
}  // namespace zorva::cli
