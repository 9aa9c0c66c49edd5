#include "agent/sources/BmcSource.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "agent/testing/LogLines.h"
#include "agent/testing/TemporaryDirectory.h"
#include "agent/testing/Trees.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;
using std::chrono::seconds;
using std::chrono::system_clock;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using testing::LogLines;
using testing::TemporaryDirectory;

std::string port(const std::string& name) {
  return R"({"type": "Port", "name": ")" + name +
         R"(", "children": [{"type": "NetworkIPConfig", "name": "ip", "properties": {"name": ")" + name +
         R"(", "enabled_state": 1, "dns_server_addresses": ["192.0.2.53"]}}]})";
}

std::string manager(const std::string& name, const std::string& ports) {
  return R"({"type": "System", "name": ")" + name + R"(", "description": "BMC", "children": [)" + ports + "]}";
}

std::string document(const std::string& nodes, const std::string& problem = "") {
  return R"({"read_at": 1000, "interval": 60, "problem": ")" + problem + R"(", "nodes": [)" + nodes + "]}";
}

class BmcSourceTest : public ::testing::Test {
 protected:
  std::vector<std::string> paths() {
    std::vector<std::string> found;
    tree_ = source_.read();
    for (const Node& node : tree_->nodes()) {
      if (node.type() == NodeType::NetworkIPConfig) found.push_back(node.path());
    }
    return found;
  }

  void write(const std::string& text) { directory_.write("bmc.json", text); }

  // The log's line after a reading of that file.
  std::string whyLeftOut(const std::string& text) {
    const LogLines log;
    write(text);
    EXPECT_TRUE(source_.changed());
    EXPECT_THAT(paths(), ElementsAre("/system/eth0/ip")) << text.substr(0, 200);
    paths();
    EXPECT_EQ(log.lines.size(), 1U) << "the same problem is logged once: " << text.substr(0, 200);
    return log.lines.empty() ? std::string() : log.lines.front();
  }

  TemporaryDirectory directory_;
  std::shared_ptr<const TreeSnapshot> host_ = testing::treeFromJson(
      R"({"system_name": "host1", "nodes": [{"type": "System", "name": "system", "description": "Computer",
          "children": [)" +
      port("eth0") + "]}]}");
  std::uint64_t now_ = 1010;
  BmcSource source_{std::make_shared<testing::FixedSource>(host_), directory_ / "bmc.json",
                    [this] { return system_clock::time_point(seconds(now_)); }};
  std::shared_ptr<const TreeSnapshot> tree_;
};

TEST_F(BmcSourceTest, AddsTheServiceProcessorsAfterTheHost) {
  EXPECT_THAT(paths(), ElementsAre("/system/eth0/ip")) << "there is no file yet";
  EXPECT_EQ(tree_, host_);
  write(document(manager("bmc.1", port("mgmt0")) + "," + manager("bmc.2", port("mgmt0")), "no answer"));
  EXPECT_TRUE(source_.changed());
  EXPECT_THAT(paths(), ElementsAre("/system/eth0/ip", "/bmc.1/mgmt0/ip", "/bmc.2/mgmt0/ip"));
  const Node& bmc = *tree_->find("/bmc.1");
  EXPECT_TRUE(bmc.isServiceProcessor());
  EXPECT_EQ(*bmc.number(kReadAt), 1000U);
  EXPECT_EQ(*bmc.number(kReadInterval), 60U);
  EXPECT_EQ(*bmc.text(kReadProblem), "no answer");
  EXPECT_EQ(tree_->systemName(), "host1");
}

TEST_F(BmcSourceTest, OneWithAnInterfaceOfTheHostsNameComesFirstSoThatTheHostsEndpointStays) {
  write(document(manager("bmc.1", port("eth0")) + "," + manager("bmc.2", port("mgmt0"))));
  EXPECT_THAT(paths(), ElementsAre("/bmc.1/eth0/ip", "/system/eth0/ip", "/bmc.2/mgmt0/ip"));
  EXPECT_EQ(*tree_->find("/bmc.1/eth0/ip")->text(PROP_NAME), "eth0") << "names are as they are";
}

