#include "cli/session/SettingFile.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <filesystem>

#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/testing/TemporaryDirectory.h"
#include "cli/output/Failure.h"

namespace zorva::cli {
namespace {

using testing::HasSubstr;
using zorva::agent::testing::contentsOf;
using zorva::agent::testing::TemporaryDirectory;

class SettingFileTest : public testing::Test {
 protected:
  SettingFileTest() {
    zorva::agent::Config config;
    config.dataDir = directory_.path();
    zorva::agent::setConfig(config);
  }
  ~SettingFileTest() override { zorva::agent::reset(); }

  template <typename Work>
  static std::string failureOf(Work work) {
    try {
      work();
      return {};
    } catch (const Failure& failure) {
      return failure.what();
    }
  }

  TemporaryDirectory directory_;
};

TEST_F(SettingFileTest, WritesEachLineOnce) {
  const SettingFile file("eth0");
  file.write({{"HOSTNAME", "h"}, {"DNSSERVERS", "192.0.2.1 192.0.2.2 "}}, false);
  EXPECT_EQ(contentsOf(directory_ / "ifcfg-eth0"), "HOSTNAME=h\nDNSSERVERS=192.0.2.1 192.0.2.2 \n");
}

TEST_F(SettingFileTest, CanBeReadByWhoMayEnterItsDirectory) {
  for (const auto& [ofDirectory, ofFile] : {std::pair{0755U, 0644U}, {0750U, 0640U}, {0700U, 0600U}}) {
    ASSERT_EQ(::chmod(directory_.path().c_str(), ofDirectory), 0);
    SettingFile("eth0").write({{"A", "1"}}, true);
    struct stat status {};
    ASSERT_EQ(::stat((directory_ / "ifcfg-eth0").c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777U, ofFile);
  }
}

TEST_F(SettingFileTest, LeavesAnExistingFileUnlessToldOtherwise) {
  directory_.write("ifcfg-eth0", "old");
  EXPECT_THAT(failureOf([] { SettingFile("eth0").write({{"A", "1"}}, false); }), HasSubstr("exists already"));
  EXPECT_EQ(contentsOf(directory_ / "ifcfg-eth0"), "old");
  SettingFile("eth0").write({{"A", "1"}}, true);
  EXPECT_EQ(contentsOf(directory_ / "ifcfg-eth0"), "A=1\n");
}

TEST_F(SettingFileTest, LeavesNoOtherFile) {
  directory_.write("ifcfg-eth0", "old");
  failureOf([] { SettingFile("eth0").write({{"A", "1"}}, false); });
  SettingFile("eth0").write({{"A", "1"}}, true);
  failureOf([] { SettingFile("eth1").write({{"A", "1\n2"}}, false); });
  std::size_t files = 0;
  for ([[maybe_unused]] const auto& entry : std::filesystem::directory_iterator(directory_.path())) ++files;
  EXPECT_EQ(files, 1U);
}

TEST_F(SettingFileTest, RefusesAValueThatWouldBeAnotherLine) {
  EXPECT_THAT(failureOf([] {
                SettingFile("eth0").write({{"A", "1\nB=2"}}, true);
              }),
              HasSubstr("A would hold control characters: '1\\nB=2'"));
  EXPECT_FALSE(std::filesystem::exists(directory_ / "ifcfg-eth0"));
}

TEST_F(SettingFileTest, ReplacesNothingThatIsNoRegularFile) {
  std::filesystem::create_directory(directory_ / "ifcfg-eth0");
  directory_.link("/nowhere", "ifcfg-eth1");
  for (const char* name : {"eth0", "eth1"}) {
    EXPECT_THAT(failureOf([name] { SettingFile(name).write({{"A", "1"}}, true); }), HasSubstr("is no regular file"));
  }
  EXPECT_TRUE(std::filesystem::is_symlink(directory_ / "ifcfg-eth1"));
}

TEST_F(SettingFileTest, NamesADataDirectoryThatIsNotThere) {
  zorva::agent::Config config;
  config.dataDir = directory_ / "missing/";
  zorva::agent::setConfig(config);
  EXPECT_THAT(failureOf([] {
                SettingFile("eth0").write({{"A", "1"}}, false);
              }),
              HasSubstr("missing/ifcfg-eth0: cannot be written: No such file or directory"));
}

TEST_F(SettingFileTest, ReadsLinesAsTheProvidersDo) {
  directory_.write("ifcfg-eth0", "# C=1\nA=x=y\r\n\nno assignment\nB=\nLAST=z");
  const std::vector<SettingLine> lines = SettingFile("eth0").read();
  ASSERT_EQ(lines.size(), 3U);
  EXPECT_EQ(lines[0].key, "A");
  EXPECT_EQ(lines[0].value, "x=y");
  EXPECT_EQ(lines[1].value, "");
  EXPECT_EQ(lines[2].value, "z");
}

TEST_F(SettingFileTest, NeverWaitsForAPipe) {
  ASSERT_EQ(::mkfifo((directory_ / "ifcfg-eth0").c_str(), 0600), 0);
  EXPECT_THAT(failureOf([] { SettingFile("eth0").read(); }), HasSubstr("is no regular file"));
}

TEST_F(SettingFileTest, ReadsNoFileWithoutEnd) {
  directory_.link("/dev/zero", "ifcfg-eth0");
  EXPECT_THAT(failureOf([] { SettingFile("eth0").read(); }), HasSubstr("is no regular file"));
  directory_.write("ifcfg-eth1", "");
  std::filesystem::resize_file(directory_ / "ifcfg-eth1", std::uintmax_t{1} << 40U);
  EXPECT_THAT(failureOf([] { SettingFile("eth1").read(); }), HasSubstr("is larger than 16 MiB"));
}

TEST_F(SettingFileTest, RefusesNamesThatLeadElsewhere) {
  for (const std::string& name : {std::string(), std::string("../x"), std::string("a\0b", 3)}) {
    EXPECT_THROW(SettingFile{name}, Failure);
  }
}

TEST(SettingsOfHost, SayWhatTheInterfaceSays) {
  zorva::agent::TreeBuilder builder("h");
  const std::size_t system = builder.add(0, zorva::agent::NodeType::System, "s", "Computer");
  const std::size_t port = builder.add(system, zorva::agent::NodeType::Port, "eth0");
  const std::size_t node = builder.add(port, zorva::agent::NodeType::NetworkIPConfig, "ip");
  builder.set(node, ZV::NodeLexicon::PROP_NAME, "eth0");
  builder.set(node, ZV::NodeLexicon::PROP_HOST_NAME, "h");
  builder.set(node, ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES,
              std::make_shared<const zorva::agent::StringList>(zorva::agent::StringList{"192.0.2.1", "192.0.2.2"}));
  builder.set(node, zorva::agent::kAddresses,
              std::make_shared<const zorva::agent::AddressList>(
                  zorva::agent::AddressList{{"192.0.2.9", 24, zorva::agent::AddressOrigin::Dhcp}}));
  const auto tree = builder.finish();
  std::string text;
  for (const SettingLine& line : settingsOfHost(interfaceNode(*tree, "eth0")))
    text += line.key + "=" + line.value + "|";
  EXPECT_EQ(text, "BOOTPROTO=dhcp|HOSTNAME=h|DOMAINNAME=|CONFIG_NAME=|DNSSERVERS=192.0.2.1 192.0.2.2 |DNSSUFFIXES=|");
  EXPECT_THROW(interfaceNode(*tree, "eth1"), Failure);
}

}  // namespace
}  // namespace zorva::cli
