#include "util/Text.h"

#include <gtest/gtest.h>

namespace zorva::util {
namespace {

TEST(Trimmed, TakesBlanksAndTabsOffBothEndsOnly) {
  EXPECT_EQ(trimmed(" \t example .org\t "), "example .org");
  EXPECT_EQ(trimmed("example.org"), "example.org");
  EXPECT_EQ(trimmed("\nexample.org\n"), "\nexample.org\n");
  EXPECT_EQ(trimmed(" \r\n\texample.org\r\n", kWhiteSpace), "example.org");
}

TEST(Trimmed, NothingIsLeftOfBlanksAlone) {
  EXPECT_EQ(trimmed(" \t "), "");
  EXPECT_EQ(trimmed(""), "");
  EXPECT_EQ(trimmedEnd(" \t "), "");
}

TEST(Trimmed, AtTheEndAloneTheBeginStays) { EXPECT_EQ(trimmedEnd("  example.org \t"), "  example.org"); }

}  // namespace
}  // namespace zorva::util
