#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

TEST(Show, HasEndpointsServersSettingsAndClasses) {
  const std::string text = shown(TestHost(), {"show"});
  EXPECT_THAT(text, StartsWith("DNS client configuration of host1\n"));
  EXPECT_THAT(text, HasSubstr("\n  eth0  Enabled  host1      example.org  example.org example.net  host1\n"));
  EXPECT_THAT(text, HasSubstr("\n  1      192.0.2.53\n  2      2001:db8::53\n"));
  EXPECT_THAT(text, HasSubstr("ZORVA_DNSProtocolEndPoint               2 "));
}

TEST(Show, ListsServersInSearchOrderAndNotByName) {
  const TestHost host({TestHost::port("eth0", R"("dns_server_addresses": ["203.0.113.9", "192.0.2.1", "::1"])")});
  const json servers = jsonShown(host, {"show"})["servers"];
  EXPECT_EQ(servers, json::parse(R"([{"order": 1, "address": "203.0.113.9"}, {"order": 2, "address": "192.0.2.1"},
                                     {"order": 3, "address": "::1"}])"));
}

TEST(Show, SaysWhereEachSettingComesFrom) {
  const TestHost host;
  host.directory().write("data/ifcfg-eth1", "HOSTNAME=fromfile\n");
  std::map<std::string, json> settings;
  const json view = jsonShown(host, {"show"});
  for (const json& row : view["interface_settings"]) {
    settings[row["interface"].get<std::string>() + " " + row["setting"].get<std::string>()] = row;
  }
  EXPECT_EQ(settings["eth0 RequestedHostname"]["from"], "host");
  EXPECT_EQ(settings["eth1 RequestedHostname"]["from"], "file");
  EXPECT_EQ(settings["eth1 RequestedHostname"]["value"], "fromfile");
  EXPECT_EQ(settings["eth1 DomainName"]["from"], "file") << "the file decides, although it has no such line";
  EXPECT_EQ(settings["eth1 DomainName"]["value"], "");
  EXPECT_EQ(settings["eth0 ConfigurationName"]["from"], nullptr) << "the host has no place for it";
}

TEST(Show, HasAServiceProcessorUnderItsOwnName) {
  const TestHost host;
  host.writeTree(
      R"({"system_name": "host1", "nodes": [{"type": "System", "name": "sp", "description": "BMC", "children": [)" +
      TestHost::port("mgmt0") + "]}]}");
  EXPECT_EQ(jsonShown(host, {"show"})["endpoints"][0]["system"], "BMC:-1");
  EXPECT_THAT(shown(host, {"names", "ZORVA_DNSProtocolEndPoint"}),
              AllOf(HasSubstr("ZORVA_SPComputerSystem"), HasSubstr("SystemName=\"BMC:-1\"")));
  EXPECT_THAT(shown(host, {"show"}), HasSubstr("Settings of the host\n  none\n"));
}

TEST(Show, WorksOnAHostWithoutInterfaces) {
  EXPECT_THAT(shown(TestHost(Words{}), {"show"}),
              HasSubstr("none: this host has no network interface besides loopback"));
}

TEST(Show, HasADashWhereAProviderIsMissing) {
  const TestHost host;
  const Outcome outcome = host.run({"show", "--provider-dir", host.directory().path()});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_THAT(outcome.out, HasSubstr("ZORVA_DNSProtocolEndPoint               - "));
  EXPECT_THAT(outcome.out, HasSubstr("\nEndpoints\n  -\n\nServers, in search order\n  -\n"));
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
  EXPECT_THAT(shown(host, {"show"}), HasSubstr("DomainName          set.example              set\n"));
  host.directory().write("data/ifcfg-eth0", "DOMAINNAME=file.example\n");
  EXPECT_THAT(shown(host, {"show"}), HasSubstr("DomainName          file.example"));
}

TEST(Show, LeavesOutWhatProvidersLogOnTheirWayUnlessALevelIsAskedFor) {
  const TestHost host;
  host.writeTree(R"({"system_name": "host1", "nodes": [{"type": "System", "name": "system", "description": "Computer",)"
                 R"("children": [)" +
                 TestHost::port("eth0") +
                 R"(]}, {"type": "System", "name": "sp", "description": "BMC", "children": [)" +
                 TestHost::port("mgmt0") + "]}]}");
  for (const char* command : {"show", "classes", "graph"}) EXPECT_EQ(host.run({command}).err, "") << command;
  EXPECT_THAT(host.run({"show", "--log-level", "6000"}).err, HasSubstr("Key is not matched"));
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
