#include "util/Nearest.h"

#include <gtest/gtest.h>

namespace zorva::util {
namespace {

const std::vector<std::string> kWords{"show", "tree", "classes", "suffixes", "ifcfg", "DNSServerAddresses"};

TEST(Nearest, IsTheWordThatNeedsTheFewestEdits) {
  EXPECT_EQ(nearest("shwo", kWords), "show");
  EXPECT_EQ(nearest("shows", kWords), "show");
  EXPECT_EQ(nearest("sho", kWords), "show");
  EXPECT_EQ(nearest("suffixs", kWords), "suffixes");
  EXPECT_EQ(nearest("iffcg", kWords), "ifcfg");
}

TEST(Nearest, DisregardsTheCaseOfLetters) { EXPECT_EQ(nearest("dnsserveradress", kWords), "DNSServerAddresses"); }

TEST(Nearest, IsTheFirstOfSeveralThatAreEquallyNear) { EXPECT_EQ(nearest("eth9", {"eth0", "eth1"}), "eth0"); }

TEST(Nearest, IsNothingWhereNothingIsNear) {
  EXPECT_EQ(nearest("frobnicate", kWords), "");
  EXPECT_EQ(nearest("x", {"y"}), "") << "that would be another word altogether";
  EXPECT_EQ(nearest("", kWords), "");
  EXPECT_EQ(nearest("show", {}), "");
}

TEST(Nearest, LongWordsAreNearNone) {
  EXPECT_EQ(nearest(std::string(64, 'a') + "b", {std::string(64, 'a')}), "");
  EXPECT_EQ(nearest(std::string(63, 'a') + "b", {std::string(64, 'a')}), std::string(64, 'a'));
  EXPECT_EQ(nearest(std::string(1000000, 'a'), {std::string(1000000, 'a')}), "");
}

TEST(Nearest, IsAskedForInAQuestion) {
  EXPECT_EQ(didYouMean("shwo", kWords), "did you mean show?");
  EXPECT_EQ(didYouMean("frobnicate", kWords), "");
}

}  // namespace
}  // namespace zorva::util
