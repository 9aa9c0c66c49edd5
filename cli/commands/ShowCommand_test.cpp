#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

/// A host with an owner's facts, servers of another one, and a resolver of its own.
class SplitHost : public TestHost {
 public:
  SplitHost() {
    writeTree(
        R"({"system_name": "host1", "nodes": [{"type": "System", "name": "system", "description": "Computer",)"
        R"("properties": {"resolver_servers": ["127.0.0.53"], "resolver_servers_not_asked": ["192.0.2.99"],)"
        R"("resolver_search": ["example.org"], "resolver_options": ["ndots:2"]}, "children": [)" +
        TestHost::port("eth0", R"("domain_name": "example.org", "dns_suffixes": ["example.org"], "dns_owner":)"
                               R"("NetworkManager", "dns_profile": "lan", "dns_origin": "learned", "dnssec": "no")") +
        "," +
        TestHost::port("tun0", R"("dns_server_addresses": ["198.51.100.1"], "dns_owner": "systemd-networkd",)"
                               R"("dns_profile": "/etc/systemd/network/10-vpn.network", "dns_default_route": "no",)"
                               R"("dns_servers_in_full": ["198.51.100.1:5353#dns.example.net"],)"
                               R"("dns_routing_domains": ["corp.example.net"], "dns_over_tls": "opportunistic",)"
                               R"("llmnr": "yes", "multicast_dns": "resolve")") +
        "," + TestHost::port("veth0", R"("dns_server_addresses": [], "domain_name": "example.org")") + "]}]}");
  }
};

TEST(Show, HasARowForEachInterfaceAndOneForTheHost) {
  EXPECT_EQ(shown(SplitHost(), {"show"}),
            "DNS client configuration of host1\n\n"
            "NAME  STATE    SERVERS                  DOMAIN       SUFFIXES     FROM\n"
            "eth0  Enabled  192.0.2.53 2001:db8::53  example.org  example.org  NetworkManager, profile lan\n"
            "tun0  Enabled  198.51.100.1             -            -            systemd-networkd, 10-vpn.network\n"
            "1 interface without DNS of its own is left out; --all shows it\n\n"
            "Host\n"
            "  programs ask  127.0.0.53\n"
            "  never asked   192.0.2.99\n"
            "  search list   example.org\n"
            "  options       ndots:2\n"
            "  suffixes      example.org\n"
            "The suffixes are from the host; ifcfg-eth0, which does not exist, would replace them: the settings of the "
            "host are in the file of the first interface.\n");
}

TEST(Show, LeavesOutInterfacesWithoutDnsUnlessAllAreAskedForOrThereAreNoOthers) {
  EXPECT_THAT(shown(SplitHost(), {"show", "--all"}),
              AllOf(HasSubstr("\nveth0  Enabled  -"), Not(HasSubstr("left out"))));
  const TestHost without(
      {TestHost::port("a", R"("dns_server_addresses": [])"), TestHost::port("b", R"("dns_server_addresses": [])")});
  EXPECT_THAT(shown(without, {"show"}), AllOf(HasSubstr("\na     Enabled  -"), HasSubstr("\nb     Enabled  -")));
  without.directory().write("data/ifcfg-b", "");
  EXPECT_THAT(shown(without, {"show"}), AllOf(HasSubstr("\nb     Enabled  -"), HasSubstr("\n1 interface without")));
}

TEST(Show, HasAllOfOneInterface) {
  EXPECT_EQ(shown(SplitHost(), {"show", "tun0"}),
            "tun0\n"
            "  state            Enabled\n"
            "  from             systemd-networkd, 10-vpn.network\n"
            "  owner            systemd-networkd\n"
            "  profile          /etc/systemd/network/10-vpn.network\n"
            "  servers          198.51.100.1\n"
            "  servers in full  198.51.100.1:5353#dns.example.net\n"
            "  domain           -\n"
            "  suffixes         -\n"
            "  routing domains  corp.example.net\n"
            "  default route    no\n"
            "  DNS over TLS     opportunistic\n"
            "  LLMNR            yes\n"
            "  multicast DNS    resolve\n"
            "  host name        host1\n"
            "  system           host1\n\n"
            "  SETTING             FROM  VALUE\n"
            "  RequestedHostname   host  host1\n"
            "  DomainName          -     -\n"
            "  DNSServerAddresses  host  198.51.100.1\n"
            "  ConfigurationName   -     -\n");
  expectRefused(SplitHost(), {"show", "eth7"}, 1, "no interface eth7\nzorvactl: did you mean eth0?");
}

