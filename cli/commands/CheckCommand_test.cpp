// zorvactl check, with servers on port 53 of a separate network.

#include "agent/testing/NetworkNamespace.h"
#include "cli/output/Text.h"
#include "cli/testing/Running.h"
#include "dns/testing/UdpServer.h"

namespace zorva::cli {
namespace {

using dns::testing::UdpServer;
using Packets = std::vector<UdpServer::Packet>;

/// The name that a query asks for, for queries without odd names.
std::string nameIn(const std::string& query) {
  std::string name;
  for (std::size_t at = 12; query[at] != '\0'; at += 1 + static_cast<std::size_t>(query[at])) {
    name += (name.empty() ? "" : ".") + query.substr(at + 1, static_cast<std::size_t>(query[at]));
  }
  return name;
}

/// Knows every name but those under "gone".
UdpServer::Reply knowing() {
  return [](const std::string& query) {
    return Packets{{UdpServer::response(query, nameIn(query).ends_with("gone") ? 3 : 0)}};
  };
}

std::string treeOf(const std::string& systemProperties, const Words& ports) {
  return R"({"system_name": "host1", "nodes": [{"type": "System", "name": "system", "description": "Computer",)"
         R"("properties": {)" +
         systemProperties + R"(}, "children": [)" + joined(ports, ", ") + "]}]}";
}

/// Runs the work in a network of its own, whose loopback interface is up.
void inOwnNetwork(const std::function<void()>& work) {
  ZORVAGENT_NEEDS_NETWORK_NAMESPACE();
  EXPECT_TRUE(zorva::agent::testing::succeedsInChild([&work] {
    if (!zorva::agent::testing::enterNewNetwork()) return false;
    zorva::agent::testing::Interfaces().setUp("lo", true);
    work();
    return !testing::Test::HasFailure();
  }));
}

json checked(const TestHost& host, const Words& words, int exitCode) {
  Words all{"check", "-o", "json"};
  all.insert(all.end(), words.begin(), words.end());
  const Outcome outcome = host.run(all);
  EXPECT_EQ(outcome.exitCode, exitCode) << outcome.err;
  return contentOf(outcome.out);
}

TEST(Check, AsksEachServerOnceAndSaysNothingIsWrong) {
  inOwnNetwork([] {
    const UdpServer first("127.0.0.1", 53, knowing());
    const UdpServer other("127.0.0.2", 5353, knowing());
    const TestHost host;
    host.writeTree(treeOf(R"("resolver_servers": ["127.0.0.1"], "resolver_search": ["example.org"])",
                          {TestHost::port("eth0", R"("dns_server_addresses": ["127.0.0.1"])"),
                           TestHost::port("tun0", R"("dns_server_addresses": ["127.0.0.2"],)"
                                                  R"("dns_servers_in_full": ["127.0.0.2:5353#dns.example.org"],)"
                                                  R"("dns_suffixes": ["corp.example.net"])")}));
    const json result = checked(host, {}, 0);
    EXPECT_EQ(result["question"], json::parse(R"({"name": ".", "type": "SOA"})"));
    ASSERT_EQ(result["servers"].size(), 2U) << result.dump();
    EXPECT_EQ(result["servers"][0]["server"], "127.0.0.1");
    EXPECT_EQ(result["servers"][0]["used_by"], json::parse(R"(["eth0", "host"])"));
    EXPECT_EQ(result["servers"][0]["code"], "NOERROR");
    EXPECT_GT(result["servers"][0]["time_ms"], 0);
    EXPECT_EQ(result["servers"][1]["server"], "127.0.0.2:5353");
    EXPECT_EQ(result["problems"], json::array());
    EXPECT_EQ(first.queries(), 2) << "the root, and example.org";
    EXPECT_EQ(other.queries(), 2) << "the root, and corp.example.net";
    EXPECT_THAT(shown(host, {"check", "eth0"}), testing::MatchesRegex("SERVER +TIME +ANSWER +USED BY\n"
                                                                      "127.0.0.1  [0-9.]+ ms  NOERROR  eth0\n"));
  });
}

TEST(Check, NamesWhatIsWrong) {
  inOwnNetwork([] {
    const UdpServer good("127.0.0.1", 53, knowing());
    const UdpServer refusing("127.0.0.2", 53, UdpServer::answering(5));
    const UdpServer silent("127.0.0.3", 53, [](const std::string&) { return Packets{}; });
    const UdpServer spoofed("127.0.0.4", 53, [](const std::string& query) {
      return Packets{{UdpServer::response(query), true}};
    });
    const TestHost host;
    host.writeTree(treeOf(
        R"("resolver_servers": ["127.0.0.1"], "resolver_servers_not_asked": ["127.0.0.9"], "resolver_search": ["is.gone"])",
        {TestHost::port("eth0", R"("dns_server_addresses": ["127.0.0.1", "127.0.0.2", "127.0.0.3", "127.0.0.4",)"
                                R"("127.0.0.5", "127.0.0.1", "2001:db8::53", "nonsense"])")}));
    const json result = checked(host, {}, 1);
    std::map<std::string, std::string> outcomes;
    for (const json& row : result["servers"]) {
      outcomes[row["server"]] = row["code"].is_null() ? row["outcome"] : row["code"];
    }
    EXPECT_EQ(outcomes, (std::map<std::string, std::string>{{"127.0.0.1", "NOERROR"},
                                                            {"127.0.0.2", "REFUSED"},
                                                            {"127.0.0.3", "no answer"},
                                                            {"127.0.0.4", "no answer"},
                                                            {"127.0.0.5", "unreachable"},
                                                            {"127.0.0.9", "unreachable"},
                                                            {"2001:db8::53", "unreachable"},
                                                            {"nonsense", "unreachable"}}));
    EXPECT_EQ(result["problems"],
              json::parse(R"(["eth0 has 127.0.0.1 twice; it is never asked a second time in its turn",
                "127.0.0.9 is never asked: /etc/resolv.conf has it after the first three servers",
                "127.0.0.2 (eth0): it says REFUSED", "127.0.0.3 (eth0): no answer", "127.0.0.4 (eth0): no answer",
                "127.0.0.5 (eth0): unreachable: Connection refused",
                "2001:db8::53 (eth0): unreachable: Network is unreachable",
                "nonsense (eth0): unreachable: this is no address",
                "127.0.0.9 (host): unreachable: Connection refused",
                "the suffix is.gone (host) does not resolve"])"));
    const Outcome table = host.run({"check"});
    EXPECT_EQ(table.exitCode, 1);
    EXPECT_THAT(table.out,
                AllOf(HasSubstr("\nis.gone  does not resolve  host\n"), HasSubstr("\n127.0.0.3     -       ")));
    EXPECT_EQ(table.err,
              "zorvactl: 10 problems, the first: eth0 has 127.0.0.1 twice; it is never asked a second time in "
              "its turn\n");
  });
}

TEST(Check, AsksForANameThatIsGiven) {
  inOwnNetwork([] {
    const UdpServer server("127.0.0.1", 53, knowing());
    const TestHost host({TestHost::port("eth0", R"("dns_server_addresses": ["127.0.0.1"])")});
    EXPECT_EQ(checked(host, {"--name", "www.example.org"}, 0)["question"],
              json::parse(R"({"name": "www.example.org", "type": "A"})"));
    EXPECT_EQ(checked(host, {"--name", "www.gone"}, 1)["servers"][0]["code"], "NXDOMAIN");
  });
}

TEST(Check, RefusesWhatItCannotAsk) {
  expectRefused(TestHost(), {"check", "--name", "a..b"}, 2, "'a..b' is no name that can be asked for");
  expectRefused(TestHost(), {"check", "eth7"}, 1, "no interface eth7");
  expectRefused(TestHost(), {"check", "--url", "http://127.0.0.1:1"}, 2, "from this host");
  expectRefused(TestHost({TestHost::port("eth0", R"("dns_server_addresses": [])")}), {"check"}, 1,
                "there is no DNS server to ask");
}

}  // namespace
}  // namespace zorva::cli
