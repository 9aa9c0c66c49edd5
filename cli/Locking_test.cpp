// Programs that read and change the settings of one host at the same time, and those that are killed in the middle.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <nlohmann/json.hpp>

#include "agent/SettingsLock.h"
#include "cli/testing/TestHost.h"
#include "cli/testing/TestServer.h"

namespace zorva::cli {
namespace {

using nlohmann::json;
using testing::AllOf;
using testing::HasSubstr;
using zorva::agent::testing::contentsOf;
using zorva::agent::testing::startChild;
using zorva::agent::testing::succeeded;

using Words = std::vector<std::string>;

constexpr const char* kSetting = R"(ZORVA_DNSSettingData.InstanceID="Computer%eth0")";
constexpr const char* kFile =
    "BOOTPROTO=none\nHOSTNAME=host1\nDOMAINNAME=example.org\nCONFIG_NAME=office\nDNSSERVERS=192.0.2.53 \n"
    "DNSSUFFIXES=example.org \n";

/// How many changes each of the four programs makes.
int changesOfEach() {
  const char* all = std::getenv("ZORVA_CHANGES");
  return all == nullptr ? 25 : std::atoi(all) / 4;
}

class Locking : public testing::Test {
 protected:
  Locking() { host_.directory().write("data/ifcfg-eth0", kFile); }

  std::string file() const { return contentsOf(host_.dataFile("ifcfg-eth0")); }

  /// Runs it; false, with its output, if it failed or warned.
  bool runs(const Words& words) const {
    const Outcome outcome = host_.run(words);
    if (outcome.exitCode == 0 && outcome.err.empty()) return true;
    std::fprintf(stderr, "%s: %s\n", words.front().c_str(), outcome.err.c_str());
    return false;
  }

  /// Whether the interface's settings are all there.
  bool readsWhole(Words words) const {
    words.insert(words.end(), {"gi", kSetting, "-o", "json"});
    const Outcome outcome = host_.run(words);
    const json instance = json::parse(outcome.out, nullptr, false);
    const auto has = [&](const char* property) {
      return instance.contains("properties") && instance["properties"].contains(property) &&
             !instance["properties"][property].empty() && instance["properties"][property] != "";
    };
    const bool isWhole =
        has("RequestedHostname") && has("DomainName") && has("DNSServerAddresses") && has("ConfigurationName");
    if (!isWhole) std::fprintf(stderr, "not whole: %s%s\n", outcome.out.c_str(), outcome.err.c_str());
    return isWhole;
  }