TEST(Show, HasEverythingAsFieldsOfJson) {
  const json view = jsonShown(SplitHost(), {"show", "tun0"});
  ASSERT_EQ(view["interfaces"].size(), 1U);
  json tun0 = view["interfaces"][0];
  EXPECT_EQ(tun0["settings"].size(), 4U);
  tun0.erase("settings");
  EXPECT_EQ(tun0, json::parse(R"({"name": "tun0", "system": "host1", "state": 2, "state_word": "Enabled",
      "from": "systemd-networkd, 10-vpn.network", "servers": ["198.51.100.1"], "domain_name": "", "suffixes": [],
      "host_name": "host1", "endpoint_domain_name": "", "host_servers": null, "dns_owner": "systemd-networkd",
      "dns_profile": "/etc/systemd/network/10-vpn.network", "dns_origin": null,
      "dns_servers_in_full": ["198.51.100.1:5353#dns.example.net"], "dns_routing_domains": ["corp.example.net"],
      "dns_default_route": "no", "dns_over_tls": "opportunistic", "dnssec": null, "llmnr": "yes",
      "multicast_dns": "resolve"})"));
  EXPECT_EQ(view["host"]["resolver_servers_not_asked"], json::parse(R"(["192.0.2.99"])"));
  EXPECT_EQ(view["host"]["interface"], "eth0");
}

TEST(Show, ListsServersInSearchOrderAndNotByName) {
  const TestHost host({TestHost::port("eth0", R"("dns_server_addresses": ["203.0.113.9", "192.0.2.1", "::1"])")});
  EXPECT_EQ(jsonShown(host, {"show"})["interfaces"][0]["servers"],
            json::parse(R"(["203.0.113.9", "192.0.2.1", "::1"])"));
}

std::string listOf(const char* text, int count) {
  std::string list;
  for (int i = 0; i < count; ++i) list += (i == 0 ? "\"" : ", \"") + (text + std::to_string(i)) + "\"";
  return "[" + list + "]";
}

TEST(Show, EndsALongListWithHowManyMoreThereAre) {
  const TestHost host(
      {TestHost::port("eth0", R"("dns_server_addresses": )" + listOf("2001:db8::", 64)), TestHost::port("eth1")});
  const std::string text = shown(host, {"show"});
  EXPECT_THAT(text, AllOf(HasSubstr("\neth0  Enabled  2001:db8::0 2001:db8::1 2001:db8::2 2001:db8::3 and 60 more "),
                          HasSubstr("\neth1  Enabled  192.0.2.53 2001:db8::53")));
  EXPECT_THAT(shown(host, {"show", "eth0"}), HasSubstr("\n             2001:db8::63\n"));
}

TEST(Show, HasOneLineOfATerminalForEachInterface) {
  std::vector<std::string> ports{TestHost::port("eth0", R"("domain_name": "a-long-name.corp.example.org",)"
                                                        R"("dns_owner": "NetworkManager", "dns_profile": "lan")")};
  for (int i = 0; i < 100; ++i) ports.push_back(TestHost::port("veth1a2b3c4d" + std::to_string(i)));
  const TestHost host(ports);
  const Outcome outcome = host.runWith({{"NO_COLOR", "1"}}, {"show"}, OutputTo::Terminal);
  std::istringstream lines(outcome.out);
  int rows = 0;
  for (std::string line; std::getline(lines, line);) {
    rows += line.find("Enabled") != std::string::npos ? 1 : 0;
    // A carriage return, and two bytes more for each ellipsis.
    std::size_t columns = line.size() - 1;
    for (std::size_t at = line.find("\u2026"); at != std::string::npos; at = line.find("\u2026", at + 1)) columns -= 2;
    EXPECT_LE(columns, 60U) << line;
  }
  EXPECT_EQ(rows, 101);
}

