#include "agent/config/Config.h"

#include <gtest/gtest.h>
#include <stdlib.h>

#include <string>
#include <utility>
#include <vector>

#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent {
namespace {

using Cases = std::vector<std::pair<std::string, std::string>>;

using testing::TemporaryDirectory;

class ConfigTest : public ::testing::Test {
 protected:
  Config read(const std::string& text) { return readConfig(directory_.write("agent.toml", text)); }

  // The error of a configuration, without the directory.
  std::string wrong(const std::string& text) {
    try {
      read(text);
    } catch (const ConfigError& error) {
      const std::string line = error.what();
      EXPECT_EQ(line.find('\n'), std::string::npos) << "an error is one line";
      EXPECT_TRUE(line.starts_with(directory_.path())) << line;
      return line.substr(directory_.path().size());
    }
    return "nothing";
  }

  TemporaryDirectory directory_;
};

TEST_F(ConfigTest, EveryKeyIsOptional) {
  const Config config = read("");
  EXPECT_EQ(config.dataDir, "/var/lib/zorvagent/");
  EXPECT_EQ(config.systemName, "");
  EXPECT_EQ(config.language, "en");
  EXPECT_EQ(config.source, "host");
  EXPECT_EQ(config.treeFile, "");
  EXPECT_FALSE(config.includeLoopback);
  EXPECT_EQ(config.logLevel, 6000);
  EXPECT_EQ(config.logTarget, "stderr");
  EXPECT_EQ(config.traceLevel, 6000);
  EXPECT_EQ(config.traceTarget, "off");
}

TEST_F(ConfigTest, EveryKeyIsRead) {
  const Config config = read(R"(
[agent]
data_dir = "/srv/agent"   # a slash is added
system_name = "node7"
language = "de"
[tree]
source = "file"
file = "/srv/tree.json"
include_loopback = true
apply = "overlay"
[log]
level = 3000
target = "syslog"
trace_level = -4
trace_target = "/var/log/agent.trace"
)");
  EXPECT_EQ(config.dataDir, "/srv/agent/");
  EXPECT_EQ(config.systemName, "node7");
  EXPECT_EQ(config.language, "de");
  EXPECT_EQ(config.source, "file");
  EXPECT_EQ(config.treeFile, "/srv/tree.json");
  EXPECT_TRUE(config.includeLoopback);
  EXPECT_EQ(config.logLevel, 3000);
  EXPECT_EQ(config.logTarget, "syslog");
  EXPECT_EQ(config.traceLevel, -4);
  EXPECT_EQ(config.traceTarget, "/var/log/agent.trace");
}

TEST_F(ConfigTest, TheDefaultsThatAreDeclaredAreTheDefaults) {
  std::string text;
  for (const util::TomlSection& section : configKeys()) {
    text.append("[").append(section.name).append("]\n");
    for (const util::TomlKey& key : section.keys) text.append(key.name).append(" = ").append(key.standard).append("\n");
  }
  EXPECT_EQ(read(text), read(""));
}

TEST_F(ConfigTest, EachKeyThatIsDeclaredIsReadAndMatters) {
  for (const util::TomlSection& section : configKeys()) {
    for (const util::TomlKey& key : section.keys) {
      std::string text("[" + std::string(section.name) + "]\n" + std::string(key.name) + " = ");
      text.append(key.example).append("\n");
      if (key.name == "source") text += "file = \"tree.json\"\n";
      if (key.name == "url" || key.name == "password_file") text += "user = \"operator\"\n";
      if (key.name == "url" || key.name == "user") text += "password_file = \"bmc.password\"\n";
      EXPECT_NE(read(text), read("")) << text;
    }
  }
}

TEST_F(ConfigTest, PathsAreTakenFromTheDirectoryOfTheFile) {
  const Config config = read("agent.data_dir = \"data/\"\ntree.file = \"tree.json\"\nlog.target = \"log\"\n");
  EXPECT_EQ(config.dataDir, directory_ / "data/");
  EXPECT_EQ(config.treeFile, directory_ / "tree.json");
  EXPECT_EQ(config.logTarget, directory_ / "log");
}

TEST_F(ConfigTest, AnUnknownTableOrKeyIsNamedWithItsLine) {
  const Cases cases = {
      {"[agent]\n\ndata_dri = 1\n", "agent.toml:3: agent.data_dri: is not a known key; did you mean data_dir?"},
      {"[agnet]\n", "agent.toml:1: agnet: is not a known table or key; did you mean agent?"},
      {"level = 1\n", "agent.toml:1: level: is not a known table or key"},
      {"[log]\n\"a\\nb\" = 1\n", "agent.toml:2: log.a\\nb: is not a known key"},
  };
  for (const auto& [text, error] : cases) EXPECT_EQ(wrong(text), error) << text;
}

TEST_F(ConfigTest, AWrongTypeIsNamedWithItsLine) {
  const Cases cases = {
      {"[agent]\ndata_dir = 7\n", "agent.toml:2: agent.data_dir: expected a text in quotes"},
      {"[log]\nlevel = \"6000\"\n", "agent.toml:2: log.level: expected a whole number"},
      {"[log]\nlevel = 1.5\n", "agent.toml:2: log.level: expected a whole number"},
      {"[log]\ntrace_level = 99999999999\n", "agent.toml:2: log.trace_level: is out of range"},
      {"[tree]\ninclude_loopback = 1\n", "agent.toml:2: tree.include_loopback: expected true or false"},
      {"agent = 1\n", "agent.toml:1: agent: expected a table"},
  };
  for (const auto& [text, error] : cases) EXPECT_EQ(wrong(text), error) << text;
}

TEST_F(ConfigTest, AWrongValueIsNamedWithItsLine) {
  const Cases cases = {
      {"[tree]\nsource = \"hots\"\n", "agent.toml:2: tree.source: must be \"host\" or \"file\""},
      {"[tree]\nsource = \"file\"\n", "agent.toml:2: tree.source: \"file\" needs tree.file as well"},
      {"[tree]\napply = \"both\"\n", "agent.toml:2: tree.apply: must be \"overlay\" or \"host\""},
      {"[agent]\ndata_dir = \"\"\n", "agent.toml:2: agent.data_dir: must not be empty"},
      {"[agent]\ndata_dir = \"a\\u0000b\"\n", "agent.toml:2: agent.data_dir: must not hold a NUL"},
      {"[agent]\nsystem_name = \"a\\nb\"\n", "agent.toml:2: agent.system_name: must not hold control characters"},
      {"[agent]\nlanguage = \"\"\n", "agent.toml:2: agent.language: expected a language such as \"en\""},
      {"[log]\ntarget = \"\"\n", "agent.toml:2: log.target: expected \"stderr\", \"syslog\", \"off\" or a path"},
  };
  for (const auto& [text, error] : cases) EXPECT_EQ(wrong(text), error) << text;
}

TEST_F(ConfigTest, SettingsAreAppliedToTheHostOnlyWhereThatIsAskedFor) {
  EXPECT_FALSE(read("").appliesToHost);
  EXPECT_FALSE(read("[tree]\napply = \"overlay\"\n").appliesToHost);
  EXPECT_TRUE(read("[tree]\napply = \"host\"\n").appliesToHost);
  EXPECT_EQ(wrong("[tree]\nsource = \"file\"\nfile = \"tree.json\"\napply = \"host\"\n"),
            "agent.toml:4: tree.apply: \"host\" needs source = \"host\" as well");
}

TEST_F(ConfigTest, TheServiceProcessorIsReadAndItsLoginIsChecked) {
  EXPECT_EQ(read("").bmc.file, "/run/zorvagent/bmc.json");
  EXPECT_EQ(read("").bmc.interval, 60);
  EXPECT_EQ(read("[tree]\nsource = \"file\"\nfile = \"tree.json\"\n").bmc.file, "") << "such a tree is whole";
  const BmcConfig bmc =
      read(
          "[bmc]\nurl = \"https://192.0.2.20:8443/\"\nuser = \"operator\"\npassword_file = \"secret\"\n"
          "fingerprint = \"AB:" +
          std::string(62, '0') + "\"\ninterval = 30\nfile = \"run/bmc.json\"\n")
          .bmc;
  EXPECT_EQ(bmc.url, "https://192.0.2.20:8443");
  EXPECT_EQ(bmc.passwordFile, directory_ / "secret");
  EXPECT_EQ(bmc.fingerprint, "ab" + std::string(62, '0'));
  EXPECT_EQ(bmc.interval, 30);
  EXPECT_EQ(bmc.file, directory_ / "run/bmc.json");
  const std::string login = "user = \"a\"\npassword_file = \"b\"\n";
  const Cases cases = {
      {"[bmc]\nurl = \"http://192.0.2.20\"\n", "agent.toml:2: bmc.url: expected https://HOST or https://HOST:PORT"},
      {"[bmc]\nurl = \"https://\"\n", "agent.toml:2: bmc.url: expected https://HOST or https://HOST:PORT"},
      {"[bmc]\nurl = \"https://a:b@192.0.2.20\"\n",
       "agent.toml:2: bmc.url: must not hold a login; user and password_file do"},
      {"[bmc]\nurl = \"https://192.0.2.20/redfish\"\n", "agent.toml:2: bmc.url: must not hold a path"},
      {"[bmc]\nurl = \"https://192.0.2.20\"\n", "agent.toml:2: bmc.url: needs user and password_file as well"},
      {"[bmc]\nuser = \"a\"\n", "agent.toml:2: bmc.user: and password_file need each other"},
      {"[bmc]\n" + login + "fingerprint = \"12\"\n",
       "agent.toml:4: bmc.fingerprint: expected the SHA-256 of a certificate: 64 hexadecimal digits"},
      {"[bmc]\n" + login + "fingerprint = \"" + std::string(64, '1') + "\"\nca_file = \"c\"\n",
       "agent.toml:4: bmc.fingerprint: and ca_file exclude each other"},
      {"[bmc]\ninterval = 1\n", "agent.toml:2: bmc.interval: must be from 5 to 86400"},
  };
  for (const auto& [text, error] : cases) EXPECT_EQ(wrong(text), error) << text;
}

TEST_F(ConfigTest, WhatIsNoTomlIsNamedWithItsLine) {
  EXPECT_TRUE(wrong("[agent]\ndata_dir = \n").starts_with("agent.toml:2: ")) << wrong("[agent]\ndata_dir = \n");
  EXPECT_TRUE(wrong("[agent]\n[agent]\n").starts_with("agent.toml:2: "));
  EXPECT_TRUE(wrong("a = \"\xFF\"\n").starts_with("agent.toml:1: "));
  EXPECT_TRUE(wrong(std::string("\0\0\0", 3)).starts_with("agent.toml:1: "));
}

TEST_F(ConfigTest, DeepNestingIsRefused) {
  const std::string deep = "a = " + std::string(100000, '[') + std::string(100000, ']') + "\n";
  EXPECT_TRUE(wrong(deep).starts_with("agent.toml:1: ")) << wrong(deep);
}

TEST_F(ConfigTest, AFileThatIsTooLargeIsRefused) {
  EXPECT_EQ(wrong(std::string(300000, '\n')), "agent.toml: is larger than 256 KiB");
}

TEST_F(ConfigTest, AFileThatCannotBeReadIsNamed) {
  EXPECT_THROW(readConfig(directory_ / "absent.toml"), ConfigError);
  try {
    readConfig("/dev/zero");
    FAIL() << "a device is no configuration";
  } catch (const ConfigError& error) {
    EXPECT_STREQ(error.what(), "/dev/zero: cannot be read: not a regular file");
    EXPECT_EQ(error.file(), "/dev/zero");
    EXPECT_EQ(error.line(), 0);
    EXPECT_EQ(error.key(), "");
  }
}

TEST_F(ConfigTest, TheEnvironmentNamesTheFile) {
  ::setenv("ZORVAGENT_CONFIG", directory_.write("mine.toml", "agent.system_name = \"mine\"\n").c_str(), 1);
  EXPECT_EQ(readDefaultConfig().systemName, "mine");
  ::setenv("ZORVAGENT_CONFIG", (directory_ / "absent.toml").c_str(), 1);
  EXPECT_THROW(readDefaultConfig(), ConfigError) << "a file that is named must be there";
  ::unsetenv("ZORVAGENT_CONFIG");
}

}  // namespace
}  // namespace zorva::agent