  TestHost host_;
};

TEST_F(Locking, ChangesOfFourProgramsAllArriveAndEveryReadIsWhole) {
  const TestServer server(host_);
  const std::string url = server.url();
  const int count = changesOfEach();
  const auto repeat = [&](const std::function<Words(const std::string&)>& words) {
    return startChild([&] {
      bool good = true;
      for (int i = 1; i <= count; ++i) good = runs(words(std::to_string(i))) && good;
      return good;
    });
  };
  const pid_t writers[] = {
      repeat([](const std::string& i) {
        return Words{"modify", kSetting, "DomainName=d" + i + ".example"};
      }),
      repeat([](const std::string& i) {
        return Words{"dns", "set", "eth0", "2001:db8::" + i};
      }),
      repeat([&](const std::string& i) {
        return Words{"--url", url, "modify", kSetting, "ConfigurationName=c" + i, "--only"};
      }),
      repeat([&](const std::string& i) {
        return Words{"--url", url, "modify", "ZORVA_DNSGeneralSettingData", "DNSSuffixesToAppend=s" + i + ".example",
                     "--only"};
      })};
  const pid_t reader = startChild([&] {
    bool good = true;
    for (int i = 0; i < count; ++i) good = readsWhole({}) && readsWhole({"--url", url}) && good;
    return good;
  });
  for (const pid_t writer : writers) EXPECT_TRUE(succeeded(writer));
  EXPECT_TRUE(succeeded(reader));
  const std::string last = std::to_string(count);
  EXPECT_EQ(file(), "BOOTPROTO=none\nHOSTNAME=host1\nDOMAINNAME=d" + last + ".example\nCONFIG_NAME=c" + last +
                        "\nDNSSERVERS=2001:db8::" + last + " \nDNSSUFFIXES=s" + last + ".example \n");
}

TEST_F(Locking, WhatSeveralProgramsAddToAListIsAllThere) {
  std::vector<pid_t> children;
  for (int i = 1; i <= 8; ++i) {
    children.push_back(startChild([&] { return runs({"dns", "add", "eth0", "192.0.2." + std::to_string(i)}); }));
  }
  for (const pid_t child : children) EXPECT_TRUE(succeeded(child));
  const std::string servers = host_.run({"dns", "show", "eth0"}).out;
  for (int i = 1; i <= 8; ++i) EXPECT_THAT(servers, HasSubstr("192.0.2." + std::to_string(i) + "\n"));
}

/// A change after which the file would be longer than allowed.
const Words kTooLong{"modify", kSetting, "ConfigurationName=" + std::string(10000, 'x'), "DomainName=new.example"};
constexpr std::size_t kMostBytes = 5000;

TEST_F(Locking, AChangeThatADiskTakesOnlyInPartIsTakenBack) {
  const Outcome outcome = host_.runLimited(kMostBytes, TestHost::AtLimit::WriteFails, kTooLong);
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, AllOf(HasSubstr("CIM_ERR_FAILED (1)"), HasSubstr("ifcfg-eth0: could not be written whole"),
                                 HasSubstr("is the disk full?")));
  EXPECT_EQ(file(), kFile);
}

TEST_F(Locking, AFullDiskOnWhichNothingCanBeKeptAsideChangesNothing) {
  const Outcome outcome = host_.runLimited(10, TestHost::AtLimit::WriteFails, {"domain", "eth0", "x.example"});
  EXPECT_EQ(outcome.exitCode, 1);
  EXPECT_THAT(outcome.err, HasSubstr("settings.before.new: cannot be written: File too large"));
  EXPECT_EQ(file(), kFile);
}

class Killed : public Locking {
 protected:
  Killed() {
    const Outcome outcome = host_.runLimited(kMostBytes, TestHost::AtLimit::IsKilled, kTooLong);
    EXPECT_EQ(outcome.exitCode, 128 + SIGXFSZ);
    EXPECT_EQ(file().find("DNSSUFFIXES"), std::string::npos) << "it was to be killed in the middle of the file";
  }
};

TEST_F(Killed, TheNextCommandPutsTheFileBack) {
  const Outcome outcome = host_.run({"gi", kSetting, "--property", "DomainName"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_THAT(outcome.out, HasSubstr("example.org"));
  EXPECT_THAT(outcome.err, HasSubstr("ifcfg-eth0: a change broke off in the middle; the file is as it was before"));
  EXPECT_EQ(file(), kFile);
}

TEST_F(Killed, TheServerPutsTheFileBackWhenItStarts) {
  const TestServer server(host_);
  ASSERT_NE(server.url(), "");
  EXPECT_EQ(file(), kFile);
}

TEST_F(Killed, WhoMayNotWriteReadsWhatThereIs) {
  const Outcome outcome = host_.runUnprivileged({"gi", kSetting});
  if (outcome.exitCode == 127) GTEST_SKIP() << "another user cannot run what was built here";
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
}

TEST_F(Locking, WhoMayNotWriteReadsWhileOthersChange) {
  const zorva::agent::SettingsLock change(host_.dataFile(""), zorva::agent::Access::Change);
  const Outcome outcome = host_.runUnprivileged({"gi", kSetting});
  if (outcome.exitCode == 127) GTEST_SKIP() << "another user cannot run what was built here";
  EXPECT_EQ(outcome.exitCode, 0) << outcome.err;
  EXPECT_EQ(outcome.err, "");
}

TEST_F(Locking, WhatRootWritesBelongsToTheOwnerOfTheDataDirectory) {
  if (::geteuid() != 0) GTEST_SKIP() << "only root gives files away";
  constexpr uid_t kOwner = 65534;
  ASSERT_EQ(::chown(host_.dataFile("").c_str(), kOwner, kOwner), 0);
  EXPECT_TRUE(runs({"ifcfg", "init", "eth1"}));
  EXPECT_TRUE(runs({"dns", "set", "eth0", "192.0.2.54"}));
  EXPECT_TRUE(runs({"modify", R"(ZORVA_DNSProtocolEndPoint.Name="eth0")", "DomainName=lab.example.org"}));
  for (const char* name : {"ifcfg-eth1", "settings.lock", "settings.turn", "overlay.json", "overlay.lock"}) {
    struct stat status {};
    ASSERT_EQ(::stat(host_.dataFile(name).c_str(), &status), 0) << name;
    EXPECT_EQ(status.st_uid, kOwner) << name;
    EXPECT_EQ(status.st_gid, kOwner) << name;
  }
}

TEST_F(Locking, WhatReadsNoFileDoesNotWait) {
  const zorva::agent::SettingsLock change(host_.dataFile(""), zorva::agent::Access::Change);
  EXPECT_TRUE(runs({"ei", "ZORVA_DNSProtocolEndPoint"}));
}

}  // namespace
}  // namespace zorva::cli
