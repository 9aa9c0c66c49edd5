// Split DNS over two links, a LAN on eth0 and a VPN on tun1, as each owner's own tool shows it and as the tree does.
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <sstream>
#include <thread>

#include "agent/sources/HostSource.h"
#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/PrivateHostTest.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;
using testing::Daemons;
using testing::Interfaces;
using testing::outputOf;
using testing::writeFile;

// What a tool shows of a link: a command whose output has the property's values as words.
struct Shown {
  PropertyNumber property;
  std::string command;  // "@" is the interface
};

const std::string kOfResolvectl = " @ | sed 's/^Link.*(.*): *//'";
const std::string kAsWords = " | tr '|' ' '";

const std::vector<Shown> kResolvectl{
    {PROP_DNS_SERVER_ADDRESSES, "resolvectl dns" + kOfResolvectl},
    {PROP_DNS_SUFFIXES, "resolvectl domain" + kOfResolvectl + " | tr ' ' '\\n' | sed '/^~/d'"},
    {kDnsRoutingDomains, "resolvectl domain" + kOfResolvectl + " | tr ' ' '\\n' | sed -n 's/^~//p'"},
    {kDnsDefaultRoute, "resolvectl default-route" + kOfResolvectl},
    {kDnsOverTls, "resolvectl dnsovertls" + kOfResolvectl},
    {kDnssec, "resolvectl dnssec" + kOfResolvectl},
    {kLlmnr, "resolvectl llmnr" + kOfResolvectl},
    {kMulticastDns, "resolvectl mdns" + kOfResolvectl},
};
const std::string kSearches = "nmcli --escape no --get-values IP4.SEARCHES,IP6.SEARCHES device show @" + kAsWords;
const std::vector<Shown> kNmcli{
    {PROP_DNS_SERVER_ADDRESSES, "nmcli --escape no --get-values IP4.DNS,IP6.DNS device show @" + kAsWords},
    {PROP_DNS_SUFFIXES, kSearches + " | tr ' ' '\\n' | sed '/^~/d'"},
    {kDnsRoutingDomains, kSearches + " | tr ' ' '\\n' | sed -n 's/^~//p'"},
    {kDnsProfile, "nmcli --get-values GENERAL.CONNECTION device show @"},
};
// The lines of one heading.
std::string ofNetworkctl(const std::string& heading) {
  return "networkctl --no-pager status @ | awk '/^ *[A-Z][^:]*: /{on=0} /^ *" + heading +
         ":/{on=1; sub(/^[^:]*: */, \"\")} on{print}' | sed 's/^n.a$//'";
}
const std::vector<Shown> kNetworkctl{
    {PROP_DNS_SERVER_ADDRESSES, ofNetworkctl("DNS")},
    {PROP_DNS_SUFFIXES, ofNetworkctl("Search Domains")},
    {kDnsRoutingDomains, ofNetworkctl("Route Domains")},
    {kDnsProfile, ofNetworkctl("Network File")},
};

struct Scenario {
  const char* name;
  std::vector<const char*> daemons;
  std::vector<const char*> settings;  // commands
  std::vector<const char*> changes;   // commands; after each the tree has to follow
  std::vector<const std::vector<Shown>*> tools;
  const char* owner;
};

constexpr const char* kAddLan =
    "nmcli connection add type ethernet ifname eth0 con-name lan ipv4.method manual ipv4.addresses 192.0.2.10/24 "
    "ipv4.dns 192.0.2.53,192.0.2.54 ipv4.dns-search lan.example.org,~corp.example ipv6.method manual "
    "ipv6.addresses 2001:db8::10/64 ipv6.dns 2001:db8::53; nmcli connection up lan";
constexpr const char* kAddVpn =
    "nmcli connection add type ethernet ifname tun1 con-name 'the vpn' ipv4.method manual ipv4.addresses "
    "198.51.100.10/24 ipv4.dns 198.51.100.53 ipv4.dns-search vpn.example ipv6.method disabled; "
    "nmcli connection up 'the vpn'";