TEST(Show, SaysWhereEachSettingComesFrom) {
  const TestHost host;
  host.directory().write("data/ifcfg-eth1", "HOSTNAME=fromfile\n");
  std::map<std::string, json> settings;
  const json view = jsonShown(host, {"show"});
  for (const json& interface : view["interfaces"]) {
    for (const json& row : interface["settings"]) {
      settings[interface["name"].get<std::string>() + " " + row["setting"].get<std::string>()] = row;
    }
  }
  EXPECT_EQ(settings["eth0 RequestedHostname"]["from"], "host");
  EXPECT_EQ(settings["eth1 RequestedHostname"]["from"], "file");
  EXPECT_EQ(settings["eth1 RequestedHostname"]["value"], "fromfile");
  EXPECT_EQ(settings["eth1 DomainName"]["from"], "file") << "the file decides, although it has no such line";
  EXPECT_EQ(settings["eth1 DomainName"]["value"], "");
  EXPECT_EQ(settings["eth0 ConfigurationName"]["from"], nullptr) << "the host has no place for it";
  const json& eth1 = view["interfaces"][1];
  EXPECT_EQ(eth1["from"], "ifcfg-eth1");
  EXPECT_EQ(eth1["servers"], json::array());
  EXPECT_EQ(eth1["host_servers"], json::parse(R"(["192.0.2.53", "2001:db8::53"])"));
}

TEST(Show, SaysWhichFileHasTheSettingsOfTheHostAndWhy) {
  const TestHost host;
  host.directory().write("data/ifcfg-eth0", "DNSSUFFIXES=file.example \n");
  EXPECT_THAT(
      shown(host, {"show"}),
      HasSubstr("\n  suffixes  file.example\nThe suffixes are kept in ifcfg-eth0: the settings of the host are in "
                "the file of the first interface.\n"));
}

TEST(Show, WarnsOfFilesWhoseInterfacesAreGone) {
  const TestHost host;
  for (const char* name : {"gone0", "gone1"}) host.directory().write(std::string("data/ifcfg-") + name, "");
  EXPECT_EQ(host.run({"show"}).err,
            "zorvactl: warning: nothing reads ifcfg-gone0, ifcfg-gone1: this host has no such interfaces; zorvactl "
            "ifcfg list, adopt and remove deal with that\n");
}

TEST(Show, HasAServiceProcessorUnderItsOwnName) {
  const TestHost host;
  host.writeTree(
      R"({"system_name": "host1", "nodes": [{"type": "System", "name": "sp", "description": "BMC", "children": [)" +
      TestHost::port("mgmt0") + "]}]}");
  EXPECT_EQ(jsonShown(host, {"show"})["interfaces"][0]["system"], "BMC:-1");
  EXPECT_THAT(shown(host, {"names", "ZORVA_DNSProtocolEndPoint"}),
              AllOf(HasSubstr("ZORVA_SPComputerSystem"), HasSubstr("SystemName=\"BMC:-1\"")));
  EXPECT_THAT(shown(host, {"show"}),
              AllOf(HasSubstr("\nmgmt0 (BMC)  Enabled  192.0.2.53"), HasSubstr("\nHost\n  suffixes  -\n")));
}

TEST(Show, WorksOnAHostWithoutInterfaces) {
  EXPECT_THAT(shown(TestHost(Words{}), {"show"}), HasSubstr("no interface: this host has none besides loopback"));
}

TEST(Show, HasADashWhereAProviderIsMissing) {
  const TestHost host;
  const Outcome outcome = host.run({"show", "--provider-dir", host.directory().path()});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_THAT(outcome.out, HasSubstr("host1\n\n-\n\nHost\n  suffixes  -\n"));
  EXPECT_THAT(outcome.err, HasSubstr("libzorvadnsclientprofileprovider"));
}

