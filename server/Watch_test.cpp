// The page /watch of the running zorvacimd.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>

#include <chrono>
#include <memory>
#include <vector>

#include "http/testing/TestWire.h"
#include "server/testing/TestDaemon.h"

namespace zorva::server {
namespace {

using http::testing::Wire;
using std::chrono::milliseconds;
using std::chrono::seconds;
using ::testing::HasSubstr;
using testing::TestDaemon;

/// A client that watches.
class Watcher {
 public:
  explicit Watcher(const TestDaemon& daemon) : wire_(daemon.port()) {
    wire_.send("GET /watch HTTP/1.1\r\nHost: localhost\r\n\r\n");
  }

  /// What has come, once that text has; else what came in twenty seconds.
  const std::string& until(const std::string& text) {
    const auto deadline = std::chrono::steady_clock::now() + seconds(20);
    while (text_.find(text) == std::string::npos && std::chrono::steady_clock::now() < deadline) {
      text_ += wire_.take(4096, milliseconds(20));
    }
    return text_;
  }

  /// Until the server says that it watches.
  const std::string& begun() { return until("\r\n1\r\n\n\r\n"); }

  Wire& wire() { return wire_; }

 private:
  Wire wire_;
  std::string text_;
};

void set(const TestDaemon& daemon, const std::string& domain) {
  daemon.directory().write("data/overlay.json", R"({"/system/eth0/ip": {"domain_name": ")" + domain + "\"}}");
}

TEST(Watch, SaysWhatChangesToAllThatWatch) {
  const TestDaemon daemon;
  Watcher first(daemon);
  Watcher second(daemon);
  EXPECT_THAT(first.begun(), HasSubstr("Content-Type: application/x-ndjson; charset=utf-8\r\n"));
  second.begun();
  set(daemon, "a.example");
  const std::string line = R"("interface":"eth0","property":"domain_name","old":"example.org","new":"a.example",)"
                           R"("by":"overlay.json"})";
  EXPECT_THAT(first.until("a.example"), HasSubstr(line));
  EXPECT_THAT(second.until("a.example"), HasSubstr(line));
}

TEST(Watch, SaysWhichUserMadeAChange) {
  const TestDaemon daemon("[access]\nanonymous = \"operate\"\n");
  Watcher watcher(daemon);
  watcher.begun();
  Wire wire(daemon.port());
  wire.send(testing::changeOfDomain());
  wire.receive();
  EXPECT_THAT(watcher.until("\"by\""), HasSubstr("\"by\":\"anonymous\""));
}

TEST(Watch, TakesNoMoreClientsThanConfigured) {
  const TestDaemon daemon("[watch]\nclients = 1\n");
  auto watcher = std::make_unique<Watcher>(daemon);
  watcher->begun();
  Wire another(daemon.port());
  another.send("GET /watch HTTP/1.1\r\nHost: localhost\r\n\r\n");
  const auto refusal = another.receive();
  EXPECT_EQ(refusal.status, 503);
  EXPECT_THAT(refusal.body, HasSubstr("as many clients watch as may, which are 1"));
  watcher.reset();
  // The next changes show that it is gone.
  int status = 503;
  const auto deadline = std::chrono::steady_clock::now() + seconds(20);
  for (int i = 0; status == 503 && std::chrono::steady_clock::now() < deadline; ++i) {
    set(daemon, "a" + std::to_string(i) + ".example");
    Wire again(daemon.port());
    again.send("GET /watch HTTP/1.1\r\nHost: localhost\r\n\r\n");
    const std::string head = again.take(4096, milliseconds(300));
    status = head.starts_with("HTTP/1.1 200") ? 200 : 503;
  }
  EXPECT_EQ(status, 200);
}

TEST(Watch, NeedsALoginWhereReadingNeedsOne) {
  const TestDaemon daemon("[access]\nanonymous = \"none\"\n");
  Wire wire(daemon.port());
  wire.send("GET /watch HTTP/1.1\r\nHost: localhost\r\n\r\n");
  EXPECT_EQ(wire.receive().status, 401);
}

TEST(Watch, ClientsThatWatchKeepNoWorkerFromOthers) {
  const TestDaemon daemon("[limits]\nworkers = 1\nrequests = 2\n");
  std::vector<std::unique_ptr<Watcher>> watchers;
  for (int i = 0; i < 10; ++i) watchers.push_back(std::make_unique<Watcher>(daemon));
  for (const auto& each : watchers) each->begun();
  Wire wire(daemon.port());
  wire.send(http::testing::enumeration("EnumerateInstanceNames", "ZORVA_DNSProtocolEndPoint"));
  EXPECT_EQ(wire.receive().status, 200);
}

TEST(Watch, EndsWithTheServer) {
  TestDaemon daemon;
  Watcher watcher(daemon);
  watcher.begun();
  daemon.signal(SIGTERM);
  EXPECT_EQ(daemon.exitCodeWithin(seconds(20)), 0);
  EXPECT_TRUE(watcher.wire().isClosedWithin(seconds(5)));
}

}  // namespace
}  // namespace zorva::server
