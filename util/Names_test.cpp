#include "util/Names.h"

#include <gtest/gtest.h>

namespace zorva::util {
namespace {

TEST(Names, AreTheSameInAnyCase) {
  EXPECT_TRUE(sameName("ZORVA_DNSProtocolEndPoint", "zorva_dnsprotocolendpoint"));
  EXPECT_FALSE(sameName("Name", "Names"));
  EXPECT_FALSE(sameName("Name", "Mane"));
  EXPECT_EQ(nameHash("NameFormat"), nameHash("nAMEfORMAT"));
  EXPECT_TRUE(sameName("", ""));
}

TEST(Names, ComparesOtherLettersAsTheyStand) { EXPECT_FALSE(sameName("\xC3\xA4", "\xC3\x84")); }

TEST(Names, AreOrderedWithoutRegardToCase) {
  EXPECT_TRUE(NameLess()("alpha", "BETA"));
  EXPECT_FALSE(NameLess()("BETA", "alpha"));
  EXPECT_FALSE(NameLess()("Alpha", "alpha"));
  EXPECT_TRUE(NameLess()("Alpha", "alphabet"));
}

}  // namespace
}  // namespace zorva::util