TEST_F(BmcSourceTest, AfterTenIntervalsTheStateIsUnknownAndTheRestStays) {
  write(document(manager("bmc.1", port("mgmt0"))));
  paths();
  now_ = 1000 + 600;
  paths();
  EXPECT_NE(tree_->find("/bmc.1/mgmt0/ip")->number(PROP_ENABLED_STATE), nullptr);
  now_ = 1000 + 601;
  EXPECT_TRUE(source_.changed()) << "no file has changed, but time has passed";
  paths();
  const Node& node = *tree_->find("/bmc.1/mgmt0/ip");
  EXPECT_EQ(node.number(PROP_ENABLED_STATE), nullptr);
  EXPECT_EQ(*node.list(PROP_DNS_SERVER_ADDRESSES), StringList{"192.0.2.53"});
  EXPECT_NE(tree_->find("/system/eth0/ip")->number(PROP_ENABLED_STATE), nullptr);
  now_ = 1;
  EXPECT_TRUE(source_.changed());
  paths();
  EXPECT_NE(tree_->find("/bmc.1/mgmt0/ip")->number(PROP_ENABLED_STATE), nullptr) << "a clock that was set back";
}

TEST_F(BmcSourceTest, AWrongFileLeavesTheHostWholeAndIsLoggedOnce) {
  const std::string file = directory_ / "bmc.json";
  EXPECT_THAT(whyLeftOut("{"), HasSubstr(file + ":1"));
  EXPECT_THAT(whyLeftOut("[]"), HasSubstr("expected an object"));
  EXPECT_THAT(whyLeftOut(R"({"read_at": -1, "interval": 60})"), HasSubstr("read_at: expected a whole number"));
  EXPECT_THAT(whyLeftOut(R"({"read_at": 1, "interval": 99999999})"), HasSubstr("interval"));
  EXPECT_THAT(whyLeftOut(R"({"read_at": 1, "interval": 60, "problem": 7})"), HasSubstr("problem: expected a text"));
  EXPECT_THAT(whyLeftOut(document(R"({"type": "System", "name": "system", "description": "BMC"})")),
              HasSubstr("/system: is no node of a service processor"));
  EXPECT_THAT(whyLeftOut(document(R"({"type": "System", "name": "bmc.1", "description": "Computer"})")),
              HasSubstr("/bmc.1: is no node"));
  EXPECT_THAT(whyLeftOut(document(manager("bmc.1", R"({"type": "NetworkIPConfig", "name": "ip"})"))),
              HasSubstr("/bmc.1/ip: is no node"));
  EXPECT_THAT(whyLeftOut(document(manager("bmc.1", "") + "," + manager("bmc.1", ""))), HasSubstr("sibling"));
  EXPECT_THAT(whyLeftOut(std::string(5 << 20, ' ')), HasSubstr("larger than 4 MiB"));
  std::string many = "0";
  for (int i = 0; i < 200000; ++i) many += ",0";
  EXPECT_THAT(whyLeftOut(R"({"nodes": [)" + many + "]}"), HasSubstr("more than 100000 values"));
  std::string ports = port("p");
  for (int i = 0; i < 1100; ++i) ports += "," + port("p" + std::to_string(i));
  EXPECT_THAT(whyLeftOut(document(manager("bmc.1", ports))), HasSubstr("more than 1024 interfaces"));
}

TEST_F(BmcSourceTest, WhatIsWrittenIsReadBack) {
  write(document(manager("bmc.1", port("mgmt0")), "a \\\"problem\\\""));
  const BmcState state = readBmcState(directory_ / "bmc.json");
  const BmcState again = parseBmcState(formatBmcState(state), "again");
  EXPECT_EQ(again.readAt, 1000U);
  EXPECT_EQ(again.interval, 60U);
  EXPECT_EQ(again.problem, "a \"problem\"");
  EXPECT_EQ(formatBmcState(again), formatBmcState(state));
}

}  // namespace
}  // namespace zorva::agent
