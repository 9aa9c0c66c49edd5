// zorvactl as a process, on hosts that are tree files: the commands that read.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <nlohmann/json.hpp>

#include "cimxml/testing/Grammar.h"
#include "cli/testing/TestHost.h"

namespace zorva::cli {
namespace {

using nlohmann::json;
using testing::AllOf;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;

using Words = std::vector<std::string>;

constexpr const char* kEth0 = R"(ZORVA_DNSProtocolEndPoint.Name="eth0")";

/// Standard output of a run that is expected to go well.
std::string shown(const TestHost& host, const Words& words) {
  const Outcome outcome = host.run(words);
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  return outcome.out;
}

json jsonShown(const TestHost& host, Words words) {
  words.insert(words.end(), {"--output", "json"});
  return json::parse(shown(host, words));
}

/// Checks that a run ends with this exit code and tells this, without a word on standard output.
void expectRefused(const TestHost& host, const Words& words, int exitCode, const std::string& told) {
  const Outcome outcome = host.run(words);
  EXPECT_EQ(outcome.exitCode, exitCode);
  EXPECT_EQ(outcome.out, "");
  EXPECT_THAT(outcome.err, HasSubstr(told));
}

// --- show, tree, classes

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

TEST(Show, TellsWhereEachSettingComesFrom) {
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

TEST(Classes, TellOnceOfALibraryThatIsMissing) {
  const Outcome outcome = TestHost().run({"classes", "--provider-dir", "/nowhere"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(std::count(outcome.err.begin(), outcome.err.end(), '\n'), 2) << outcome.err;
  EXPECT_THAT(outcome.err, HasSubstr("warning: ZORVA_ComputerSystem, ZORVA_SPComputerSystem, "));
}

TEST(Show, TellsOfValuesThatWereSet) {
  const TestHost host;
  shown(host, {"modify", kEth0, "DomainName=set.example"});
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

TEST(Tree, IsReadBackAsTheSameTree) {
  const TestHost host({TestHost::port("eth0", R"("domain_name": "a\u0001\"b", "addresses":
      [{"address": "192.0.2.10", "prefix_length": 24, "origin": "dhcp"}])"),
                       TestHost::port("eth1")});
  const std::string first = shown(host, {"tree", "--output", "json"});
  host.writeTree(first);
  EXPECT_EQ(shown(host, {"tree", "--output", "json"}), first);
  EXPECT_THAT(first, HasSubstr("192.0.2.10"));
}

TEST(Classes, AreSixteenWithTheirProvidersAndCounts) {
  const json rows = jsonShown(TestHost(), {"classes"});
  EXPECT_EQ(rows.size(), 16U);
  EXPECT_EQ(rows[0], json::parse(R"({"class": "ZORVA_DNSProtocolEndPoint", "provider": "DNSClientProvider",
                                     "library": "zorvadnsclientprofileprovider", "instances": 2})"));
}

// --- names, enumerate, get

TEST(Names, AreOneALine) {
  EXPECT_EQ(shown(TestHost(), {"ein", "ZORVA_DNSSettingData"}),
            "ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"\nZORVA_DNSSettingData.InstanceID=\"Computer%eth1\"\n");
}

TEST(Names, IncludeThoseOfSubclasses) {
  EXPECT_EQ(jsonShown(TestHost(), {"ein", "cim_dnsprotocolendpoint"}).size(), 2U);
}

TEST(Names, CannotBeMofOrXml) {
  for (const char* format : {"mof", "xml", "dot"}) {
    const Outcome outcome = TestHost().run({"names", "ZORVA_DNSSettingData", "--output", format});
    EXPECT_EQ(outcome.exitCode, 2) << format;
    EXPECT_EQ(outcome.out, "");
  }
}

TEST(Enumerate, GivesTypedJson) {
  const json found = jsonShown(TestHost(), {"ei", "ZORVA_DNSProtocolEndPoint"});
  ASSERT_EQ(found.size(), 2U);
  EXPECT_EQ(found[0]["class"], "ZORVA_DNSProtocolEndPoint");
  EXPECT_EQ(found[0]["properties"]["EnabledState"], 2);
  EXPECT_EQ(found[0]["properties"]["DNSSuffixesToAppend"], (json{"example.org", "example.net"}));
}

TEST(Enumerate, GivesAnEmptyListWhereThereIsNothing) {
  EXPECT_EQ(shown(TestHost(), {"ei", "ZORVA_SPComputerSystem", "-o", "json"}), "[]\n");
  EXPECT_EQ(shown(TestHost(), {"ei", "ZORVA_SPComputerSystem"}), "");
}

TEST(Enumerate, GivesOnlyThePropertiesThatAreWanted) {
  const json found = jsonShown(
      TestHost(), {"ei", "ZORVA_DNSProtocolEndPoint", "--property", "Hostname", "--property", "EnabledState"});
  EXPECT_EQ(found[0]["properties"], json::parse(R"({"Hostname": "host1", "EnabledState": 2})"));
}

TEST(Enumerate, KeepsNumbersBesideTheirWordsInATable) {
  EXPECT_THAT(shown(TestHost(), {"ei", "ZORVA_DNSProtocolEndPoint"}),
              testing::ContainsRegex("  EnabledState +2 \\(Enabled\\)\n"));
}

TEST(Enumerate, ShowsThePropertiesThatHaveNoValue) {
  const TestHost host({TestHost::port("eth0")});
  const Words words{"ei", "ZORVA_DNSProtocolEndPoint", "-o"};
  const auto as = [&](const char* format) {
    Words all = words;
    all.emplace_back(format);
    return shown(host, all);
  };
  EXPECT_THAT(as("table"), testing::ContainsRegex("  InstallDate +-\n"));
  EXPECT_TRUE(json::parse(as("json"))[0]["properties"].at("InstallDate").is_null());
  EXPECT_THAT(as("mof"), HasSubstr("InstallDate = null;"));
  EXPECT_THAT(as("xml"), HasSubstr("<PROPERTY NAME=\"InstallDate\" TYPE=\"datetime\"></PROPERTY>"));
}

TEST(Enumerate, SaysWhichClassesAreLikeOneThatIsNot) {
  expectRefused(TestHost(), {"ei", "ZORVA_DNSProtocol"}, 2,
                "there is no class ZORVA_DNSProtocol\nzorvactl: is it ZORVA_DNSProtocolEndPoint?\n");
  expectRefused(TestHost(), {"ei", "Frob"}, 2, "there is no class Frob\nzorvactl: zorvactl classes lists them\n");
}

TEST(Enumerate, TellsOfAProviderThatIsMissing) {
  const TestHost host;
  const Outcome outcome = host.run({"ei", "ZORVA_DNSProtocolEndPoint", "-o", "json", "--provider-dir", "/nowhere"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_EQ(outcome.out, "[]\n") << "what a program reads is complete all the same";
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("CIM_ERR_"), HasSubstr("libzorvadnsclientprofileprovider")));
}

TEST(Get, CompletesKeysAndSpellings) {
  const json found = jsonShown(TestHost(), {"gi", R"(zorva_dnsprotocolendpoint.name="eth0")"});
  EXPECT_EQ(found["path"],
            R"(//host1/root/cimv2:ZORVA_DNSProtocolEndPoint.SystemCreationClassName="ZORVA_ComputerSystem",)"
            R"(CreationClassName="ZORVA_DNSProtocolEndPoint",SystemName="host1",Name="eth0")");
}

TEST(Get, FindsTheOnlyInstanceByItsClassAlone) {
  EXPECT_EQ(jsonShown(TestHost(), {"gi", "CIM_DNSGeneralSettingData"})["properties"]["InstanceID"], "dnsgen1:host1");
}

TEST(Get, FindsAnAssociationByAPartOfItsReferences) {
  const json found = jsonShown(TestHost(), {"gi", R"(ZORVA_DNSEndPointElementSettingData.SettingData=)"
                                                  R"("ZORVA_DNSSettingData.InstanceID=\"Computer%eth1\"")"});
  EXPECT_THAT(found["properties"]["ManagedElement"].get<std::string>(), HasSubstr("eth1"));
}

TEST(Get, ListsTheCandidatesWhereThereAreSeveral) {
  expectRefused(TestHost(), {"gi", "ZORVA_DNSSettingData"}, 2,
                "2 instances fit ZORVA_DNSSettingData\nzorvactl: give more of the keys of one of them:\n"
                "  ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"\n"
                "  ZORVA_DNSSettingData.InstanceID=\"Computer%eth1\"\n");
}

TEST(Get, ListsWhatThereIsWhereNothingFits) {
  expectRefused(TestHost(), {"gi", R"(ZORVA_DNSProtocolEndPoint.Name="eth9")"}, 1,
                "there is no instance ZORVA_DNSProtocolEndPoint.Name=\"eth9\"\nzorvactl: there are:\n");
}

TEST(Get, TellsTheCodeOfAnInstanceThatIsNotThere) {
  expectRefused(TestHost(), {"gi", R"(ZORVA_DNSSettingData.InstanceID="nothing")"}, 1, "CIM_ERR_NOT_FOUND (6)");
}

TEST(Get, RefusesAKeyThatTheClassLacks) {
  expectRefused(TestHost(), {"gi", R"(ZORVA_DNSSettingData.Foo="x")"}, 2, "Foo");
}

TEST(Get, RefusesAPathOfAnotherHostAndMarksIt) {
  for (const char* subcommand : {"gi", "ai", "ain", "ri", "rin"}) {
    expectRefused(TestHost(), {subcommand, R"(//other/root/cimv2:ZORVA_DNSSettingData.InstanceID="Computer%eth0")"}, 2,
                  "names the host other at byte 3, and this is host1\n  //other/root/cimv2:ZOR...\n    ^\n");
  }
  expectRefused(TestHost(), {"ei", "//other/root/cimv2:ZORVA_DNSSettingData"}, 2, "names the host other");
  for (const char* host : {"host1", "HOST1", "localhost"}) {
    shown(TestHost(), {"gi", std::string("//") + host + R"(/root/cimv2:ZORVA_DNSProtocolEndPoint.Name="eth0")"});
  }
}

TEST(Get, RefusesANamespaceThatIsNot) {
  expectRefused(TestHost(), {"gi", R"(root/foo:ZORVA_DNSProtocolEndPoint.Name="eth0")"}, 2,
                "no namespace \"root/foo\"");
}

TEST(Get, RefusesAReferenceThatIsNoPath) {
  expectRefused(TestHost(), {"gi", R"(ZORVA_DNSHostedAccessPoint.Antecedent="x")"}, 2,
                "ZORVA_DNSHostedAccessPoint.Antecedent=\"x\": there is no class x\nzorvactl: a reference is the path");
  expectRefused(TestHost(), {"ain", R"(ZORVA_DNSHostedAccessPoint.Antecedent="a b",Dependent="y")"}, 2, "Antecedent");
  expectRefused(TestHost(), {"ri", "ZORVA_DNSHostedAccessPoint.Antecedent=5"}, 2, "5 is no ref");
}

TEST(Get, CompletesTheKeysOfReferencesThatAreIncomplete) {
  EXPECT_THAT(shown(TestHost(), {"gi", R"(ZORVA_DNSHostedAccessPoint.Antecedent="ZORVA_ComputerSystem",)"
                                       R"(Dependent="ZORVA_DNSProtocolEndPoint.Name=\"eth1\"")"}),
              HasSubstr(R"(Name="eth1")"));
}

TEST(Get, RefusesAPropertyThatTheClassLacks) {
  expectRefused(TestHost(), {"gi", kEth0, "--property", "Nope"}, 2,
                "neither ZORVA_DNSProtocolEndPoint nor a class below it has a property Nope");
  expectRefused(TestHost(), {"ai", kEth0, "--property", "No\x1Bpe"}, 2, "no class has a property No\\x1Bpe");
}

TEST(Get, RefusesAPathThatIsTooLong) {
  const std::string path = R"(ZORVA_DNSProtocolEndPoint.Name=")" + std::string(100000, 'x') + "\"";
  expectRefused(TestHost(), {"gi", path}, 2, "the path is 100033 bytes long; at most 65536 are read");
}

TEST(Get, MarksThePlaceWhereAPathIsWrong) {
  expectRefused(TestHost(), {"gi", R"(ZORVA_DNSSettingData.InstanceID="x)"}, 2,
                "\n  ZORVA_DNSSettingData.InstanceID=\"x\n                                  ^\n");
  expectRefused(TestHost(), {"gi", R"(ZORVA_X.R="ZORVA_Y.K=\"a\"",)"}, 2, "^");
}

TEST(Get, ReadsPathsNestedInPaths) {
  std::string path = R"(ZORVA_DNSSettingData.InstanceID="x")";
  for (int depth = 0; depth < 6; ++depth) {
    std::string quoted;
    for (const char c : path) quoted += (c == '"' || c == '\\' ? "\\" : "") + std::string(1, c);
    path = "ZORVA_DNSEndPointElementSettingData.SettingData=\"" + quoted + "\"";
  }
  const Outcome outcome = TestHost().run({"gi", path});
  EXPECT_NE(outcome.exitCode, 0);
  EXPECT_LT(outcome.exitCode, 128) << outcome.err;
}

TEST(Get, WritesMofAndXml) {
  EXPECT_THAT(shown(TestHost(), {"gi", kEth0, "-o", "mof"}),
              AllOf(StartsWith("instance of ZORVA_DNSProtocolEndPoint {\n"), HasSubstr("  EnabledState = 2;\n")));
  EXPECT_THAT(shown(TestHost(), {"gi", kEth0, "-o", "xml"}),
              AllOf(StartsWith("<?xml version=\"1.0\" encoding=\"utf-8\"?>\n<CIM "),
                    HasSubstr(R"(<PROPERTY NAME="EnabledState" TYPE="uint16"><VALUE>2</VALUE></PROPERTY>)"),
                    EndsWith("</CIM>\n")));
}

TEST(Enumerate, WritesXmlThatIsValid) {
  const TestHost host({TestHost::port("e\\u0001\\\"<th", R"("dns_suffixes": ["a&b", "]]>"])")});
  for (const char* name : {"CIM_ManagedElement", "CIM_Dependency", "CIM_Component", "ZORVA_SPComputerSystem"}) {
    EXPECT_EQ(cimxml::testing::grammarProblem(shown(host, {"ei", name, "-o", "xml"})), "") << name;
  }
}

// --- associations

TEST(Associators, AreThoseOfTheResultClass) {
  const json found = jsonShown(TestHost(), {"ai", kEth0, "--result-class", "CIM_RemoteServiceAccessPoint"});
  ASSERT_EQ(found.size(), 2U);
  EXPECT_EQ(found[0]["properties"]["Name"], "192.0.2.53");
}

TEST(Associators, AreThoseThroughTheAssociationAndTheRoles) {
  const auto count = [](const Words& filter) {
    Words words{"ain", kEth0};
    words.insert(words.end(), filter.begin(), filter.end());
    return jsonShown(TestHost(), words).size();
  };
  EXPECT_EQ(count({"--assoc-class", "zorva_remoteaccessavailabletoelement"}), 2U);
  EXPECT_EQ(count({"--assoc-class", "CIM_RemoteAccessAvailableToElement", "--role", "Dependent"}), 2U);
  EXPECT_EQ(count({"--assoc-class", "CIM_RemoteAccessAvailableToElement", "--role", "Antecedent"}), 0U);
  EXPECT_EQ(count({"--assoc-class", "CIM_RemoteAccessAvailableToElement", "--result-role", "Antecedent"}), 2U);
}

TEST(Associators, RefuseAClassThatIsNot) {
  expectRefused(TestHost(), {"ai", kEth0, "--result-class", "CIM_Nothing"}, 2, "there is no class CIM_Nothing");
  expectRefused(TestHost(), {"ri", kEth0, "--result-class", "CIM_Nothing"}, 2, "there is no class CIM_Nothing");
}

TEST(Associators, RefuseWhatNoAssociationCanMean) {
  const TestHost host;
  expectRefused(host, {"ai", kEth0, "--assoc-class", "ZORVA_DNSSettingData"}, 2,
                "ZORVA_DNSSettingData is no association");
  expectRefused(host, {"ain", "ZORVA_DNSGeneralSettingData", "--assoc-class", "ZORVA_RemoteAccessAvailableToElement"},
                2,
                "ZORVA_DNSGeneralSettingData is at no end of ZORVA_RemoteAccessAvailableToElement\n"
                "zorvactl: its ends are Antecedent (ZORVA_RemoteServiceAccessPoint) and Dependent (");
  expectRefused(host, {"ri", R"(ZORVA_DNSHostedAccessPoint.Dependent="ZORVA_DNSProtocolEndPoint.Name=\"eth0\"")"}, 2,
                "ZORVA_DNSHostedAccessPoint is at no end of any association");
  expectRefused(host, {"rin", kEth0, "--role", "fr\x1Bob"}, 2,
                "--role: no association that is meant has a reference fr\\x1Bob\nzorvactl: there are ");
  expectRefused(host, {"ain", kEth0, "--result-role", "Nobody"}, 2, "--result-role: no association");
}

TEST(Associators, WantASourceThatIsClear) {
  expectRefused(TestHost(), {"ain", "ZORVA_DNSProtocolEndPoint"}, 2, "2 instances fit ZORVA_DNSProtocolEndPoint");
  expectRefused(TestHost(), {"ain", R"(ZORVA_DNSProtocolEndPoint.Name="eth9")"}, 1, "there is no instance");
}

TEST(References, AreTheAssociationsThemselves) {
  const json names = jsonShown(TestHost(), {"rin", R"(ZORVA_RemoteServiceAccessPoint.Name="192.0.2.53")"});
  EXPECT_EQ(names.size(), 2U);
  const json found = jsonShown(TestHost(), {"ri", kEth0, "--result-class", "ZORVA_DNSHostedAccessPoint"});
  ASSERT_EQ(found.size(), 1U);
  EXPECT_EQ(found[0]["class"], "ZORVA_DNSHostedAccessPoint");
}

TEST(Graph, ReachesEveryObjectAndNamesWhatCannotBeFetched) {
  const std::string text = shown(TestHost(), {"graph"});
  EXPECT_THAT(text, StartsWith("ZORVA_ComputerSystem."));
  for (const char* each : {"ZORVA_DNSProtocolEndPoint eth1", "ZORVA_RemoteServiceAccessPoint 2001:db8::53",
                           "ZORVA_DNSSettingData Computer%eth0", "ZORVA_DNSGeneralSettingData dnsgen1:host1"}) {
    EXPECT_THAT(text, HasSubstr(each));
  }
  EXPECT_THAT(text, HasSubstr("\nReferences whose far end cannot be fetched:\n"
                              "  ZORVA_DNSGeneralElementSettingData.ManagedElement = ZORVA_ComputerSystem: "
                              "its provider gives this end without keys, by design"));
}

TEST(Graph, CanBeginAtOneObject) {
  EXPECT_THAT(shown(TestHost(), {"graph", kEth0}), StartsWith("ZORVA_DNSProtocolEndPoint."));
}

TEST(Graph, ShowsWhatIsThereWithoutTheCompanionLibrary) {
  const TestHost host;
  host.directory().link(ZORVA_LIB_DIR "/libzorvadnsclientprofileprovider.so.1",
                        "lib/libzorvadnsclientprofileprovider.so.1");
  const std::string directory = host.directory() / "lib";
  for (const char* companion : {"", "this is no library"}) {
    if (*companion != '\0') host.directory().write("lib/libzorvahostprofileprovider.so.1", companion);
    const Outcome outcome = host.run({"graph", "--provider-dir", directory});
    EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
    EXPECT_THAT(outcome.out, HasSubstr("ZORVA_DNSSettingData Computer%eth0"));
    EXPECT_THAT(outcome.out, EndsWith("\nEvery reference that could be asked for leads to an object.\n"));
    EXPECT_THAT(outcome.err, AllOf(StartsWith("zorvactl: warning: ZORVA_ComputerSystem, ZORVA_SPComputerSystem, "),
                                   HasSubstr("\nzorvactl: warning: associations of ZORVA_DNSProtocolEndPoint eth0, ")));
    EXPECT_EQ(std::count(outcome.err.begin(), outcome.err.end(), '\n'), 2) << outcome.err;
    EXPECT_THAT(shown(host, {"show", "--provider-dir", directory}),
                AllOf(HasSubstr("ZORVA_ComputerSystem                    - "),
                      HasSubstr("ZORVA_DNSProtocolEndPoint               2 ")));
  }
}

TEST(Graph, FailsWhereNothingCanBeAsked) {
  expectRefused(TestHost(), {"graph", "--provider-dir", "/nowhere"}, 1, "no class could be asked: ");
}

TEST(Graph, IsWrittenForGraphviz) {
  EXPECT_THAT(shown(TestHost(), {"graph", "-o", "dot"}), AllOf(StartsWith("digraph dns {"), EndsWith("}\n")));
  const json graph = jsonShown(TestHost(), {"graph"});
  EXPECT_GT(graph["objects"].size(), 6U);
  EXPECT_LT(graph["associations"][0]["Dependent"].get<std::size_t>(), graph["objects"].size());
}

TEST(Graph, SaysWhatToInstallForAPicture) {
  const Outcome without = TestHost().runWith({{"PATH", "/nowhere"}}, {"graph", "-o", "svg"});
  EXPECT_EQ(without.exitCode, 1);
  EXPECT_THAT(without.err, HasSubstr("apt-get install graphviz"));
}

// The program that stands for Graphviz's dot shows that it gets the graph, and that what it writes is the output.
TEST(Graph, IsDrawnByDot) {
  const TestHost host;
  const std::string dot = host.directory().write(
      "bin/dot", "#!/bin/sh\nread -r first\nwhile read -r line; do :; done\necho \"<svg>$1 $first</svg>\"\n");
  std::filesystem::permissions(dot, std::filesystem::perms::owner_all);
  const Outcome outcome = host.runWith({{"PATH", host.directory() / "bin"}}, {"graph", "-o", "svg"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(outcome.out, "<svg>-Tsvg digraph dns {</svg>\n");
}

// --- what is wrong around the commands

TEST(Configuration, ThatIsWrongIsToldInOneLine) {
  for (const auto& [toml, told] :
       std::vector<std::pair<std::string, std::string>>{{"[agent]\nfoo = 1\n", "agent.toml:2: agent.foo: "},
                                                        {"[log]\nlevel = \"high\"\n", "agent.toml:2: log.level: "},
                                                        {"[agent\n", "agent.toml:1: "}}) {
    const TestHost host;
    host.configure(toml);
    const Outcome outcome = host.run({"show"});
    EXPECT_EQ(outcome.exitCode, 2) << toml;
    EXPECT_THAT(outcome.err, HasSubstr(told));
    EXPECT_EQ(std::count(outcome.err.begin(), outcome.err.end(), '\n'), 1) << outcome.err;
  }
}

TEST(Configuration, CanBeNamedOnTheCommandLine) {
  const TestHost host;
  host.configure("[agent]\nfoo = 1\n");
  const TestHost other;
  EXPECT_EQ(host.run({"names", "ZORVA_DNSSettingData", "--config", other.directory() / "agent.toml"}).exitCode, 0);
  expectRefused(host, {"show", "--config", "/nowhere/agent.toml"}, 2, "/nowhere/agent.toml");
}

TEST(TreeFile, ThatIsWrongIsToldInOneLineWithItsPlace) {
  const TestHost host;
  for (const auto& [tree, told] : std::vector<std::pair<std::string, std::string>>{
           {"{\n\"system_name\": 5, \"nodes\": []}", "tree.json:2: system_name: "},
           {"{\n\n", "tree.json:2: "},
           {R"({"system_name": "h", "frob": 1, "nodes": []})", "tree.json:1: frob: "}}) {
    host.writeTree(tree);
    for (const char* command : {"show", "tree", "classes", "graph"}) {
      const Outcome outcome = host.run({command});
      EXPECT_EQ(outcome.exitCode, 2) << command << tree;
      EXPECT_THAT(outcome.err, HasSubstr(told));
      EXPECT_EQ(std::count(outcome.err.begin(), outcome.err.end(), '\n'), 1) << outcome.err;
    }
  }
}

TEST(Overlay, ThatIsWrongIsAWarningWhereTheHostIsRead) {
  const TestHost host;
  host.directory().write("data/overlay.json", "{\n{");
  const Outcome outcome = host.run({"show"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_THAT(outcome.err, AllOf(StartsWith("zorvactl: warning: "), HasSubstr("overlay.json:2: ")));
}

TEST(StandardOutput, ThatIsFullIsAFailure) {
  const Outcome outcome = TestHost().run({"ei", "ZORVA_DNSProtocolEndPoint"}, OutputTo::FullDevice);
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("cannot write to standard output: No space left on device"));
}

TEST(LogLevel, ShowsTheWayOfTheProviders) {
  EXPECT_THAT(TestHost().run({"ei", "ZORVA_DNSProtocolEndPoint"}).err, IsEmpty());
  EXPECT_THAT(TestHost().run({"ei", "ZORVA_DNSProtocolEndPoint", "--log-level", "3000"}).err,
              HasSubstr("DNSClient_EnumInstances"));
}

TEST(Names, OfAnyBytesComeOutWhole) {
  const TestHost host({TestHost::port("\xF4\x8E\xBB\xBF")});  // the byte FF, as the agent's documents have it
  EXPECT_THAT(shown(host, {"ein", "ZORVA_DNSSettingData"}), HasSubstr("Computer%\\xFF"));
  EXPECT_EQ(jsonShown(host, {"ei", "ZORVA_DNSProtocolEndPoint"})[0]["properties"]["Name"], "\xF4\x8E\xBB\xBF");
}

TEST(CompletionScript, AsksTheProgramForClassesAndInterfaces) {
  const TestHost host;
  EXPECT_THAT(shown(host, {"completion", "bash"}), HasSubstr("complete -o default -F _zorvactl zorvactl"));
  EXPECT_EQ(shown(host, {"complete", "--", "dns", "set", "eth"}), "eth0\neth1\n");
  EXPECT_EQ(shown(host, {"complete", "--", "dns", "set", "--url", "http://other", "eth"}), "");
  EXPECT_EQ(shown(host, {"complete", "--", "ei", "zorva_dnsgeneralS"}), "ZORVA_DNSGeneralSettingData\n");
  EXPECT_EQ(shown(host, {"complete", "--", "ov"}), "overlay\n");
  EXPECT_EQ(shown(host, {"complete", "--", "modify", "--dr"}), "--dry-run\n");
  EXPECT_EQ(shown(host, {"complete"}), "");
}

TEST(CompletionScript, KnowsWhatBelongsToAClass) {
  const TestHost host;
  EXPECT_EQ(shown(host, {"complete", "--", "modify", R"('ZORVA_DNSSettingData.InstanceID="x"')", "domain"}),
            "DomainName=\n");
  EXPECT_EQ(shown(host, {"complete", "--", "cm", "ZORVA_DNSProtocolEndPoint", "SetDNSD"}), "SetDNSDomain\n");
  EXPECT_EQ(shown(host, {"complete", "--", "cm", "ZORVA_DNSProtocolEndPoint", "SetDNSDomain", ""}), "DNSDomain=\n");
  EXPECT_EQ(shown(host, {"complete", "--", "ei", "ZORVA_DNSSettingData", "--property", "domain"}), "DomainName\n");
  EXPECT_THAT(shown(host, {"complete", "--", "ain", "ZORVA_RemoteServiceAccessPoint", "--role", ""}),
              StartsWith("Antecedent\nDependent\n"));
  EXPECT_EQ(shown(host, {"complete", "--", "graph", "-o", ""}), "table\njson\ndot\nsvg\n");
  EXPECT_EQ(shown(host, {"complete", "--", "completion", ""}), "bash\n");
}

TEST(CompletionScript, PutsTogetherTheWordsThatBashTookApart) {
  const TestHost host;
  EXPECT_EQ(shown(host, {"complete", "--", "show", "--output", "=", "j"}), "json\n");
  EXPECT_EQ(shown(host, {"complete", "--", "cm", "'ZORVA_DNSProtocolEndPoint.Name", "=", "\"eth0\"'", "SetDNSD"}),
            "SetDNSDomain\n");
  EXPECT_EQ(shown(host, {"complete", "--", "gi", "ZORVA_DNSProtocolEndPoint.Name", "="}), "");
}

TEST(CompletionScript, IsTheOneThatIsInstalled) {
  EXPECT_EQ(shown(TestHost(), {"completion", "bash"}),
            zorva::agent::testing::contentsOf(ZORVA_SOURCE_DIR "/cli/zorvactl.bash"));
}

TEST(CompletionScript, WorksInBash) {
  if (std::system("command -v bash >/dev/null") != 0) GTEST_SKIP() << "there is no bash";
  const std::string script = "source <(" ZORVA_BIN_DIR "/zorvactl completion bash); COMP_WORDS=(" ZORVA_BIN_DIR
                             "/zorvactl tre); COMP_CWORD=1; _zorvactl; [ \"${COMPREPLY[*]}\" = tree ]";
  EXPECT_EQ(std::system(("bash -c '" + script + "'").c_str()), 0);
}

}  // namespace
}  // namespace zorva::cli
