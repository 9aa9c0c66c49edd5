#include "access/BasicLogin.h"

#include <gtest/gtest.h>

#include "access/PasswordHash.h"

namespace zorva::access {
namespace {

TEST(BasicLogin, HasAUserAndAPassword) {
  const auto login = readBasicLogin("Basic YWxpY2U6cGFzczp3b3Jk");
  ASSERT_TRUE(login.has_value());
  EXPECT_EQ(login->user, "alice");
  EXPECT_EQ(login->password, "pass:word");
  EXPECT_TRUE(readBasicLogin("basic  YWxpY2U6cGFzczp3b3Jk ").has_value());
}

TEST(BasicLogin, AnythingElseIsNone) {
  const std::string wrong[] = {"",
                               "Basic",
                               "Basic ",
                               "Bearer YWxpY2U6cGFzczp3b3Jk",
                               "Basic YWxpY2U=",      // no colon
                               "Basic YWxpY2U6",      // no password
                               "Basic OnBhc3M=",      // no user
                               "Basic YSBiOnBhc3M=",  // a blank in the name
                               "Basic YWxpY2U6cAB4",  // NUL
                               "Basic YWxp*",         // no base64
                               "Basic " + std::string(100'000, 'A')};
  for (const std::string& each : wrong) EXPECT_FALSE(readBasicLogin(each).has_value()) << each.substr(0, 80);
}

}  // namespace
}  // namespace zorva::access
