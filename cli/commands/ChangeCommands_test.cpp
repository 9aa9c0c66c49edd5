#include <sys/stat.h>

#include <filesystem>

#include "cli/output/Text.h"
#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

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
  expectFailed(host_, {"modify", kSetting, "DomainName=null"}, 1,
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
  EXPECT_EQ(contentOf(done(host_, {"overlay", "show", "-o", "json"})),
            json::parse(R"([{"node": "/system/eth0/ip", "property": "domain_name", "value": "node.example.org"},
                            {"node": "/system/eth0/ip", "property": "dns_suffixes", "value": ["x.example"]}])"));
}

TEST(Modify, OfAnEndpointDoesNotSetWhatTheHostLeavesEmpty) {
  const TestHost host({TestHost::port("eth0")});
  done(host, {"mi", kEndpoint, "DNSSuffixesToAppend=x.example"});
  EXPECT_EQ(contentOf(done(host, {"overlay", "show", "-o", "json"})).size(), 1U);
}

TEST(Modify, FailsIfThereIsNoFile) {
  const TestHost host;
  const Outcome outcome = host.run({"modify", kSetting, "DomainName=lab.example.org"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("DomainName was not stored: " + host.dataFile("ifcfg-eth0") +
                                     " does not exist; 'zorvactl ifcfg init eth0' makes it, then repeat this"));
  EXPECT_FALSE(std::filesystem::exists(host.dataFile("ifcfg-eth0")));
}

TEST(Modify, FailsIfThereIsNoFileEvenForAValueThatTheHostHas) {
  expectFailed(TestHost(), {"modify", kSetting, "DomainName=example.org"}, 1, "was not stored");
}

TEST_F(Changing, ModifyFailsIfTheKeyIsMissing) {
  host_.directory().write("data/ifcfg-eth0", "HOSTNAME=h\n");
  const Outcome outcome = host_.run({"modify", kSetting, "DomainName=lab.example.org", "RequestedHostname=new"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("DomainName was not stored"), HasSubstr("has no line DOMAINNAME="),
                                 Not(HasSubstr("RequestedHostname was not stored"))));
  EXPECT_EQ(file(), "HOSTNAME=new\n");
}

TEST_F(Changing, ModifyIsRefusedToWhoMayNotWriteInTheDataDirectory) {
  ::chmod(host_.dataFile("ifcfg-eth0").c_str(), 0444);
  const Outcome outcome = host_.runUnprivileged({"modify", kSetting, "DomainName=lab.example.org"});
  if (outcome.exitCode == 127) GTEST_SKIP() << "another user cannot run what was built here";
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("settings.lock: cannot be opened: Permission denied"));
  EXPECT_EQ(file(), kWholeFile);
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
  expectFailed(host_, {"modify", kSetting, "Caption=x", "DomainName=lab.example.org"}, 1,
               "CIM_ERR_NOT_SUPPORTED (7): these properties of ZORVA_DNSSettingData cannot be changed: Caption\n");
  EXPECT_EQ(file(), kWholeFile) << "nothing is written where a part is refused";
}

TEST(Modify, SaysThatTheDataDirectoryIsMissing) {
  const TestHost host;
  std::filesystem::remove(host.dataFile(""));
  for (const char* object : {kEndpoint, kSetting}) {
    expectFailed(host, {"modify", object, "DomainName=x.example"}, 1,
                 "nothing was changed: " + host.dataFile("") +
                     ": there is no such data directory\n"
                     "zorvactl: make the data directory, or name another");
  }
}

TEST_F(Changing, ModifyPassesOnTheRefusalOfADomain) {
  expectFailed(host_, {"modify", kSetting, "RequestedHostname=good", "DomainName=bad name"}, 1,
               "CIM_ERR_INVALID_PARAMETER (4)");
  EXPECT_EQ(file(), wholeFileWith("HOSTNAME=host1", "HOSTNAME=good")) << "what came before it is written";
}

TEST_F(Changing, ModifyRefusesWhatItCannotSend) {
  for (const auto& [word, told] : std::vector<std::pair<std::string, std::string>>{
           {"DomainName=a\nHOSTNAME=evil", "byte 2 is a control character"},
           {"DomainName=\xFF", "is no UTF-8"},
           {"Frob=1", "has no property Frob\nzorvactl: zorvactl get shows those that it has"},
           {"InstanceID=x", "InstanceID is a key"},
           {"AddressOrigin=many", "a uint16 is wanted"},
           {"DomainName", "is no assignment"}}) {
    expectFailed(host_, {"modify", kSetting, word}, 2, told);
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
  expectFailed(TestHost(), {"modify", R"(ZORVA_RemoteServiceAccessPoint.Name="192.0.2.53")", "ElementName=x"}, 1,
               "CIM_ERR_NOT_SUPPORTED (7)");
}

TEST_F(Changing, ModifyShowsNoLogLineOfAProvider) {
  EXPECT_THAT(host_.run({"modify", kSetting, "DomainName=bad..name"}).err, Not(HasSubstr("MESSAGE")));
}

TEST_F(Changing, AValueThatBeginsWithAHyphenFollowsTwoOfThem) {
  done(host_, {"domain", "eth0", "--", "-x.example.org"});
  EXPECT_EQ(file(), wholeFileWith("DOMAINNAME=example.org", "DOMAINNAME=-x.example.org"));
  done(host_, {"suffixes", "set", "--", "--help", "-o"});
  EXPECT_EQ(shown(host_, {"suffixes", "show"}), "--help\n-o\n");
  expectFailed(host_, {"domain", "eth0", "-x.example.org"}, 2, "a value that begins with '-' goes after --; ");
}

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
    EXPECT_EQ(outcome.exitCode, 1) << "what was asked for was not stored";
    EXPECT_EQ(outcome.out, "ReturnValue  0\n");
    EXPECT_THAT(outcome.err, AllOf(HasSubstr("nothing was stored: SetDNS"), HasSubstr("changes nothing")));
  }
  EXPECT_EQ(done(host, {"ei", "CIM_ManagedElement", "-o", "json"}), before);
}

