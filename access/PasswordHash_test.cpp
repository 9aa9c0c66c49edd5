#include "access/PasswordHash.h"

#include <gtest/gtest.h>
#include <time.h>

namespace zorva::access {
namespace {

/// The processor time of one check, in seconds.
double costOf(const std::string& password, const std::string& hash) {
  timespec before{};
  timespec after{};
  ::clock_gettime(CLOCK_THREAD_CPUTIME_ID, &before);
  EXPECT_FALSE(isPasswordOf(password, hash));
  ::clock_gettime(CLOCK_THREAD_CPUTIME_ID, &after);
  return static_cast<double>(after.tv_sec - before.tv_sec) + 1e-9 * static_cast<double>(after.tv_nsec - before.tv_nsec);
}

TEST(PasswordHash, APasswordFitsItsHashOnly) {
  const std::string hash = hashPassword("correct horse");
  EXPECT_TRUE(isPasswordHash(hash)) << hash;
  EXPECT_TRUE(isPasswordOf("correct horse", hash));
  EXPECT_FALSE(isPasswordOf("correct hors", hash));
  EXPECT_FALSE(isPasswordOf("", hash));
  EXPECT_NE(hashPassword("correct horse"), hash);
}

TEST(PasswordHash, LongPasswordsAreNotCut) {
  const std::string longest(kLongestPassword, 'x');
  EXPECT_FALSE(isPasswordOf(longest.substr(1) + "y", hashPassword(longest)));
  EXPECT_TRUE(isPasswordOf(longest, hashPassword(longest)));
}

TEST(PasswordHash, NobodyHasAPassword) {
  for (const char* hash : {"", "*", "!", "$y$j9T$", "x"}) EXPECT_FALSE(isPasswordOf("x", hash)) << hash;
}

TEST(PasswordHash, AnUnknownUserCostsAsMuchAsAWrongPassword) {
  const std::string hash = hashPassword("correct horse");
  costOf("wrong", hash);
  double known = 0;
  double unknown = 0;
  for (int i = 0; i < 3; ++i) {
    known += costOf("wrong", hash);
    unknown += costOf("wrong", "");
  }
  EXPECT_LT(known, 3 * unknown);
  EXPECT_LT(unknown, 3 * known);
}

}  // namespace
}  // namespace zorva::access