constexpr const char* kModifyLan = "nmcli connection modify lan ipv4.dns 192.0.2.99 && nmcli device reapply eth0";
constexpr const char* kSearchElsewhere =
    "nmcli connection modify lan ipv4.dns-search other.example; nmcli connection up lan";
constexpr const char* kEndVpn = "nmcli connection down 'the vpn'";

constexpr const char* kLanFile =
    "printf '[Match]\\nName=eth0\\n[Network]\\nAddress=192.0.2.10/24\\nDNS=192.0.2.53 2001:db8::53\\n"
    "Domains=lan.example.org ~corp.example\\n' > /etc/systemd/network/10-lan.network";
constexpr const char* kVpnFile =
    "printf '[Match]\\nName=tun1\\n[Network]\\nAddress=198.51.100.10/24\\nDNS=198.51.100.53\\nDomains=vpn.example\\n' "
    "> /etc/systemd/network/20-vpn.network; networkctl reload";
constexpr const char* kChangeLanFile =
    "sed -i 's/192.0.2.53/192.0.2.99/; s/corp/other/' /etc/systemd/network/10-lan.network; networkctl reload";

const std::vector<Scenario> kScenarios{
    {"systemd-resolved alone",
     {"systemd-resolved"},
     {"resolvectl dns eth0 192.0.2.53 2001:db8::53; resolvectl domain eth0 lan.example.org '~corp.example'",
      "resolvectl dns tun1 198.51.100.53; resolvectl domain tun1 vpn.example '~.'; resolvectl dnsovertls tun1 yes"},
     {"resolvectl dns eth0 192.0.2.99", "resolvectl domain eth0 other.example", "resolvectl llmnr eth0 resolve",
      "resolvectl mdns tun1 yes", "resolvectl dnssec tun1 allow-downgrade", "resolvectl default-route eth0 no",
      "resolvectl dnsovertls eth0 opportunistic", "resolvectl revert tun1"},
     {&kResolvectl},
     "systemd-resolved"},
    {"NetworkManager alone",
     {"NetworkManager"},
     {kAddLan, kAddVpn},
     {kModifyLan, kSearchElsewhere, kEndVpn},
     {&kNmcli},
     "NetworkManager"},
    {"NetworkManager with systemd-resolved",
     {"systemd-resolved", "NetworkManager"},
     {kAddLan, kAddVpn},
     {kModifyLan, kSearchElsewhere, "resolvectl llmnr eth0 no", kEndVpn},
     {&kNmcli, &kResolvectl},
     "NetworkManager"},
    {"systemd-networkd alone",
     {"systemd-networkd"},
     {kLanFile, kVpnFile},
     {kChangeLanFile, "rm /etc/systemd/network/20-vpn.network; networkctl reload"},
     {&kNetworkctl},
     "systemd-networkd"},
    {"systemd-networkd with systemd-resolved",
     {"systemd-resolved", "systemd-networkd"},
     {kLanFile, kVpnFile},
     {kChangeLanFile, "resolvectl dns eth0 192.0.2.77"},
     {&kNetworkctl, &kResolvectl},
     "systemd-networkd"},
};

StringList wordsOf(const std::string& text) {
  std::istringstream words(text);
  StringList list;
  for (std::string word; words >> word;) list.push_back(word);
  return list;
}

StringList wordsOf(const Node& node, PropertyNumber property) {
  const StringList* list = node.list(property);
  if (list != nullptr) return *list;
  const std::string* text = node.text(property);
  return text == nullptr ? StringList() : wordsOf(*text);
}

std::string commandFor(std::string command, const std::string& interface) {
  for (std::size_t at = 0; (at = command.find('@')) != std::string::npos;) command.replace(at, 1, interface);
  return command;
}

// The tree and the tools, beside each other.
class Comparison {
 public:
  explicit Comparison(const Scenario& scenario) : scenario_(scenario) {}