TEST(Classes, ReportAMissingLibraryOnce) {
  const Outcome outcome = TestHost().run({"classes", "--provider-dir", "/nowhere"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(std::count(outcome.err.begin(), outcome.err.end(), '\n'), 2) << outcome.err;
  EXPECT_THAT(outcome.err, HasSubstr("warning: ZORVA_ComputerSystem, ZORVA_SPComputerSystem, "));
}

TEST(Show, ReportsValuesThatWereSet) {
  const TestHost host;
  shown(host, {"modify", kEndpoint, "DomainName=set.example"});
  EXPECT_THAT(shown(host, {"show"}), HasSubstr("set.example  example.org example.net  overlay.json\n"));
  EXPECT_THAT(shown(host, {"show", "eth0"}), HasSubstr("DomainName          set   set.example\n"));
  host.directory().write("data/ifcfg-eth0", "DOMAINNAME=file.example\n");
  EXPECT_THAT(shown(host, {"show"}), HasSubstr("file.example  example.org example.net  ifcfg-eth0\n"));
}

TEST(Show, LeavesOutWhatProvidersLogOnTheirWayUnlessALevelIsAskedFor) {
  const TestHost host;
  host.writeTree(R"({"system_name": "host1", "nodes": [{"type": "System", "name": "system", "description": "Computer",)"
                 R"("children": [)" +
                 TestHost::port("eth0") +
                 R"(]}, {"type": "System", "name": "sp", "description": "BMC", "children": [)" +
                 TestHost::port("mgmt0") + "]}]}");
  for (const char* command : {"show", "classes", "graph"}) EXPECT_EQ(host.run({command}).err, "") << command;
  EXPECT_THAT(host.run({"classes", "--log-level", "6000"}).err, HasSubstr("Key is not matched"));
}

TEST(Show, SendsNoControlCharacterToATerminal) {
  const TestHost host({TestHost::port("e\\u001b[2Jth", R"("domain_name": "a\u0007\u202eb")")});
  const std::string text = shown(host, {"show"});
  EXPECT_THAT(text, AllOf(HasSubstr("e\\x1B[2Jth"), HasSubstr("a\\x07\\u202Eb")));
  EXPECT_THAT(text, AllOf(Not(HasSubstr("\x1B")), Not(HasSubstr("\x07"))));
  EXPECT_THAT(shown(host, {"tree"}), Not(HasSubstr("\x1B")));
  EXPECT_THAT(shown(host, {"ei", "ZORVA_DNSProtocolEndPoint"}), Not(HasSubstr("\x1B")));
  EXPECT_THAT(shown(host, {"graph"}), Not(HasSubstr("\x1B")));
}

TEST(Show, FitsTheTerminalAndIsColouredThere) {
  const TestHost host;
  const Outcome coloured = host.run({"show"}, OutputTo::Terminal);
  EXPECT_EQ(coloured.exitCode, 0);
  EXPECT_THAT(coloured.out, HasSubstr("\033[32mEnabled\033[0m"));
  const Outcome plain = host.runWith({{"NO_COLOR", "1"}}, {"show"}, OutputTo::Terminal);
  EXPECT_THAT(plain.out, Not(HasSubstr("\033")));
  std::istringstream lines(plain.out);
  for (std::string line; std::getline(lines, line);) EXPECT_LE(line.size(), 61U) << line;
  EXPECT_THAT(host.runWith({{"TERM", "dumb"}}, {"show"}, OutputTo::Terminal).out, Not(HasSubstr("\033")));
}

TEST(Classes, AreSixteenWithTheirProvidersAndCounts) {
  const json rows = jsonShown(TestHost(), {"classes"});
  EXPECT_EQ(rows.size(), 16U);
  EXPECT_EQ(rows[0], json::parse(R"({"class": "ZORVA_DNSProtocolEndPoint", "provider": "DNSClientProvider",
                                     "library": "zorvadnsclientprofileprovider", "instances": 2})"));
}

}  // namespace
}  // namespace zorva::cli
