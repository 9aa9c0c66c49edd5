#include "cli/operations/ServerUrl.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cli/output/Failure.h"

namespace zorva::cli {
namespace {

TEST(ServerUrl, HasHostPortAndNamespace) {
  const ServerUrl url = readServerUrl("HTTP://cim.example.org:15988/root/PG_X/");
  EXPECT_EQ(url.scheme, "http");
  EXPECT_EQ(url.host, "cim.example.org");
  EXPECT_EQ(url.port, "15988");
  EXPECT_EQ(url.nameSpace, "root/PG_X");
  EXPECT_EQ(url.endpoint(), "http://cim.example.org:15988/cimom");
}

TEST(ServerUrl, MayLeaveOutPortAndNamespace) {
  EXPECT_EQ(readServerUrl("http://h").endpoint(), "http://h:5988/cimom");
  EXPECT_EQ(readServerUrl("https://h/").endpoint(), "https://h:5989/cimom");
  EXPECT_EQ(readServerUrl("http://h").nameSpace, "root/cimv2");
}

TEST(ServerUrl, TakesAddressesInBrackets) {
  const ServerUrl url = readServerUrl("http://[::1]:5988/interop");
  EXPECT_EQ(url.shown(), "http://[::1]:5988");
  EXPECT_EQ(url.nameSpace, "interop");
}

TEST(ServerUrl, DoesNotShowTheLogin) {
  const ServerUrl url = readServerUrl("http://user:p@ss@h:1");
  EXPECT_EQ(url.login, "user:p@ss");
  EXPECT_EQ(url.shown(), "http://h:1");
}

TEST(ServerUrl, IsRefusedWhereAPartIsWrong) {
  for (const char* text : {"", "h:5988", "ftp://h", "http://", "http:///root", "http://h:0", "http://h:65536",
                           "http://h:x", "http://h:", "http://[::1", "http://[]", "http://[::1]5988", "http://a b",
                           "http://h/a b", "http://h/a?b", "http://h\r\nX: y/", "http://h/root\n"}) {
    EXPECT_THROW(readServerUrl(text), Failure) << text;
  }
}

TEST(ServerUrl, IsNotShownInErrorsBecauseItMayContainAPassword) {
  try {
    readServerUrl("http://user:secret@a b/");
    FAIL();
  } catch (const Failure& failure) {
    EXPECT_EQ(failure.exitCode(), ExitCode::WrongUsage);
    EXPECT_THAT(failure.what(), testing::Not(testing::HasSubstr("secret")));
  }
}

}  // namespace
}  // namespace zorva::cli
