#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

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

TEST_F(Changing, SuffixCommandsRefuseWhatIsNoName) {
  for (const char* command : {"set", "add"}) {
    for (const char* suffix : {"a b", "", "a..b", "under/score", "192.0.2.1%", "m\xC3\xBCller.example"}) {
      expectFailed(host_, {"suffixes", command, "good.example", suffix}, 2,
                   std::string("'") + suffix + "' is no suffix");
    }
    expectFailed(host_, {"suffixes", command, "a.example", "A.Example."}, 2, "'A.Example.' is given twice");
  }
  EXPECT_EQ(file(), kWholeFile);
}

TEST_F(Changing, SuffixCommandsChangeTheSuffixesOfTheHost) {
  done(host_, {"suffixes", "set", "a.example", "b.example"});
  EXPECT_EQ(file(), wholeFileWith("DNSSUFFIXES=example.org example.net ", "DNSSUFFIXES=a.example b.example "));
  done(host_, {"suffixes", "add", "c.example"});
  done(host_, {"suffixes", "remove", "a.example"});
  const Outcome now = host_.run({"suffixes", "show"});
  EXPECT_EQ(now.out, "b.example\nc.example\n");
  EXPECT_EQ(
      now.err,
      "zorvactl: note: the suffixes are kept in ifcfg-eth0: the settings of the host are in the file of the first "
      "interface\n");
  EXPECT_EQ(done(host_, {"suffixes", "set"}),
            "ZORVA_DNSGeneralSettingData.InstanceID=\"dnsgen1:host1\"\n  DNSSuffixesToAppend\n"
            "The suffixes are kept in ifcfg-eth0: the settings of the host are in the file of the first interface.\n");
}

TEST(Suffixes, SayWhichFileWouldHoldThem) {
  EXPECT_THAT(TestHost().run({"suffixes", "show"}).err,
              HasSubstr("the suffixes are from the host; ifcfg-eth0, which does not exist, would replace them: "));
}

TEST(Suffixes, SayThatAHostWithoutInterfacesHasNone) {
  expectFailed(TestHost(Words{}), {"suffixes", "show"}, 1, "no general DNS settings");
}

}  // namespace
}  // namespace zorva::cli
