// The console as the running server sends it. What it does in a browser is tested by tests/console.

#include "server/ConsolePages.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <set>
#include <string>

#include "http/testing/TestWire.h"
#include "server/testing/TestDaemon.h"

namespace zorva::server {
namespace {

using http::testing::Wire;
using http::testing::WireResponse;
using ::testing::HasSubstr;
using ::testing::StartsWith;
using testing::TestDaemon;

WireResponse get(const TestDaemon& daemon, const std::string& path, const std::string& fields = {}) {
  Wire wire(daemon.port());
  wire.send("GET " + path + " HTTP/1.1\r\nHost: localhost\r\n" + fields + "\r\n");
  return wire.receive();
}

constexpr const char* kBrowser = "Accept: text/html,application/xhtml+xml,*/*;q=0.8\r\n";

TEST(Console, ABrowserGetsThePageAndAProgramTheText) {
  const TestDaemon daemon;
  const WireResponse page = get(daemon, "/", kBrowser);
  EXPECT_EQ(page.status, 200);
  EXPECT_EQ(page.headers.at("content-type"), "text/html; charset=utf-8");
  EXPECT_THAT(page.body, StartsWith("<!doctype html>"));
  EXPECT_THAT(get(daemon, "/", "Accept: */*\r\n").body, StartsWith("This is zorvacimd "));
}

TEST(Console, EachFileIsSentWithTheFieldsThatLockItIn) {
  const TestDaemon daemon;
  for (std::size_t i = 0; i < kConsoleFileCount; ++i) {
    SCOPED_TRACE(kConsoleFiles[i].name);
    const WireResponse file = get(daemon, "/console/" + std::string(kConsoleFiles[i].name));
    EXPECT_EQ(file.status, 200);
    EXPECT_EQ(file.body, kConsoleFiles[i].text);
    EXPECT_EQ(file.headers.at("x-content-type-options"), "nosniff");
    EXPECT_EQ(file.headers.at("referrer-policy"), "no-referrer");
    EXPECT_EQ(file.headers.at("cache-control"), "no-cache");
    EXPECT_EQ(file.headers.at("content-security-policy"),
              "default-src 'none'; script-src 'self'; style-src 'self'; img-src 'self'; connect-src 'self'; "
              "base-uri 'none'; form-action 'none'; frame-ancestors 'none'");
  }
}

TEST(Console, AFileThatTheBrowserHasIsNotSentAgain) {
  const TestDaemon daemon;
  const std::string tag = get(daemon, "/console/style.css").headers.at("etag");
  const WireResponse again = get(daemon, "/console/style.css", "If-None-Match: \"other\", " + tag + "\r\n");
  EXPECT_EQ(again.status, 304);
  EXPECT_EQ(again.body, "");
  EXPECT_EQ(get(daemon, "/console/style.css", "If-None-Match: \"other\"\r\n").status, 200);
}

TEST(Console, NoPathLeadsAnywhereElse) {
  const TestDaemon daemon;
  for (const char* path : {"/console/", "/console/../etc/passwd", "/console/%2e%2e/agent.toml", "/console/none.js"}) {
    EXPECT_EQ(get(daemon, path, kBrowser).status, 405) << path;
  }
}

TEST(Console, APageOfAnotherOriginDoesNotGetIt) {
  const TestDaemon daemon;
  EXPECT_EQ(get(daemon, "/console/style.css", "Origin: http://www.example.org\r\n").status, 403);
  EXPECT_EQ(get(daemon, "/console/style.css", "Origin: http://localhost\r\n").status, 200);
}

TEST(Console, ItCanBeSwitchedOff) {
  const TestDaemon daemon("[http]\nconsole = false\n");
  EXPECT_THAT(get(daemon, "/", kBrowser).body, StartsWith("This is zorvacimd "));
  EXPECT_EQ(get(daemon, "/console/style.css").status, 405);
}

TEST(Console, NothingOfItIsInline) {
  for (std::size_t i = 0; i < kConsoleFileCount; ++i) {
    const std::string text(kConsoleFiles[i].text);
    SCOPED_TRACE(kConsoleFiles[i].name);
    EXPECT_THAT(text, Not(HasSubstr("innerHTML")));
    EXPECT_THAT(text, Not(HasSubstr("eval(")));
    if (!kConsoleFiles[i].name.ends_with(".html")) continue;
    EXPECT_THAT(text, Not(HasSubstr(" style=")));
    EXPECT_THAT(text, Not(HasSubstr("<style")));
    EXPECT_THAT(text, Not(HasSubstr("<script>")));
    EXPECT_THAT(text, Not(HasSubstr("https://")));
  }
}

}  // namespace
}  // namespace zorva::server
