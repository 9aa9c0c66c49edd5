#include "agent/HostWatch.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>

#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::StartsWith;

std::string port(const std::string& name, const std::string& more) {
  return R"({"type": "Port", "name": ")" + name +
         R"(", "description": "", "children": [{"type": "NetworkIPConfig", "name": "ip", "description": "", )"
         R"("properties": {"name": ")" +
         name + "\"" + more + "}}]}";
}

/// A host whose tree is a file.
class HostWatchTest : public ::testing::Test {
 protected:
  HostWatchTest() {
    std::filesystem::create_directory(directory_ / "data");
    writeTree({port("eth0", kServers)});
    loadConfig(directory_.write("agent.toml",
                                "[agent]\ndata_dir = \"data/\"\n[tree]\nsource = \"file\"\nfile = "
                                "\"tree.json\"\n[bmc]\nfile = \"bmc.json\"\n"));
  }
  ~HostWatchTest() override { reset(); }

  void writeTree(const std::vector<std::string>& ports) const {
    std::string all;
    for (const std::string& each : ports) all += (all.empty() ? "" : ", ") + each;
    directory_.write("tree.json",
                     R"({"system_name": "host1", "nodes": [{"type": "System", "name": "system",
                       "description": "Computer", "children": [)" +
                         all + "]}]}");
  }

  /// What has changed, without version and time; waits until there is something.
  static std::vector<std::string> next(HostWatch& watch) {
    std::vector<HostChange> changes = watch.changes();
    const auto deadline = std::chrono::steady_clock::now() + 20s;
    while (changes.empty() && std::chrono::steady_clock::now() < deadline) {
      std::vector<pollfd> none;
      watch.wait(none, 20s);
      changes = watch.changes();
    }
    std::vector<std::string> lines;
    for (const HostChange& change : changes) {
      std::string line = jsonLine(change);
      EXPECT_THAT(line, StartsWith(R"({"version":1,"time":"2)"));
      EXPECT_EQ(line.find('\n'), line.size() - 1);
      const std::size_t system = line.find("\"system\"");
      lines.push_back("{" + line.substr(system, line.size() - system - 1));
    }
    return lines;
  }

  static constexpr const char* kServers = R"(, "dns_server_addresses": ["192.0.2.1"], "dns_owner": "NetworkManager")";
  const testing::TemporaryDirectory directory_;
};

TEST_F(HostWatchTest, HasNoChangesAtItsBegin) {
  HostWatch watch;
  EXPECT_THAT(watch.changes(), IsEmpty());
}

TEST_F(HostWatchTest, SaysWhichPropertyOfWhichInterfaceHasWhichValueAndWhoOwnsIt) {
  HostWatch watch;
  writeTree({port("eth0", R"(, "dns_server_addresses": ["192.0.2.1", "192.0.2.2"], "dns_owner": "NetworkManager")")});
  EXPECT_THAT(next(watch),
              ElementsAre(R"({"system":"host1","interface":"eth0","property":"dns_server_addresses",)"
                          R"("old":["192.0.2.1"],"new":["192.0.2.1","192.0.2.2"],"by":"NetworkManager"})"));
  writeTree({port("eth0", R"(, "dns_owner": "NetworkManager", "enabled_state": 16)")});
  EXPECT_THAT(next(watch),
              ElementsAre(R"({"system":"host1","interface":"eth0","property":"enabled_state","old":null,"new":16,)"
                          R"("by":"kernel"})",
                          R"({"system":"host1","interface":"eth0","property":"dns_server_addresses",)"
                          R"("old":["192.0.2.1","192.0.2.2"],"new":null,"by":"NetworkManager"})"));
}

TEST_F(HostWatchTest, SaysThatInterfacesComeAndGo) {
  HostWatch watch;
  writeTree({port("eth0", kServers), port("eth1", "")});
  EXPECT_THAT(next(watch), ElementsAre(R"({"system":"host1","interface":"eth1","property":"interface","old":null,)"
                                       R"("new":"eth1","by":"kernel"})"));
  writeTree({port("eth0", kServers)});
  EXPECT_THAT(next(watch), ElementsAre(R"({"system":"host1","interface":"eth1","property":"interface","old":"eth1",)"
                                       R"("new":null,"by":"kernel"})"));
}

TEST_F(HostWatchTest, SaysWhatWasSetInTheOverlay) {
  HostWatch watch;
  directory_.write("data/overlay.json", R"({"/system/eth0/ip": {"domain_name": "set.example"}})");
  EXPECT_THAT(next(watch), ElementsAre(R"({"system":"host1","interface":"eth0","property":"domain_name","old":null,)"
                                       R"("new":"set.example","by":"overlay.json"})"));
}

TEST_F(HostWatchTest, SaysWhatChangesInTheFilesOfSettings) {
  HostWatch watch;
  directory_.write("data/ifcfg-eth0", "DNSSERVERS=192.0.2.9\nOTHER=1\n");
  EXPECT_THAT(next(watch), ElementsAre(R"({"system":"host1","interface":"eth0","property":"ifcfg.DNSSERVERS",)"
                                       R"("old":null,"new":"192.0.2.9","by":"ifcfg-eth0"})"));
  std::filesystem::remove(directory_ / "data/ifcfg-eth0");
  EXPECT_THAT(next(watch), ElementsAre(R"({"system":"host1","interface":"eth0","property":"ifcfg.DNSSERVERS",)"
                                       R"("old":"192.0.2.9","new":null,"by":"ifcfg-eth0"})"));
}

TEST_F(HostWatchTest, WritesAnyBytesOnOneLine) {
  HostChange change;
  change.system = "host\n1";
  change.property = "name";
  change.after = std::string("a\xFF\"");
  const std::string line = jsonLine(change);
  EXPECT_EQ(line.find('\n'), line.size() - 1);
  EXPECT_NE(line.find(R"("system":"host\n1","interface":null,"property":"name","old":null,"new":"a)"),
            std::string::npos);
}

}  // namespace
}  // namespace zorva::agent
