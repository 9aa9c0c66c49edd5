#include "metrics/HostMetrics.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>

#include "agent/Agent.h"
#include "agent/testing/TemporaryDirectory.h"

namespace zorva::metrics {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;

/// A host whose tree is a file.
class HostMetricsTest : public ::testing::Test {
 protected:
  HostMetricsTest() {
    std::filesystem::create_directory(directory_ / "data");
    config_ = directory_.write("agent.toml",
                               "[agent]\ndata_dir = \"data/\"\n[tree]\nsource = \"file\"\nfile = \"tree.json\"\n");
  }

  static std::string port(const std::string& name, const std::string& properties) {
    return R"({"type": "Port", "name": ")" + name +
           R"(", "description": "", "children": [{"type": "NetworkIPConfig", "name": "ip", "description": "", )"
           R"("properties": {)" +
           properties + "}}]}";
  }
  static std::string system(const std::string& name, const std::string& description, const std::string& properties,
                            const std::string& ports) {
    return R"({"type": "System", "name": ")" + name + R"(", "description": ")" + description + R"(", "properties": {)" +
           properties + R"(}, "children": [)" + ports + "]}";
  }

  std::shared_ptr<const agent::TreeSnapshot> tree(const std::string& systems) {
    directory_.write("tree.json", R"({"system_name": "host1", "nodes": [)" + systems + "]}");
    agent::loadConfig(config_);
    return agent::currentTree();
  }

  std::string treeText(const std::string& systems, std::uint64_t now = 1000) {
    Exposition out;
    const auto read = tree(systems);
    writeTree(out, *read);
    writeServiceProcessors(out, *read, now);
    return out.text();
  }

  std::string driftText(const std::string& properties) {
    tree(system("system", "Computer", "", port("eth0", R"("name": "eth0", )" + properties)));
    Exposition out;
    writeDrift(out, agent::settingsDrift());
    return out.text();
  }

