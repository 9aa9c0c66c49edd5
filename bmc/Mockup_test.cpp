// zorva-bmc beside the tests' Redfish service, which answers as public mockups do. What is expected is read from the
// mockups' files here, by other code than that under test.

#include <arpa/inet.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <bit>
#include <filesystem>

#include "agent/apply/Writers.h"
#include "bmc/testing/RunningBmc.h"
#include "bmc/testing/TestRedfish.h"

namespace zorva::bmc {
namespace {

using namespace ZV::NodeLexicon;
using agent::StringList;
using agent::testing::contentsOf;
using ::testing::HasSubstr;
using testing::json;

StringList mockups() {
  StringList folders;
  const std::filesystem::path all = ZORVA_REDFISH_MOCKUP_DIR;
  if (all.empty()) return folders;
  for (const auto& entry : std::filesystem::directory_iterator(all)) {
    if (std::filesystem::exists(entry.path() / "index.json")) folders.push_back(entry.path());
  }
  std::sort(folders.begin(), folders.end());
  return folders;
}

bool isAddress(const std::string& text) {
  in6_addr bytes{};
  if (text == "0.0.0.0" || text == "::") return false;
  return ::inet_pton(AF_INET, text.c_str(), &bytes) == 1 || ::inet_pton(AF_INET6, text.c_str(), &bytes) == 1;
}

int bitsOf(const std::string& mask) {
  in_addr bytes{};
  ::inet_pton(AF_INET, mask.c_str(), &bytes);
  return std::popcount(bytes.s_addr);
}

/// The file of a resource.
json resourceIn(const std::string& mockup, const json& reference) {
  const std::string root = "/redfish/v1";
  return json::parse(
      contentsOf(mockup + reference["@odata.id"].get<std::string>().substr(root.size()) + "/index.json"));
}

json membersIn(const std::string& mockup, const json& collection) {
  const json listed = resourceIn(mockup, collection);
  json members = json::array();
  for (const json& each : listed["Members"]) members.push_back(resourceIn(mockup, each));
  return members;
}

/// The Ethernet interfaces of its managers, each with the path that its node has in bmc.json.
std::vector<std::pair<std::string, json>> interfacesIn(const std::string& mockup) {
  std::vector<std::pair<std::string, json>> found;
  const json root = resourceIn(mockup, {{"@odata.id", "/redfish/v1"}});
  for (const json& manager : membersIn(mockup, root["Managers"])) {
    if (!manager.contains("EthernetInterfaces")) continue;
    for (const json& each : membersIn(mockup, manager["EthernetInterfaces"])) {
      const std::string port = "/bmc." + manager["Id"].get<std::string>() + "/" + each["Id"].get<std::string>();
      found.emplace_back(port + "/ip", each);
    }
  }
  return found;
}

std::string textOf(const agent::Node* node, agent::PropertyNumber property) {
  const std::string* text = node == nullptr ? nullptr : node->text(property);
  return text == nullptr ? std::string() : *text;
}

StringList serversOf(const json& interface) {
  StringList servers;
  const json list = interface.value("NameServers", interface.value("StaticNameServers", json::array()));
  for (const json& each : list) {
    if (each.is_string() && isAddress(each)) servers.push_back(each);
  }
  return servers;
}

StringList addressesOf(const json& interface) {
  StringList addresses;
  for (const char* family : {"IPv4Addresses", "IPv6Addresses"}) {
    for (const json& each : interface.value(family, json::array())) {
      const std::string address = each.value("Address", "");
      const int length = each.contains("SubnetMask") ? bitsOf(each["SubnetMask"]) : each.value("PrefixLength", 0);
      if (isAddress(address)) addresses.push_back(address + "/" + std::to_string(length));
    }
  }
  return addresses;
}

/// What the writer says of a change; empty: it made it.
std::string problemOf(const testing::TestRedfish& redfish, const json& interface, const agent::DnsSettings& settings) {
  agent::DnsTarget target;
  target.profile = interface["@odata.id"];
  const auto written = agent::makeBmcWriter(redfish.bmcJson())->write(target, settings);
  return written ? std::string() : written.error();
}

class MockupTest : public ::testing::Test {
 protected:
  /// Calls it for each interface of each mockup, beside a service that has just begun.
  template <typename Check>
  void forEachInterface(Check check) {
    if (mockups().empty()) GTEST_SKIP() << "ZORVA_REDFISH_MOCKUP_DIR names no mockups";
    for (const std::string& mockup : mockups()) {
      testing::TestRedfish redfish(mockup);
      testing::RunningBmc bmc(redfish, redfish.configFile(""));
      const auto interfaces = interfacesIn(mockup);
      EXPECT_FALSE(interfaces.empty()) << mockup;
      for (const auto& [path, interface] : interfaces) {
        SCOPED_TRACE(mockup + path);
        check(redfish, path, interface);
      }
      EXPECT_EQ(redfish.tell({{"invalid", true}})["invalid"], json::array()) << mockup;
    }
  }
};

TEST_F(MockupTest, EachInterfaceIsShownAsItsFileDescribesIt) {
  forEachInterface([](testing::TestRedfish& redfish, const std::string& path, const json& interface) {
    const agent::BmcState state = agent::readBmcState(redfish.bmcJson());
    const agent::Node* node = state.tree->find(path);
    ASSERT_NE(node, nullptr) << state.problem;
    EXPECT_EQ(textOf(node, PROP_NAME), interface["Id"]);
    EXPECT_EQ(textOf(node, PROP_HOST_NAME), interface.value("HostName", ""));
    EXPECT_EQ(textOf(node, PROP_HOST_NAME) + "." + textOf(node, PROP_DOMAIN_NAME), interface.value("FQDN", "."));
    EXPECT_EQ(*node->list(PROP_DNS_SERVER_ADDRESSES), serversOf(interface));
    StringList addresses;
    for (const auto& each : node->addresses()) {
      addresses.push_back(each.address + "/" + std::to_string(each.prefixLength));
    }
    EXPECT_EQ(addresses, addressesOf(interface));
  });
}

TEST_F(MockupTest, ServersAreChangedWhereThereIsAPlaceForThemAndElseRefused) {
  forEachInterface([](testing::TestRedfish& redfish, const std::string& path, const json& interface) {
    const std::string domain = textOf(agent::readBmcState(redfish.bmcJson()).tree->find(path), PROP_DOMAIN_NAME);
    redfish.patches();
    const std::string problem = problemOf(redfish, interface, {{"192.0.2.77"}, {domain}});
    const json patches = redfish.patches();
    if (!interface.contains("StaticNameServers")) {
      EXPECT_THAT(problem, HasSubstr(" has no StaticNameServers: its DNS servers cannot be set by Redfish"));
      EXPECT_EQ(patches, json::array());
      return;
    }
    EXPECT_EQ(problem, "");
    ASSERT_EQ(patches.size(), 1U);
    EXPECT_EQ(patches[0]["body"]["StaticNameServers"][0], "192.0.2.77");
    EXPECT_EQ(patches[0]["body"]["StaticNameServers"].size(), interface["StaticNameServers"].size());
  });
}

TEST_F(MockupTest, ADomainReachesTheInterfaceOrItsSettingsObject) {
  forEachInterface([](testing::TestRedfish& redfish, const std::string& path, const json& interface) {
    if (!interface.contains("FQDN") || !interface.contains("HostName")) return;
    redfish.patches();
    EXPECT_EQ(problemOf(redfish, interface, {serversOf(interface), {"lab.example.org"}}), "");
    const json patches = redfish.patches();
    ASSERT_EQ(patches.size(), 1U);
    const json settings = interface.value("@Redfish.Settings", json::object()).value("SettingsObject", interface);
    EXPECT_EQ(patches[0]["path"], settings["@odata.id"]);
    EXPECT_EQ(patches[0]["body"]["FQDN"], interface["HostName"].get<std::string>() + ".lab.example.org");
    EXPECT_EQ(textOf(agent::readBmcState(redfish.bmcJson()).tree->find(path), PROP_DOMAIN_NAME), "lab.example.org");
  });
}

}  // namespace
}  // namespace zorva::bmc
