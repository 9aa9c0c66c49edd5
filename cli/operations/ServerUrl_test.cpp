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

TEST(ServerUrl, HasAUserWhichIsNotShown) {
  const ServerUrl url = readServerUrl("https://a%40b%25@h:1");
  EXPECT_EQ(url.user, "a@b%");
  EXPECT_EQ(url.shown(), "https://h:1");
  EXPECT_EQ(url.endpoint(), "https://h:1/cimom");
  EXPECT_EQ(readServerUrl("https://a@b@h").user, "a@b");
}

TEST(ServerUrl, NamesASocket) {
  const ServerUrl url = readServerUrl("unix:/run/x/cim.sock#root/interop");
  EXPECT_EQ(url.socket, "/run/x/cim.sock");
  EXPECT_EQ(url.nameSpace, "root/interop");
  EXPECT_EQ(url.shown(), "unix:/run/x/cim.sock");
  EXPECT_EQ(url.endpoint(), "http://localhost/cimom");
  EXPECT_EQ(readServerUrl("unix:").socket, "/run/zorvacimd/cim.sock");
  EXPECT_EQ(readServerUrl("unix:#interop").nameSpace, "interop");
  EXPECT_EQ(readServerUrl("unix:/s").nameSpace, "root/cimv2");
}

TEST(ServerUrl, IsRefusedWhereAPartIsWrong) {
  for (const char* text : {"",
                           "h:5988",
                           "ftp://h",
                           "http://",
                           "http:///root",
                           "http://h:0",
                           "http://h:65536",
                           "http://h:x",
                           "http://h:",
                           "http://[::1",
                           "http://[]",
                           "http://[::1]5988",
                           "http://a b",
                           "http://h/a b",
                           "http://h/a?b",
                           "http://h\r\nX: y/",
                           "http://h/root\n",
                           "https://@h",
                           "https://a%@h",
                           "https://a%0ab@h",
                           "https://a%3ab@h",
                           "https://a\nb@h",
                           "unix:s",
                           "unix:/s#a b"}) {
    EXPECT_THROW(readServerUrl(text), Failure) << text;
  }
}

void expectRefused(const char* text, const char* told) {
  try {
    readServerUrl(text);
    FAIL() << text;
  } catch (const Failure& failure) {
    EXPECT_EQ(failure.exitCode(), ExitCode::WrongUsage);
    EXPECT_THAT(failure.what(), testing::HasSubstr(told)) << text;
    EXPECT_THAT(failure.what() + failure.hint(), testing::Not(testing::HasSubstr("secr"))) << text;
  }
}

TEST(ServerUrl, TakesNoPasswordAndDoesNotRepeatIt) {
  for (const char* text : {"https://user:secret@h", "http://user:secret@a b/", "https://user:se/cr@h", "https://u:@h",
                           "https://user:se@cret@h"}) {
    expectRefused(text, "a password in a URL is not taken");
  }
}

TEST(ServerUrl, TakesNoLoginWithoutEncryption) {
  expectRefused("http://user@h", "a login needs https");
  expectRefused("http://user@localhost", "a login needs https");
}

}  // namespace
}  // namespace zorva::cli