  agent::testing::TemporaryDirectory directory_;
  std::string config_;
};

TEST_F(HostMetricsTest, HaveTheServersInOrderWithTheirOwner) {
  const std::string text =
      treeText(system("system", "Computer", "",
                      port("eth0", R"("name": "eth0", "dns_owner": "NetworkManager", "enabled_state": 1,
                             "dns_server_addresses": ["192.0.2.53", "2001:db8::53"], "dns_suffixes": ["example.org"])") +
                          ", " + port("eth1", R"("name": "eth1", "enabled_state": 16)")));
  EXPECT_THAT(text, HasSubstr("zorva_dns_server_info{system=\"host\",interface=\"eth0\",order=\"1\","
                              "address=\"192.0.2.53\",owner=\"NetworkManager\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("order=\"2\",address=\"2001:db8::53\",owner=\"NetworkManager\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_dns_servers{system=\"host\",interface=\"eth0\"} 2\n"));
  EXPECT_THAT(text, HasSubstr("zorva_dns_suffixes{system=\"host\",interface=\"eth0\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_interface_carrier{system=\"host\",interface=\"eth0\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_interface_enabled{system=\"host\",interface=\"eth1\"} 0\n"));
  EXPECT_THAT(text, Not(HasSubstr("zorva_dns_servers{system=\"host\",interface=\"eth1\"}")));
}

TEST_F(HostMetricsTest, SayHowOldTheStateOfTheServiceProcessorIs) {
  const std::string host = system("system", "Computer", "\"resolver_servers\": [\"192.0.2.1\"]", "");
  const std::string bmc = system("bmc.1", "BMC", R"("read_at": 900, "read_interval": 60, "read_problem": "no answer")",
                                 port("mgmt0", R"("name": "mgmt0", "dns_server_addresses": ["192.0.2.7"])"));
  const std::string text = treeText(host + ", " + bmc);
  EXPECT_THAT(text, HasSubstr("zorva_bmc_state_age_seconds{bmc=\"bmc.1\"} 100\n"));
  EXPECT_THAT(text, HasSubstr("zorva_bmc_read_failed{bmc=\"bmc.1\"} 1\n"));
  EXPECT_THAT(text, HasSubstr("zorva_dns_server_info{system=\"bmc\",interface=\"mgmt0\""));
  EXPECT_THAT(text, HasSubstr("zorva_resolver_server_info{order=\"1\",address=\"192.0.2.1\"} 1\n"));
}

TEST_F(HostMetricsTest, HaveOneSeriesForInterfacesOfOneName) {
  const std::string same = R"("name": "eth0", "dns_server_addresses": ["192.0.2.1"])";
  const std::string text = treeText(system("system", "Computer", "", port("p0", same) + ", " + port("p1", same)));
  EXPECT_EQ(text.find("zorva_dns_servers{system=\"host\",interface=\"eth0\"}"),
            text.rfind("zorva_dns_servers{system=\"host\",interface=\"eth0\"}"));
}

TEST(HostMetrics, LeaveOutWhatIsBeyondTheLimits) {
  const auto servers = std::make_shared<const agent::StringList>(kMostServersOfInterface + 3, "192.0.2.1");
  agent::TreeBuilder builder("host1");
  const std::size_t system = builder.add(0, agent::NodeType::System, "system", "Computer");
  for (std::size_t i = 0; i < kMostInterfaces + 2; ++i) {
    const std::string name = "i" + std::to_string(i);
    const std::size_t port = builder.add(system, agent::NodeType::Port, name);
    const std::size_t node = builder.add(port, agent::NodeType::NetworkIPConfig, "ip");
    builder.set(node, ZV::NodeLexicon::PROP_NAME, name);
    builder.set(node, ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES, servers);
  }
  Exposition out;
  writeTree(out, *builder.finish());
  EXPECT_THAT(out.text(), HasSubstr("zorva_metrics_left_out{what=\"interfaces\"} 2\n"));
  const std::size_t leftOut = kMostInterfaces * (kMostServersOfInterface + 3) - kMostServers;
  EXPECT_THAT(out.text(), HasSubstr("zorva_metrics_left_out{what=\"servers\"} " + std::to_string(leftOut) + "\n"));
  EXPECT_LT(out.text().size(), std::size_t{16} << 20);
}

TEST_F(HostMetricsTest, SayWhereTheHostDiffersFromTheFileOfAnInterface) {
  const std::string has = R"("dns_server_addresses": ["192.0.2.1", "192.0.2.2"], "domain_name": "example.org")";
  EXPECT_EQ(driftText(has), "") << "nothing is set";
  directory_.write("data/ifcfg-eth0", "DNSSERVERS=192.0.2.1 192.0.2.2\nDOMAINNAME=Example.org\n");
  EXPECT_THAT(driftText(has), HasSubstr("{interface=\"eth0\",setting=\"servers\"} 0\n"));
  EXPECT_THAT(driftText(has), HasSubstr("{interface=\"eth0\",setting=\"domain\"} 0\n"));
  EXPECT_THAT(driftText(has), Not(HasSubstr("suffixes\"}")));
  directory_.write("data/ifcfg-eth0", "DNSSERVERS=192.0.2.2 192.0.2.1\nDOMAINNAME=other.example\n");
  EXPECT_THAT(driftText(has), HasSubstr("{interface=\"eth0\",setting=\"servers\"} 1\n"));
  EXPECT_THAT(driftText(has), HasSubstr("{interface=\"eth0\",setting=\"domain\"} 1\n"));
}

TEST_F(HostMetricsTest, KnowWhatOwnersMakeOfTheSettings) {
  directory_.write("data/ifcfg-eth0",
                   "DNSSERVERS=2001:db8::1 192.0.2.1\nDNSSUFFIXES=a.example b.example\n"
                   "DOMAINNAME=example.org\n");
  const std::string text = driftText(R"("dns_server_addresses": ["192.0.2.1", "2001:db8::1"],
                                        "dns_suffixes": ["example.org", "a.example", "b.example"])");
  EXPECT_THAT(text, HasSubstr("setting=\"servers\"} 0\n")) << "the families are kept apart";
  EXPECT_THAT(text, HasSubstr("setting=\"suffixes\"} 0\n")) << "the domain is the first";
  EXPECT_THAT(text, HasSubstr("setting=\"domain\"} 0\n"));
}

TEST_F(HostMetricsTest, CountSettingsThatCannotBeAppliedAsDrift) {
  directory_.write("data/ifcfg-eth0", "DNSSERVERS=nonsense\n");
  EXPECT_THAT(driftText(R"("dns_server_addresses": [])"), HasSubstr("setting=\"servers\"} 1\n"));
}

}  // namespace
}  // namespace zorva::metrics
