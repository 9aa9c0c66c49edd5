#include "util/Escape.h"

#include <gtest/gtest.h>

namespace zorva::util {
namespace {

std::string escaped(std::string_view text) {
  std::string line;
  appendEscaped(line, text);
  return line;
}

TEST(Escape, PlainTextAndUtf8StayAsTheyAre) {
  EXPECT_EQ(escaped("eth0 \\ \"x\" \xC3\xBC \xF0\x9F\x8C\x90"), "eth0 \\ \"x\" \xC3\xBC \xF0\x9F\x8C\x90");
}

TEST(Escape, ControlCharactersAreWrittenOut) {
  EXPECT_EQ(escaped("a\nb\rc\td"), "a\\nb\\rc\\td");
  EXPECT_EQ(escaped(std::string_view("\0\x1B[0m\x7F", 6)), "\\x00\\x1b[0m\\x7f");
  EXPECT_EQ(escaped("\xC2\x9B"
                    "2J"),
            "\\xc2\\x9b2J")
      << "what some terminals take for the beginning of a command";
}

TEST(Escape, BytesThatAreNoUtf8AreWrittenOut) { EXPECT_EQ(escaped("\xFF\x80\xC3"), "\\xff\\x80\\xc3"); }

}  // namespace
}  // namespace zorva::util
