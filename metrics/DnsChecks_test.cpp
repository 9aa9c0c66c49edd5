#include "metrics/DnsChecks.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <stdexcept>
#include <thread>

#include "dns/testing/UdpServer.h"

namespace zorva::metrics {
namespace {

using namespace std::chrono_literals;
using agent::NodeType;
using agent::StringList;
using dns::testing::UdpServer;
using ::testing::ElementsAre;
using ::testing::HasSubstr;

std::shared_ptr<const StringList> list(StringList values) {
  return std::make_shared<const StringList>(std::move(values));
}

std::shared_ptr<const agent::TreeSnapshot> treeWith(const StringList& servers, const StringList& inFull = {}) {
  agent::TreeBuilder builder("host1");
  const std::size_t bmc = builder.add(0, NodeType::System, "bmc.1", "BMC");
  const std::size_t mgmt = builder.add(builder.add(bmc, NodeType::Port, "p"), NodeType::NetworkIPConfig, "ip");
  builder.set(mgmt, ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES, list({"192.0.2.99"}));
  const std::size_t system = builder.add(0, NodeType::System, "system", "Computer");
  builder.set(system, agent::kResolverServers, list({servers.front()}));
  for (const char* name : {"eth0", "eth1"}) {
    const std::size_t node = builder.add(builder.add(system, NodeType::Port, name), NodeType::NetworkIPConfig, "ip");
    builder.set(node, ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES, list(servers));
    if (!inFull.empty()) builder.set(node, agent::kDnsServersInFull, list(inFull));
  }
  return builder.finish();
}

std::string textOf(const DnsChecks& checks) {
  Exposition out;
  checks.write(out);
  return out.text();
}

/// The text once it says that, or after ten seconds.
std::string awaited(const DnsChecks& checks, const std::string& what) {
  const auto deadline = std::chrono::steady_clock::now() + 10s;
  std::string text = textOf(checks);
  while (text.find(what) == std::string::npos && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(5ms);
    text = textOf(checks);
  }
  return text;
}

TEST(DnsChecks, AskEachServerOfTheHostOnce) {
  EXPECT_THAT(serversToAsk(*treeWith({"192.0.2.1", "2001:db8::1", "nonsense"})),
              ElementsAre("192.0.2.1", "2001:db8::1"));
  EXPECT_THAT(serversToAsk(*treeWith({"192.0.2.1"}, {"192.0.2.1:5353#dns.example.org"})),
              ElementsAre("192.0.2.1", "192.0.2.1:5353"));
  StringList many;
  for (int i = 0; i < 200; ++i) many.push_back("192.0.2." + std::to_string(i));
  EXPECT_EQ(serversToAsk(*treeWith(many)).size(), kMostChecked);
}

TEST(DnsChecks, AskServersThatWereSetAndNotTheOwners) {
  EXPECT_THAT(serversToAsk(*treeWith({"192.0.2.77"}, {"192.0.2.1:5353"})), ElementsAre("192.0.2.77"));
}

TEST(DnsChecks, AskNobodyUntilTheyHaveAnInterval) {
  const DnsChecks checks([]() -> std::shared_ptr<const agent::TreeSnapshot> { throw std::logic_error("asked"); });
  EXPECT_EQ(textOf(checks), "");
}

TEST(DnsChecks, SayWhoAnswersAndForgetItWhenTheyAreSwitchedOff) {
  const UdpServer good("127.0.0.1", 0, UdpServer::answering());
  const UdpServer refusing("127.0.0.1", 0, UdpServer::answering(5));
  const std::string first = "127.0.0.1:" + std::to_string(good.port());
  const std::string second = "127.0.0.1:" + std::to_string(refusing.port());
  DnsChecks checks([&] { return treeWith({first, second}); });
  checks.setInterval(3600s);
  const std::string text = awaited(checks, "zorva_dns_check_timestamp_seconds");
  EXPECT_THAT(text, HasSubstr("zorva_dns_check_success{address=\"" + first + "\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_dns_check_success{address=\"" + second + "\"} 0\n"));
  EXPECT_THAT(text, HasSubstr("zorva_dns_check_duration_seconds{address=\"" + first + "\"} "));
  checks.setInterval(0s);
  EXPECT_EQ(textOf(checks), "");
}

TEST(DnsChecks, GoOnAfterATreeThatCannotBeRead) {
  const UdpServer good("127.0.0.1", 0, UdpServer::answering());
  std::atomic<int> looks = 0;
  DnsChecks checks([&] {
    if (looks++ == 0) throw std::runtime_error("no tree");
    return treeWith({"127.0.0.1:" + std::to_string(good.port())});
  });
  checks.setInterval(1s);
  EXPECT_THAT(awaited(checks, "_success"), HasSubstr("} 1\n"));
}

}  // namespace
}  // namespace zorva::metrics
