// The page /metrics of the running zorvacimd.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>

#include <chrono>
#include <regex>
#include <set>
#include <sstream>
#include <thread>

#include "http/testing/TestWire.h"
#include "server/testing/TestDaemon.h"

namespace zorva::server {
namespace {

using http::testing::Wire;
using http::testing::WireResponse;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;
using testing::TestDaemon;

WireResponse request(int port, const std::string& path = "/metrics") {
  Wire wire(port);
  wire.send("GET " + path + " HTTP/1.1\r\nHost: localhost\r\n\r\n");
  return wire.receive();
}

TEST(Metrics, AreReadOnLoopbackWithoutALogin) {
  const TestDaemon daemon;
  const WireResponse page = request(daemon.port());
  EXPECT_EQ(page.status, 200);
  EXPECT_EQ(page.headers.at("content-type"), "text/plain; version=0.0.4; charset=utf-8");
  EXPECT_THAT(page.body, HasSubstr("zorva_dns_server_info{system=\"host\",interface=\"eth0\",order=\"1\",address=\""));
  EXPECT_THAT(page.body, HasSubstr("\nzorva_host_readable 1\n"));
  EXPECT_THAT(page.body, Not(HasSubstr("zorva_dns_check"))) << "no server is asked unless that is configured";
}

TEST(Metrics, HaveOnlyAHeadForHead) {
  const TestDaemon daemon;
  Wire wire(daemon.port());
  wire.send("HEAD /metrics HTTP/1.1\r\nHost: localhost\r\nConnection: close\r\n\r\n");
  const std::string head = wire.take(100'000, std::chrono::seconds(20));
  EXPECT_THAT(head, StartsWith("HTTP/1.1 200"));
  EXPECT_THAT(head, HasSubstr("Content-Type: text/plain; version=0.0.4; charset=utf-8\r\n"));
  EXPECT_THAT(head, EndsWith("\r\n\r\n"));
}

TEST(Metrics, NeedALoginWhereReadingNeedsOne) {
  const TestDaemon daemon("[access]\nanonymous = \"none\"\n");
  EXPECT_EQ(request(daemon.port()).status, 401);
}

TEST(Metrics, CountWhatTheServerDoes) {
  const TestDaemon daemon;
  for (const char* each : {"ZORVA_DNSProtocolEndPoint", "ZORVA_Nonesuch"}) {
    Wire wire(daemon.port());
    wire.send(http::testing::enumeration("EnumerateInstanceNames", each));
    wire.receive();
  }
  EXPECT_EQ(request(daemon.port(), "/nonesuch").status, 405);
  const std::string text = request(daemon.port()).body;
  EXPECT_THAT(text, HasSubstr("zorva_cim_operations_total{operation=\"EnumerateInstanceNames\",status=\"0\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_cim_operations_total{operation=\"EnumerateInstanceNames\",status=\"5\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_http_requests_total{target=\"cim\",code=\"200\"} 2\n"));
  EXPECT_THAT(text, HasSubstr("zorva_http_requests_total{target=\"cim\",code=\"405\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_http_request_duration_seconds_count{target=\"cim\"} 3\n"));
}

TEST(Metrics, AreLinesOfTheTextFormatWithEachSeriesOnce) {
  const TestDaemon daemon;
  const std::regex form(R"(# (HELP [a-z_]+ .+|TYPE [a-z_]+ (counter|gauge|histogram))|[a-z_]+(\{.*\})? [-+0-9.eInf]+)");
  std::istringstream lines(request(daemon.port()).body);
  std::set<std::string> seen;
  for (std::string line; std::getline(lines, line);) {
    EXPECT_TRUE(std::regex_match(line, form)) << line;
    EXPECT_TRUE(seen.insert(line.substr(0, line.rfind(' '))).second) << line;
  }
  EXPECT_GT(seen.size(), 40U);
}

TEST(Metrics, SayThatTheHostCannotBeReadAndGoOn) {
  const TestDaemon daemon;
  daemon.directory().write("tree.json", "no tree");
  const WireResponse page = request(daemon.port());
  EXPECT_EQ(page.status, 200);
  EXPECT_THAT(page.body, HasSubstr("\nzorva_host_readable 0\n"));
  EXPECT_THAT(page.body, HasSubstr("\nzorva_build_info{"));
}

TEST(Metrics, HaveTheAnswersOfServersAsSoonAsThatIsConfigured) {
  const TestDaemon daemon;
  daemon.directory().write("tree.json", R"({"system_name": "host1", "nodes": [
    {"type": "System", "name": "system", "description": "Computer", "properties": {"resolver_servers": ["127.0.0.9"]}}]})");
  daemon.writeConfig("[metrics]\ncheck_interval = 1\n");
  daemon.signal(SIGHUP);
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(20);
  std::string text;
  while (text.find("zorva_dns_check_success{") == std::string::npos && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
    text = request(daemon.port()).body;
  }
  EXPECT_THAT(text, HasSubstr("zorva_dns_check_success{address=\"127.0.0.9\"} "));
}

}  // namespace
}  // namespace zorva::server
