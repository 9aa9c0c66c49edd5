// zorvactl as a process, on hosts that are tree files: the commands that change something.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <nlohmann/json.hpp>

#include "cli/testing/TestHost.h"

namespace zorva::cli {
namespace {

using nlohmann::json;
using testing::AllOf;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using zorva::agent::testing::contentsOf;

using Words = std::vector<std::string>;

constexpr const char* kSetting = R"(ZORVA_DNSSettingData.InstanceID="Computer%eth0")";
constexpr const char* kGeneral = "ZORVA_DNSGeneralSettingData";
constexpr const char* kEndpoint = R"(ZORVA_DNSProtocolEndPoint.Name="eth0")";
constexpr const char* kWholeFile =
    "BOOTPROTO=none\nHOSTNAME=host1\nDOMAINNAME=example.org\nCONFIG_NAME=\nDNSSERVERS=192.0.2.53 2001:db8::53 \n"
    "DNSSUFFIXES=example.org example.net \n";

/// Does it without a warning.
std::string done(const TestHost& host, const Words& words) {
  const Outcome outcome = host.run(words);
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(outcome.err, "");
  return outcome.out;
}

void expectRefused(const TestHost& host, const Words& words, int exitCode, const std::string& told) {
  const Outcome outcome = host.run(words);
  EXPECT_EQ(outcome.exitCode, exitCode) << outcome.out;
  EXPECT_THAT(outcome.err, HasSubstr(told));
}

/// A host on which both interfaces have their files.
class Changing : public testing::Test {
 protected:
  Changing() { host_.directory().write("data/ifcfg-eth0", kWholeFile); }

  std::string file() const { return contentsOf(host_.dataFile("ifcfg-eth0")); }

  /// The file with one line changed.
  static std::string wholeFileWith(const std::string& from, const std::string& to) {
    std::string text = kWholeFile;
    return text.replace(text.find(from), from.size(), to);
  }

