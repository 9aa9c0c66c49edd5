#include "agent/interface/ProviderUtilities.h"

#include <gtest/gtest.h>

namespace {

bool valid(const std::string& name) { return ZV::ProviderUtilities::ValidateInput(name, "not looked at") == 1; }

TEST(ValidateInput, HostAndDomainNamesWillDo) {
  for (const char* name : {"host1", "node.example.org", "a", "A-b_c.9", "_dmarc.example.org", "-"}) {
    EXPECT_TRUE(valid(name)) << name;
  }
}

TEST(ValidateInput, TheEmptyTextAndAFinalDotWillDo) {
  EXPECT_TRUE(valid(""));
  EXPECT_TRUE(valid("example.org."));
}

TEST(ValidateInput, EmptyLabelsAreRefused) {
  for (const char* name : {".", "..", ".example.org", "example..org", "example.org.."}) {
    EXPECT_FALSE(valid(name)) << name;
  }
}

TEST(ValidateInput, OtherCharactersAreRefused) {
  for (const char* name : {" ", "a b", "a/b", "a\n", "a%", "m\xC3\xBCller", "a:b", "a*"})
    EXPECT_FALSE(valid(name)) << name;
  EXPECT_FALSE(valid(std::string("a\0b", 3)));
}

TEST(ValidateInput, ALabelHasAtMost63Characters) {
  EXPECT_TRUE(valid(std::string(63, 'a') + ".org"));
  EXPECT_FALSE(valid(std::string(64, 'a') + ".org"));
}

TEST(ValidateInput, ANameHasAtMost253CharactersNotCountingAFinalDot) {
  const std::string label(49, 'a');
  const std::string longest = label + '.' + label + '.' + label + '.' + label + '.' + label + ".abc";
  ASSERT_EQ(longest.size(), 253U);
  EXPECT_TRUE(valid(longest));
  EXPECT_TRUE(valid(longest + '.'));
  EXPECT_FALSE(valid(longest + 'd'));
}

TEST(ValidateInput, AnswersOneOrZero) {
  EXPECT_EQ(ZV::ProviderUtilities::ValidateInput("a", ""), 1);
  EXPECT_EQ(ZV::ProviderUtilities::ValidateInput("a b", ""), 0);
}

}  // namespace
