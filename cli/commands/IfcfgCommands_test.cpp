#include <chrono>
#include <filesystem>
#include <memory>
#include <thread>

#include "agent/SettingsLock.h"
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
  expectFailed(TestHost(), {"ifcfg", "init", "eth7"}, 1, "no interface eth7\nzorvactl: did you mean eth0?");
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
  EXPECT_EQ(contentOf(done(host, {"ifcfg", "show", "eth0", "-o", "json"}))["lines"].size(), 2U);
  expectFailed(host, {"ifcfg", "show", "eth1"}, 1, "No such file or directory\nzorvactl: zorvactl ifcfg init makes it");
}

TEST(IfcfgList, MarksTheFilesWhoseInterfacesAreGone) {
  const TestHost host;
  expectFailed(host, {"ifcfg", "list"}, 0, "note: there is no file of settings in ");
  host.directory().write("data/ifcfg-eth0", kWholeFile);
  host.directory().write("data/ifcfg-gone0", "HOSTNAME=x\nMTU=1500\nHOSTNAME=y\n");
  std::filesystem::create_directory(host.dataFile("ifcfg-odd"));
  EXPECT_THAT(done(host, {"ifcfg", "list"}),
              AllOf(HasSubstr("FILE         INTERFACE        KEYS\nifcfg-eth0   eth0             BOOTPROTO HOSTNAME "),
                    HasSubstr("\nifcfg-gone0  gone: an orphan  HOSTNAME MTU\n"), HasSubstr("is no regular file")));
  const json rows = contentOf(done(host, {"ifcfg", "list", "-o", "json"}));
  EXPECT_EQ(rows[1]["interface"], "gone0");
  EXPECT_EQ(rows[1]["exists"], false);
  EXPECT_EQ(rows[1]["keys"], json::parse(R"(["HOSTNAME", "MTU"])"));
}

TEST_F(Changing, IfcfgRemoveBringsBackWhatTheHostSays) {
  EXPECT_THAT(done(host_, {"ifcfg", "remove", "eth0", "--dry-run"}), StartsWith("would remove "));
  done(host_, {"dns", "set", "eth0", "192.0.2.9"});
  EXPECT_THAT(done(host_, {"ifcfg", "remove", "eth0"}), AllOf(StartsWith("removed "), HasSubstr("192.0.2.9")));
  EXPECT_FALSE(std::filesystem::exists(host_.dataFile("ifcfg-eth0")));
  EXPECT_EQ(done(host_, {"dns", "show", "eth0"}), "192.0.2.53\n2001:db8::53\n");
  expectRefused(host_, {"ifcfg", "remove", "eth0"}, 1, "No such file or directory");
  expectRefused(host_, {"ifcfg", "remove", "../x"}, 2, "cannot be the name of an interface");
}

TEST(IfcfgAdopt, GivesTheFileOfAnInterfaceThatIsGoneToAnother) {
  const TestHost host;
  host.directory().write("data/ifcfg-gone0", kWholeFile);
  expectRefused(host, {"ifcfg", "adopt", "gone0", "eth7"}, 1, "no interface eth7");
  expectRefused(host, {"ifcfg", "adopt", "gone1", "eth1"}, 1, "ifcfg-gone1: No such file");
  EXPECT_THAT(done(host, {"ifcfg", "adopt", "gone0", "eth1", "--dry-run"}), StartsWith("would make "));
  EXPECT_EQ(contentsOf(host.dataFile("ifcfg-gone0")), kWholeFile);
  EXPECT_THAT(done(host, {"ifcfg", "adopt", "gone0", "eth1"}), StartsWith("made "));
  EXPECT_EQ(contentsOf(host.dataFile("ifcfg-eth1")), kWholeFile);
  EXPECT_FALSE(std::filesystem::exists(host.dataFile("ifcfg-gone0")));
  EXPECT_EQ(host.run({"show"}).err, "");
}

TEST_F(Changing, IfcfgAdoptReplacesNoFileAndTakesNoneThatIsInUse) {
  host_.directory().write("data/ifcfg-gone0", "HOSTNAME=gone\n");
  expectRefused(host_, {"ifcfg", "adopt", "gone0", "eth0"}, 1, "ifcfg-eth0: exists already, and is left as it is");
  expectRefused(host_, {"ifcfg", "adopt", "eth0", "eth1"}, 1, "this host has an interface eth0");
  EXPECT_EQ(file(), kWholeFile);
  EXPECT_EQ(contentsOf(host_.dataFile("ifcfg-gone0")), "HOSTNAME=gone\n");
}

TEST_F(Changing, IfcfgAdoptAndRemoveWaitForTheLock) {
  host_.directory().write("data/ifcfg-gone0", "HOSTNAME=gone\n");
  auto lock = std::make_unique<zorva::agent::SettingsLock>(host_.dataFile(""), zorva::agent::Access::Change);
  const pid_t child = zorva::agent::testing::startChild([this] {
    return host_.run({"ifcfg", "adopt", "gone0", "eth1"}).exitCode == 0 &&
           host_.run({"ifcfg", "remove", "eth0"}).exitCode == 0;
  });
  std::this_thread::sleep_for(std::chrono::milliseconds(300));
  EXPECT_TRUE(std::filesystem::exists(host_.dataFile("ifcfg-gone0")));
  EXPECT_TRUE(std::filesystem::exists(host_.dataFile("ifcfg-eth0")));
  lock.reset();
  EXPECT_TRUE(zorva::agent::testing::succeeded(child));
  EXPECT_TRUE(std::filesystem::exists(host_.dataFile("ifcfg-eth1")));
}

TEST_F(Changing, ASettingOfAnInterfaceThatIsGoneIsWarnedOf) {
  host_.directory().write("data/ifcfg-gone0", "DNSSUFFIXES=lost.example \n");
  for (const Words& words : std::vector<Words>{{"suffixes", "show"}, {"dns", "show", "eth0"}, {"dns", "set", "eth0"}}) {
    EXPECT_THAT(host_.run(words).err,
                HasSubstr("warning: nothing reads ifcfg-gone0: this host has no such interface; "))
        << words.front();
  }
  expectFailed(host_, {"dns", "show", "gone0"}, 1, "warning: nothing reads ifcfg-gone0");
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