  TestHost host_;
};

// --- ifcfg

TEST(IfcfgInit, WritesAllSixKeysFromTheHost) {
  const TestHost host;
  EXPECT_THAT(done(host, {"ifcfg", "init", "eth0"}), HasSubstr("  DOMAINNAME   example.org\n"));
  EXPECT_EQ(contentsOf(host.dataFile("ifcfg-eth0")), kWholeFile);
  EXPECT_THAT(done(host, {"ifcfg", "show", "eth0"}), HasSubstr("  DNSSERVERS   192.0.2.53 2001:db8::53\n"));
}

TEST(IfcfgInit, ChangesNothingThatTheProvidersSay) {
  const TestHost host({TestHost::port("eth0", R"("domain_name": "example.org", "dns_suffixes": ["a", "b"])")});
  const std::string before = done(host, {"ei", "CIM_SettingData", "-o", "json"});
  done(host, {"ifcfg", "init", "eth0"});
  EXPECT_EQ(done(host, {"ei", "CIM_SettingData", "-o", "json"}), before);
}

TEST_F(Changing, IfcfgInitReplacesAFileOnlyWhenTold) {
  host_.directory().write("data/ifcfg-eth0", "HOSTNAME=mine\n");
  expectRefused(host_, {"ifcfg", "init", "eth0"}, 1, "stands already\nzorvactl: --force puts a new file in its place");
  EXPECT_EQ(file(), "HOSTNAME=mine\n");
  done(host_, {"ifcfg", "init", "eth0", "--force"});
  EXPECT_EQ(file(), kWholeFile);
}

TEST(IfcfgInit, WritesNothingOnADryRun) {
  const TestHost host;
  EXPECT_THAT(done(host, {"ifcfg", "init", "eth0", "--dry-run"}), testing::StartsWith("would write "));
  EXPECT_FALSE(std::filesystem::exists(host.dataFile("ifcfg-eth0")));
}

TEST(IfcfgInit, MakesTheUsualDataDirectoryWhereRootAsks) {
  const TestHost host;
  host.configure("[tree]\nsource = \"file\"\nfile = \"tree.json\"\n");
  const Outcome outcome = host.runOnFreshMachine({"ifcfg", "init", "eth0"});
  if (outcome.exitCode == 127) GTEST_SKIP() << "no /var/lib of its own can be mounted here";
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_THAT(outcome.out, testing::StartsWith("/var/lib/zorvagent/ifcfg-eth0\n"));
}

TEST(IfcfgInit, MakesNoDirectoryOfAnotherName) {
  const TestHost host;
  std::filesystem::remove(host.dataFile(""));
  expectRefused(host, {"ifcfg", "init", "eth0"}, 1,
                "there is no such data directory\nzorvactl: make the data directory");
}

TEST(IfcfgInit, NamesTheInterfacesThereAre) {
  expectRefused(TestHost(), {"ifcfg", "init", "eth7"}, 1, "no interface eth7\nzorvactl: it has eth0, eth1");
}

TEST(IfcfgInit, RefusesNamesThatLeadOutOfTheDirectory) {
  const TestHost host({TestHost::port("p", R"("name": "../../x")")});
  expectRefused(TestHost(), {"ifcfg", "init", "../x"}, 2, "cannot be the name of an interface");
}

TEST(IfcfgInit, WritesWholeOrNotAtAll) {
  const TestHost host({TestHost::port("eth0", R"("domain_name": "a\nHOSTNAME=evil")")});
  expectRefused(host, {"ifcfg", "init", "eth0"}, 1, "DOMAINNAME would hold control characters: 'a\\nHOSTNAME=evil'");
  EXPECT_FALSE(std::filesystem::exists(host.dataFile("ifcfg-eth0")));
}

TEST(IfcfgShow, MarksTheLinesThatAreMissing) {
  const TestHost host;
  host.directory().write("data/ifcfg-eth0", "HOSTNAME=x\nMTU=1500\n");
  EXPECT_THAT(done(host, {"ifcfg", "show", "eth0"}),
              AllOf(HasSubstr("  HOSTNAME     x\n  MTU          1500\n"), HasSubstr("  DNSSERVERS   (no such line")));
  EXPECT_EQ(json::parse(done(host, {"ifcfg", "show", "eth0", "-o", "json"}))["lines"].size(), 2U);
  expectRefused(host, {"ifcfg", "show", "eth1"}, 1,
                "No such file or directory\nzorvactl: zorvactl ifcfg init makes it");
}

// --- modify

TEST_F(Changing, ModifyChangesOneSettingAndLeavesTheOthers) {
  host_.directory().write("data/ifcfg-eth0", wholeFileWith("CONFIG_NAME=", "CONFIG_NAME=office"));
  EXPECT_EQ(done(host_, {"modify", kSetting, "domainname=lab.example.org"}),
            "ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"\n  DomainName  lab.example.org\n");
  EXPECT_EQ(file(),
            "BOOTPROTO=none\nHOSTNAME=host1\nDOMAINNAME=lab.example.org\nCONFIG_NAME=office\n"
            "DNSSERVERS=192.0.2.53 2001:db8::53 \nDNSSUFFIXES=example.org example.net \n");
}

TEST_F(Changing, ModifyWithOnlySendsWhatIsNamedAlone) {
  host_.directory().write("data/ifcfg-eth0", wholeFileWith("CONFIG_NAME=", "CONFIG_NAME=office"));
  done(host_, {"modify", kSetting, "DomainName=lab.example.org", "--only"});
  EXPECT_EQ(file(),
            wholeFileWith("DOMAINNAME=example.org\nCONFIG_NAME=", "DOMAINNAME=lab.example.org\nCONFIG_NAME=office"));
}

TEST_F(Changing, ModifySetsArraysInTheirOrder) {
  done(host_, {"modify", kSetting, "DNSServerAddresses=2001:db8::1", "DNSServerAddresses=192.0.2.1"});
  EXPECT_EQ(file(), wholeFileWith("192.0.2.53 2001:db8::53 ", "2001:db8::1 192.0.2.1 "));
}

TEST_F(Changing, ModifyEmptiesWhatIsGivenEmpty) {
  done(host_, {"modify", kSetting, "DNSServerAddresses=", "DomainName="});
  EXPECT_THAT(file(), AllOf(HasSubstr("DNSSERVERS=\n"), HasSubstr("DOMAINNAME=\n")));
}

TEST_F(Changing, ModifyLeavesLinesAloneThatOnlyContainAKey) {
  const std::string others = "# HOSTNAME is what DHCP is told\nDHCP_HOSTNAME=dhcp\nNISDOMAINNAME=nis\n";
  host_.directory().write("data/ifcfg-eth0", others + kWholeFile);
  done(host_, {"modify", kSetting, "DNSServerAddresses=192.0.2.1"});
  EXPECT_EQ(file(), others + wholeFileWith("192.0.2.53 2001:db8::53 ", "192.0.2.1 "));
}

TEST_F(Changing, ModifySaysThatNullLeavesAValueAsItIs) {
  expectRefused(host_, {"modify", kSetting, "DomainName=null"}, 1,
                "DomainName was not stored: null leaves the value as it is; an empty value empties it");
  EXPECT_EQ(file(), kWholeFile);
}

TEST_F(Changing, ModifyReachesTheSettingsOfTheHost) {
  done(host_, {"modify", kGeneral, "DNSSuffixesToAppend=a.example", "ConfigurationName=office"});
  EXPECT_THAT(file(), AllOf(HasSubstr("DNSSUFFIXES=a.example \n"), HasSubstr("CONFIG_NAME=office\n")));
}

TEST_F(Changing, ModifyOfAnEndpointChangesTheTreeAndNotTheFile) {
  done(host_, {"mi", kEndpoint, "DomainName=node.example.org", "DNSSuffixesToAppend=x.example"});
  EXPECT_EQ(file(), kWholeFile);
  EXPECT_THAT(done(host_, {"tree"}), AllOf(HasSubstr("node.example.org  (set; not the host's own)\n"),
                                           HasSubstr("host_name             host1\n")));
  EXPECT_EQ(json::parse(done(host_, {"overlay", "show", "-o", "json"})),
            json::parse(R"([{"node": "/system/eth0/ip", "property": "domain_name", "value": "node.example.org"},
                            {"node": "/system/eth0/ip", "property": "dns_suffixes", "value": ["x.example"]}])"));
}

TEST(Modify, OfAnEndpointDoesNotSetWhatTheHostLeavesEmpty) {
  const TestHost host({TestHost::port("eth0")});
  done(host, {"mi", kEndpoint, "DNSSuffixesToAppend=x.example"});
  EXPECT_EQ(json::parse(done(host, {"overlay", "show", "-o", "json"})).size(), 1U);
}

TEST(Modify, FailsWhereThereIsNoFile) {
  const TestHost host;
  const Outcome outcome = host.run({"modify", kSetting, "DomainName=lab.example.org"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("DomainName was not stored: " + host.dataFile("ifcfg-eth0") +
                                     " does not exist; 'zorvactl ifcfg init eth0' makes it, then repeat this"));
  EXPECT_FALSE(std::filesystem::exists(host.dataFile("ifcfg-eth0")));
}

TEST(Modify, FailsWhereThereIsNoFileAlsoForAValueThatTheHostHasAnyway) {
  expectRefused(TestHost(), {"modify", kSetting, "DomainName=example.org"}, 1, "was not stored");
}

TEST_F(Changing, ModifyFailsWhereTheKeyIsMissing) {
  host_.directory().write("data/ifcfg-eth0", "HOSTNAME=h\n");
  const Outcome outcome = host_.run({"modify", kSetting, "DomainName=lab.example.org", "RequestedHostname=new"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("DomainName was not stored"), HasSubstr("has no line DOMAINNAME="),
                                 Not(HasSubstr("RequestedHostname was not stored"))));
  EXPECT_EQ(file(), "HOSTNAME=new\n");
}

TEST_F(Changing, ModifyIsRefusedToWhoMayNotWriteInTheDataDirectory) {
  ::chmod(host_.dataFile("ifcfg-eth0").c_str(), 0444);
  const Outcome outcome = host_.runAsNobody({"modify", kSetting, "DomainName=lab.example.org"});
  if (outcome.exitCode == 127) GTEST_SKIP() << "another user cannot run what was built here";
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("settings.lock: cannot be opened: Permission denied"));
  EXPECT_EQ(file(), kWholeFile);
}

TEST_F(Changing, IfcfgInitTellsWhereItMayNotWrite) {
  const Outcome outcome = host_.runAsNobody({"ifcfg", "init", "eth1"});
  if (outcome.exitCode == 127) GTEST_SKIP() << "another user cannot run what was built here";
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("nothing was changed: " + host_.dataFile("settings.lock") +
                                     ": cannot be opened: Permission denied"));
}

TEST_F(Changing, ModifyFailsWithFilesThatAreNone) {
  for (const char* kind : {"directory", "pipe", "link"}) {
    std::filesystem::remove_all(host_.dataFile("ifcfg-eth0"));
    if (kind == std::string("directory")) std::filesystem::create_directory(host_.dataFile("ifcfg-eth0"));
    if (kind == std::string("pipe")) ::mkfifo(host_.dataFile("ifcfg-eth0").c_str(), 0600);
    if (kind == std::string("link")) host_.directory().link("/nowhere", "data/ifcfg-eth0");
    const Outcome outcome = host_.run({"modify", kSetting, "DomainName=lab.example.org"});
    EXPECT_EQ(outcome.exitCode, 1) << kind;
    EXPECT_THAT(outcome.err, HasSubstr("DomainName was not stored")) << kind;
  }
}

TEST_F(Changing, ModifyRefusesAPropertyThatItsProviderKeeps) {
  expectRefused(host_, {"modify", kSetting, "Caption=x", "DomainName=lab.example.org"}, 1,
                "CIM_ERR_NOT_SUPPORTED (7): these properties of ZORVA_DNSSettingData cannot be changed: Caption\n");
  EXPECT_EQ(file(), kWholeFile) << "nothing is written where a part is refused";
}

TEST(Modify, SaysThatTheDataDirectoryIsMissing) {
  const TestHost host;
  std::filesystem::remove(host.dataFile(""));
  for (const char* object : {kEndpoint, kSetting}) {
    expectRefused(host, {"modify", object, "DomainName=x.example"}, 1,
                  "nothing was changed: " + host.dataFile("") +
                      ": there is no such data directory\n"
                      "zorvactl: make the data directory, or name another");
  }
}

TEST_F(Changing, ModifyHandsOnTheRefusalOfADomain) {
  expectRefused(host_, {"modify", kSetting, "RequestedHostname=good", "DomainName=bad name"}, 1,
                "CIM_ERR_INVALID_PARAMETER (4)");
  EXPECT_EQ(file(), wholeFileWith("HOSTNAME=host1", "HOSTNAME=good")) << "what came before it is written";
}

TEST_F(Changing, ModifyRefusesWhatItCannotSend) {
  for (const auto& [word, told] : std::vector<std::pair<std::string, std::string>>{
           {"DomainName=a\nHOSTNAME=evil", "byte 2 is a control character"},
           {"DomainName=\xFF", "is no UTF-8"},
           {"Frob=1", "has no property Frob\nzorvactl: it has InstanceID"},
           {"InstanceID=x", "InstanceID is a key"},
           {"AddressOrigin=many", "a uint16 is wanted"},
           {"DomainName", "is no assignment"}}) {
    expectRefused(host_, {"modify", kSetting, word}, 2, told);
  }
  EXPECT_EQ(file(), kWholeFile);
}

TEST_F(Changing, ModifySendsNothingOnADryRun) {
  EXPECT_THAT(done(host_, {"modify", kSetting, "DomainName=lab.example.org", "--dry-run"}),
              AllOf(testing::StartsWith("would send "), HasSubstr("  DomainName                lab.example.org\n"),
                    HasSubstr("  RequestedHostname")));
  EXPECT_EQ(file(), kWholeFile);
}

TEST_F(Changing, ModifyTakesLongTextsAndManyElements) {
  const std::string name(100000, 'x');
  done(host_, {"modify", kSetting, "ConfigurationName=" + name});
  EXPECT_EQ(file(), wholeFileWith("CONFIG_NAME=", "CONFIG_NAME=" + name));
  Words words{"modify", kSetting};
  for (int i = 0; i < 20000; ++i) words.push_back("DNSServerAddresses=192.0.2.1");
  EXPECT_EQ(host_.run(words).exitCode, 0);
}

TEST(Modify, NamesTheClassThatCannotBeModified) {
  expectRefused(TestHost(), {"modify", R"(ZORVA_RemoteServiceAccessPoint.Name="192.0.2.53")", "ElementName=x"}, 1,
                "CIM_ERR_NOT_SUPPORTED (7)");
}

// --- dns, domain, suffixes

TEST_F(Changing, DnsCommandsChangeTheServers) {
  done(host_, {"dns", "set", "eth0", "192.0.2.1", "2001:db8::1"});
  EXPECT_EQ(file(), wholeFileWith("192.0.2.53 2001:db8::53 ", "192.0.2.1 2001:db8::1 "));
  done(host_, {"dns", "add", "eth0", "192.0.2.2", "192.0.2.1"});
  EXPECT_EQ(done(host_, {"dns", "show", "eth0"}), "192.0.2.1\n2001:db8::1\n192.0.2.2\n");
  done(host_, {"dns", "remove", "eth0", "2001:db8::1"});
  EXPECT_EQ(done(host_, {"dns", "show", "eth0", "-o", "json"}), "[\n  \"192.0.2.1\",\n  \"192.0.2.2\"\n]\n");
  done(host_, {"dns", "set", "eth0"});
  EXPECT_EQ(file(), wholeFileWith("192.0.2.53 2001:db8::53 ", ""));
}

TEST_F(Changing, DnsCommandsRefuseWhatIsNoAddress) {
  for (const char* server : {"dns.example.org", "1.2.3", "1.2.3.4 5.6.7.8", "", "1.2.3.4%eth0", "fe80::1%", "::1\n"}) {
    expectRefused(host_, {"dns", "set", "eth0", server}, 2, "");
  }
  expectRefused(host_, {"dns", "remove", "eth0", "198.51.100.1"}, 1,
                "there is no server 198.51.100.1 to remove\nzorvactl: there are 192.0.2.53, 2001:db8::53");
  EXPECT_EQ(file(), kWholeFile);
  done(host_, {"dns", "add", "eth0", "fe80::1%eth0"});
}

TEST_F(Changing, DnsCommandsNameTheInterfacesThereAre) {
  expectRefused(host_, {"dns", "show", "eth7"}, 1, "interface eth7\nzorvactl: there are those of eth0, eth1");
}

TEST(Dns, FailsWhereThereIsNoFile) {
  const Outcome outcome = TestHost().run({"dns", "set", "eth0", "192.0.2.1"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("'zorvactl ifcfg init eth0' makes it"));
  EXPECT_THAT(TestHost().run({"dns", "set", "eth0", "192.0.2.1", "--dry-run"}).err, HasSubstr("would not be stored"));
}

TEST_F(Changing, DomainSetsTheDomain) {
  done(host_, {"domain", "eth0", "lab.example.org"});
  EXPECT_EQ(file(), wholeFileWith("DOMAINNAME=example.org", "DOMAINNAME=lab.example.org"));
  done(host_, {"domain", "eth0", ""});
  EXPECT_EQ(file(), wholeFileWith("DOMAINNAME=example.org", "DOMAINNAME="));
}

TEST_F(Changing, DomainSaysInOneSentenceWhatIsNoName) {
  const Outcome outcome = host_.run({"domain", "eth0", "bad..name"});
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_EQ(
      outcome.err,
      "zorvactl: 'bad..name' is no domain name: it has letters, digits, '-' and '_' between single dots, at most 63 "
      "in each part and 253 in all\n");
  EXPECT_EQ(file(), kWholeFile);
}

TEST_F(Changing, ModifyShowsNoLogLineOfAProvider) {
  EXPECT_THAT(host_.run({"modify", kSetting, "DomainName=bad..name"}).err, Not(HasSubstr("MESSAGE")));
}

TEST_F(Changing, AValueThatBeginsWithAHyphenGoesAfterTwoOfThem) {
  done(host_, {"domain", "eth0", "--", "-x.example.org"});
  EXPECT_EQ(file(), wholeFileWith("DOMAINNAME=example.org", "DOMAINNAME=-x.example.org"));
  done(host_, {"suffixes", "set", "--", "--help", "-o"});
  EXPECT_EQ(done(host_, {"suffixes", "show"}), "--help\n-o\n");
  expectRefused(host_, {"domain", "eth0", "-x.example.org"}, 2, "a value that begins with '-' goes after --; ");
}

TEST_F(Changing, DnsCommandsRefuseWhatNoServerHas) {
  for (const char* command : {"set", "add"}) {
    for (const char* server : {"0.0.0.0", "::", "::ffff:0.0.0.0"}) {
      expectRefused(host_, {"dns", command, "eth0", "192.0.2.1", server}, 2,
                    std::string("'") + server + "' is the unspecified address");
    }
    for (const char* server : {"224.0.0.1", "239.255.255.255", "ff02::fb", "::ffff:224.0.0.1"}) {
      expectRefused(host_, {"dns", command, "eth0", server}, 2, std::string("'") + server + "' is a multicast address");
    }
    for (const Words& pair : std::vector<Words>{{"192.0.2.1", "192.0.2.1"}, {"2001:db8::1", "2001:DB8:0::1"}}) {
      expectRefused(host_, {"dns", command, "eth0", pair[0], pair[1]}, 2, "'" + pair[1] + "' is given twice");
    }
  }
  EXPECT_EQ(file(), kWholeFile);
  done(host_, {"dns", "set", "eth0", "fe80::1%eth0", "fe80::1%eth1", "223.255.255.1"});
}

TEST_F(Changing, DnsAddKnowsAServerInAnySpelling) {
  done(host_, {"dns", "add", "eth0", "2001:DB8:0::53"});
  EXPECT_EQ(file(), kWholeFile);
}

TEST_F(Changing, SuffixCommandsRefuseWhatIsNoName) {
  for (const char* command : {"set", "add"}) {
    for (const char* suffix : {"a b", "", "a..b", "under/score", "192.0.2.1%", "m\xC3\xBCller.example"}) {
      expectRefused(host_, {"suffixes", command, "good.example", suffix}, 2,
                    std::string("'") + suffix + "' is no suffix");
    }
    expectRefused(host_, {"suffixes", command, "a.example", "A.Example."}, 2, "'A.Example.' is given twice");
  }
  EXPECT_EQ(file(), kWholeFile);
}

TEST_F(Changing, SuffixCommandsChangeTheSuffixesOfTheHost) {
  done(host_, {"suffixes", "set", "a.example", "b.example"});
  EXPECT_EQ(file(), wholeFileWith("DNSSUFFIXES=example.org example.net ", "DNSSUFFIXES=a.example b.example "));
  done(host_, {"suffixes", "add", "c.example"});
  done(host_, {"suffixes", "remove", "a.example"});
  EXPECT_EQ(done(host_, {"suffixes", "show"}), "b.example\nc.example\n");
  EXPECT_EQ(done(host_, {"suffixes", "set"}),
            "ZORVA_DNSGeneralSettingData.InstanceID=\"dnsgen1:host1\"\n  DNSSuffixesToAppend\n");
}

TEST(Suffixes, SayThatAHostWithoutInterfacesHasNone) {
  expectRefused(TestHost(Words{}), {"suffixes", "show"}, 1, "no general DNS settings");
}

// --- overlay

TEST_F(Changing, OverlayClearGivesBackWhatTheHostSays) {
  done(host_, {"mi", kEndpoint, "DomainName=set.example"});
  EXPECT_EQ(done(host_, {"overlay", "clear", "eth0"}), "1 value taken back\n");
  EXPECT_THAT(done(host_, {"tree"}), AllOf(HasSubstr("example.org"), Not(HasSubstr("not the host's own"))));
  expectRefused(host_, {"overlay", "clear", "eth0"}, 1, "no value is set for eth0");
  EXPECT_EQ(done(host_, {"overlay", "clear"}), "0 values taken back\n");
  EXPECT_THAT(host_.run({"overlay", "show"}).err, HasSubstr("note: no value is set"));
}

TEST_F(Changing, OverlayThatIsWrongIsToldAndCanBeCleared) {
  host_.directory().write("data/overlay.json", "{\n{");
  expectRefused(host_, {"overlay", "show"}, 2, "overlay.json:2: ");
  EXPECT_EQ(host_.run({"overlay", "clear"}).exitCode, 0);
  EXPECT_EQ(host_.run({"overlay", "show"}).exitCode, 0);
}

// --- invoke

TEST(Invoke, AnswersAndSaysThatNothingChanges) {
  const TestHost host;
  const std::string before = done(host, {"ei", "CIM_ManagedElement", "-o", "json"});
  for (const Words& words : std::vector<Words>{
           {"SetDNSDomain", "DNSDomain=x.example.org"},
           {"setdnsserversearchorder", "DNSServerSearchOrder=192.0.2.1"},
           {"SetDNSSuffixSearchOrder", "DNSDomainSuffixSearchOrder=a", "DNSDomainSuffixSearchOrder=b"}}) {
    Words all{"invoke", kEndpoint};
    all.insert(all.end(), words.begin(), words.end());
    const Outcome outcome = host.run(all);
    EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
    EXPECT_EQ(outcome.out, "ReturnValue  0\n");
    EXPECT_THAT(outcome.err, HasSubstr("changes nothing"));
  }
  EXPECT_EQ(done(host, {"ei", "CIM_ManagedElement", "-o", "json"}), before);
}

TEST(Invoke, NamesTheMethodsAndParametersThereAre) {
  expectRefused(TestHost(), {"cm", kEndpoint, "Frob"}, 2, "has no method Frob\nzorvactl: it has ");
  expectRefused(TestHost(), {"cm", kEndpoint, "SetDNSDomain", "Domain=x"}, 2,
                "SetDNSDomain has no parameter Domain\nzorvactl: it has DNSDomain");
  expectRefused(TestHost(), {"cm", kEndpoint, "SetDNSDomain", "DNSDomain=a", "DNSDomain=b"}, 2, "takes one value");
}

TEST(Invoke, SaysWhatTheMethodTakesWhereItRefuses) {
  expectRefused(TestHost(), {"cm", kEndpoint, "SetDNSServerSearchOrder"}, 1,
                "\nzorvactl: SetDNSServerSearchOrder takes DNSServerSearchOrder (string, repeated)");
}

TEST(Invoke, GivesJson) {
  EXPECT_EQ(json::parse(TestHost().run({"cm", kEndpoint, "SetDNSDomain", "DNSDomain=x", "-o", "json"}).out),
            json::parse(R"({"return_value": 0, "output": {}})"));
}

}  // namespace
}  // namespace zorva::cli