/// Each asks for something that is not stored.
const std::vector<Words> kUnstored{
    {"dns", "set", "eth1", "192.0.2.9"},
    {"dns", "add", "eth1", "192.0.2.9"},
    {"dns", "remove", "eth1", "192.0.2.53"},
    {"domain", "eth1", "x.example.org"},
    {"domain", "eth0", "x.example.org"},
    {"suffixes", "set", "x.example.org"},
    {"modify", R"(ZORVA_DNSSettingData.InstanceID="Computer%eth1")", "DomainName=x.example.org"},
    {"modify", kGeneral, "DNSSuffixesToAppend=x.example.org"},
    {"modify", kEndpoint, "DomainName=null"},
    {"invoke", kEndpoint, "SetDNSDomain", "DNSDomain=x.example.org"},
    {"overlay", "clear", "eth0"},
    {"ifcfg", "init", "eth0"},
    {"ifcfg", "remove", "eth1"},
    {"ifcfg", "adopt", "eth0", "eth1"},
    {"dns", "set", "eth7", "192.0.2.9"},
};

TEST(Unstored, IsAnErrorInEveryFormatAndUnderQuiet) {
  for (const Words& words : kUnstored) {
    const TestHost host;
    host.directory().write("data/ifcfg-eth0", "HOSTNAME=host1\n");
    const auto outcomeWith = [&](const Words& options) {
      Words all = options;
      all.insert(all.end(), words.begin(), words.end());
      return host.run(all);
    };
    const Outcome table = outcomeWith({});
    EXPECT_EQ(table.exitCode, 1) << joined(words, " ");
    EXPECT_THAT(table.err, StartsWith("zorvactl: ")) << joined(words, " ");
    const Outcome asJson = outcomeWith({"--output", "json"});
    EXPECT_EQ(asJson.exitCode, 1) << joined(words, " ");
    EXPECT_EQ(asJson.err, table.err);
    const Outcome quiet = outcomeWith({"--quiet"});
    EXPECT_EQ(quiet.exitCode, 1) << joined(words, " ");
    EXPECT_EQ(quiet.err, table.err);
    EXPECT_EQ(quiet.out, "");
    EXPECT_EQ(contentsOf(host.dataFile("ifcfg-eth0")), "HOSTNAME=host1\n") << joined(words, " ");
  }
}

TEST_F(Changing, QuietWritesNothingOnSuccess) {
  host_.directory().write("data/ifcfg-gone0", "");
  for (const Words& words : std::vector<Words>{{"dns", "set", "eth0", "192.0.2.9"},
                                               {"domain", "eth0", "x.example.org"},
                                               {"suffixes", "add", "x.example.org"},
                                               {"suffixes", "show"},
                                               {"modify", kSetting, "DomainName=y.example.org"},
                                               {"ifcfg", "remove", "gone0"},
                                               {"show"},
                                               {"classes"},
                                               {"graph"}}) {
    Words all = words;
    all.emplace_back("-q");
    const Outcome outcome = host_.run(all, OutputTo::ErrorTerminal);
    EXPECT_EQ(outcome.exitCode, 0) << joined(words, " ");
    EXPECT_EQ(outcome.out + outcome.err, "") << joined(words, " ");
  }
  EXPECT_THAT(file(), AllOf(HasSubstr("DNSSERVERS=192.0.2.9 \n"), HasSubstr("DOMAINNAME=y.example.org\n")));
}

TEST(Invoke, NamesTheMethodsAndParametersThereAre) {
  expectFailed(TestHost(), {"cm", kEndpoint, "Frob"}, 2, "has no method Frob\nzorvactl: it has ");
  expectFailed(TestHost(), {"cm", kEndpoint, "SetDNSDomain", "Domain=x"}, 2,
               "SetDNSDomain has no parameter Domain\nzorvactl: it has DNSDomain");
  expectFailed(TestHost(), {"cm", kEndpoint, "SetDNSDomain", "DNSDomain=a", "DNSDomain=b"}, 2, "takes one value");
}

TEST(Invoke, SaysWhatTheMethodTakesIfItRefuses) {
  expectFailed(TestHost(), {"cm", kEndpoint, "SetDNSServerSearchOrder"}, 1,
               "\nzorvactl: SetDNSServerSearchOrder takes DNSServerSearchOrder (string, repeated)");
}

TEST(Invoke, GivesJson) {
  EXPECT_EQ(contentOf(TestHost().run({"cm", kEndpoint, "SetDNSDomain", "DNSDomain=x", "-o", "json"}).out),
            json::parse(R"({"return_value": 0, "output": {}})"));
}

}  // namespace
}  // namespace zorva::cli