  // Expects them to say the same of each property. A daemon may answer a tool before it has told the bus, so they are
  // given a moment.
  void expectAgreement(const std::string& after) {
    constexpr int kTurns = 100;
    std::string differences;
    for (int turn = 0; turn < kTurns; ++turn) {
      differences.clear();
      for (const char* interface : {"eth0", "tun1", "far0"}) differences += differencesOf(interface);
      if (differences.empty()) return;
      std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    ADD_FAILURE() << scenario_.name << ", after " << after << ":\n" << differences;
  }

  const Node& node(const std::string& interface) {
    if (tree_ == nullptr || source_.changed()) tree_ = source_.read();
    return *tree_->find("/system/" + interface + "/ip");
  }

 private:
  std::string differencesOf(const std::string& interface) {
    std::string differences;
    for (const std::vector<Shown>* tool : scenario_.tools) {
      for (const Shown& shown : *tool) {
        const StringList expected = wordsOf(outputOf(commandFor(shown.command, interface)));
        const StringList found = wordsOf(node(interface), shown.property);
        if (found == expected) continue;
        differences += interface + ' ' + commandFor(shown.command, interface) + " says" + joined(expected) +
                       ", the tree says" + joined(found) + '\n';
      }
    }
    return differences;
  }

  static std::string joined(const StringList& words) {
    std::string text;
    for (const std::string& word : words) text += ' ' + word;
    return text;
  }

  const Scenario& scenario_;
  HostSource source_;
  std::shared_ptr<const TreeSnapshot> tree_;
};

bool isShownAsTheToolsShowIt(const Scenario& scenario) {
  Interfaces interfaces;
  interfaces.addPair("eth0", "far0");
  interfaces.addPair("tun1", "far1");
  for (const char* name : {"eth0", "far0", "tun1", "far1"}) interfaces.setUp(name, true);
  writeFile("/etc/resolv.conf", "nameserver 203.0.113.1\nsearch nobody.example\n");
  Daemons daemons;
  for (const char* daemon : scenario.daemons) daemons.start(daemon);
  Comparison comparison(scenario);
  EXPECT_EQ(*comparison.node("eth0").text(kDnsOwner), "/etc/resolv.conf") << "no owner has anything to say yet";
  for (const char* setting : scenario.settings) outputOf(setting);
  comparison.expectAgreement("the settings");
  for (const char* interface : {"eth0", "tun1"}) {
    EXPECT_EQ(wordsOf(comparison.node(interface), kDnsOwner), StringList{scenario.owner}) << interface;
  }
  EXPECT_EQ(wordsOf(comparison.node("tun1"), PROP_DNS_SERVER_ADDRESSES), StringList{"198.51.100.53"});
  EXPECT_EQ(wordsOf(comparison.node("eth0"), kDnsRoutingDomains), StringList{"corp.example"});
  EXPECT_TRUE(wordsOf(comparison.node("far0"), PROP_DNS_SERVER_ADDRESSES).empty());
  EXPECT_EQ(wordsOf(comparison.node("eth0"), PROP_DOMAIN_NAME), StringList{"lan.example.org"});
  for (const char* change : scenario.changes) {
    outputOf(change);
    comparison.expectAgreement(change);
  }
  return true;
}

class SplitDns : public ::testing::TestWithParam<Scenario> {};

TEST_P(SplitDns, IsShownAsTheToolsShowItAndFollowsTheirChanges) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(testing::succeedsOnHostWithDaemons([] { return isShownAsTheToolsShowIt(GetParam()); }));
}

INSTANTIATE_TEST_SUITE_P(Owners, SplitDns, ::testing::ValuesIn(kScenarios), [](const auto& scenario) {
  std::string name = scenario.param.name;
  std::replace_if(
      name.begin(), name.end(), [](unsigned char letter) { return std::isalnum(letter) == 0; }, '_');
  return name;
});

}  // namespace
}  // namespace zorva::agent
