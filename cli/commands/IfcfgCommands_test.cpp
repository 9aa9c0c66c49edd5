#include <filesystem>

#include "cli/testing/Running.h"

namespace zorva::cli {
namespace {

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

TEST_F(Changing, IfcfgInitReplacesAFileOnlyOnRequest) {
  host_.directory().write("data/ifcfg-eth0", "HOSTNAME=mine\n");
  expectFailed(host_, {"ifcfg", "init", "eth0"}, 1, "exists already\nzorvactl: --force puts a new file in its place");
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
  expectFailed(host, {"ifcfg", "init", "eth0"}, 1,
               "there is no such data directory\nzorvactl: make the data directory");
}

TEST(IfcfgInit, NamesTheInterfacesThereAre) {
  expectFailed(TestHost(), {"ifcfg", "init", "eth7"}, 1, "no interface eth7\nzorvactl: it has eth0, eth1");
}

TEST(IfcfgInit, RefusesNamesThatLeadOutOfTheDirectory) {
  const TestHost host({TestHost::port("p", R"("name": "../../x")")});
  expectFailed(TestHost(), {"ifcfg", "init", "../x"}, 2, "cannot be the name of an interface");
}

TEST(IfcfgInit, WritesWholeOrNotAtAll) {
  const TestHost host({TestHost::port("eth0", R"("domain_name": "a\nHOSTNAME=evil")")});
  expectFailed(host, {"ifcfg", "init", "eth0"}, 1, "DOMAINNAME would hold control characters: 'a\\nHOSTNAME=evil'");
  EXPECT_FALSE(std::filesystem::exists(host.dataFile("ifcfg-eth0")));
}

TEST(IfcfgShow, MarksTheLinesThatAreMissing) {
  const TestHost host;
  host.directory().write("data/ifcfg-eth0", "HOSTNAME=x\nMTU=1500\n");
  EXPECT_THAT(done(host, {"ifcfg", "show", "eth0"}),
              AllOf(HasSubstr("  HOSTNAME     x\n  MTU          1500\n"), HasSubstr("  DNSSERVERS   (no such line")));
  EXPECT_EQ(json::parse(done(host, {"ifcfg", "show", "eth0", "-o", "json"}))["lines"].size(), 2U);
  expectFailed(host, {"ifcfg", "show", "eth1"}, 1, "No such file or directory\nzorvactl: zorvactl ifcfg init makes it");
}

TEST_F(Changing, IfcfgInitReportsIfItMayNotWrite) {
  const Outcome outcome = host_.runUnprivileged({"ifcfg", "init", "eth1"});
  if (outcome.exitCode == 127) GTEST_SKIP() << "another user cannot run what was built here";
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("nothing was changed: " + host_.dataFile("settings.lock") +
                                     ": cannot be opened: Permission denied"));
}

}  // namespace
}  // namespace zorva::cli
