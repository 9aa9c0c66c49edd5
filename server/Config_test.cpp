#include "server/Config.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "agent/testing/TemporaryDirectory.h"
#include "manual/testing/ConfigFiles.h"
#include "server/CommandLine.h"
#include "server/Manual.h"

namespace zorva::server {
namespace {

using ::testing::ElementsAre;
using ::testing::EndsWith;

class ServerConfig : public ::testing::Test {
 protected:
  Config read(const std::string& text) { return readConfig(directory_.write("zorvacimd.toml", text)); }

  /// The error, without the directory.
  std::string wrong(const std::string& text) {
    try {
      read(text);
    } catch (const zorva::agent::ConfigError& error) {
      return std::string(error.what()).substr(directory_.path().size());
    }
    return "nothing";
  }

  zorva::agent::testing::TemporaryDirectory directory_;
};

TEST_F(ServerConfig, AnEmptyFileIsTheDefaults) {
  const Config config = read("");
  EXPECT_EQ(config.port, 5988);
  EXPECT_FALSE(config.addresses.has_value());
  EXPECT_EQ(config.limits.bodyBytes, http::HttpLimits().bodyBytes);
}

TEST_F(ServerConfig, EveryKeyIsRead) {
  const Config config = read(R"(
[listen]
addresses = ["127.0.0.2", "::1"]
port = 5990
socket = "cim.sock"
names = ["www.example.org"]
[tls]
certificate = "server.crt"
key = "/etc/server.key"
addresses = ["0.0.0.0"]
port = 5991
client_ca = "ca.crt"
[limits]
body_kib = 8
bodies_mib = 9
header_kib = 16
nesting = 40
connections = 11
requests = 12
workers = 13
arrival_seconds = 14
idle_seconds = 15
provider_seconds = 16
client_seconds = 17
drain_seconds = 18
[http]
threads = 3
gzip = false
[pull]
contexts = 4
client_contexts = 3
default_seconds = 5
longest_seconds = 6
memory_mib = 7
[agent]
config = "agent.toml"
provider_dir = "/lib/providers"
[access]
users = "users"
anonymous = "none"
group = "staff"
socket = "none"
[log]
level = 4500
target = "server.log"
)");
  EXPECT_THAT(config.addresses.value(), ElementsAre("127.0.0.2", "::1"));
  EXPECT_EQ(config.port, 5990);
  EXPECT_EQ(config.socket, directory_ / "cim.sock");
  EXPECT_THAT(config.names, ElementsAre("www.example.org"));
  EXPECT_EQ(config.tls, (http::TlsFiles{directory_ / "server.crt", "/etc/server.key", directory_ / "ca.crt"}));
  EXPECT_THAT(config.tlsAddresses.value(), ElementsAre("0.0.0.0"));
  EXPECT_EQ(config.tlsPort, 5991);
  EXPECT_EQ(config.limits.bodyBytes, 8U << 10);
  EXPECT_EQ(config.limits.bodiesBytes, 9U << 20);
  EXPECT_EQ(config.limits.headerBytes, 16U << 10);
  EXPECT_EQ(config.nesting, 40);
  EXPECT_EQ(config.limits.connections, 11U);
  EXPECT_EQ(config.limits.requests, 12U);
  EXPECT_EQ(config.limits.workers, 13U);
  EXPECT_EQ(config.limits.arrival, std::chrono::seconds(14));
  EXPECT_EQ(config.limits.idle, std::chrono::seconds(15));
  EXPECT_EQ(config.limits.provider, std::chrono::seconds(16));
  EXPECT_EQ(config.limits.client, std::chrono::seconds(17));
  EXPECT_EQ(config.limits.drain, std::chrono::seconds(18));
  EXPECT_EQ(config.threads, 3);
  EXPECT_FALSE(config.limits.gzip);
  EXPECT_EQ(config.pullContexts, 4);
  EXPECT_EQ(config.pullClientContexts, 3);
  EXPECT_EQ(config.pullSeconds, 5);
  EXPECT_EQ(config.pullLongestSeconds, 6);
  EXPECT_EQ(config.pullMebibytes, 7);
  EXPECT_EQ(config.agentConfig, directory_ / "agent.toml");
  EXPECT_EQ(config.providerDirectory, "/lib/providers");
  EXPECT_EQ(config.access.usersFile, directory_ / "users");
  EXPECT_EQ(config.access.anonymous, access::Role::None);
  EXPECT_EQ(config.access.group, "staff");
  EXPECT_EQ(config.access.otherLocal, access::Role::None);
  EXPECT_EQ(config.logLevel, 4500);
  EXPECT_EQ(config.logTarget, directory_ / "server.log");
}

TEST_F(ServerConfig, TlsNeedsACertificateAndAKey) {
  EXPECT_EQ(wrong("[tls]\ncertificate = \"c\"\n"), "zorvacimd.toml:2: tls.certificate: needs tls.key");
  EXPECT_EQ(wrong("[tls]\nkey = \"k\"\n"), "zorvacimd.toml:2: tls.key: needs tls.certificate");
  EXPECT_EQ(wrong("[tls]\nclient_ca = \"c\"\n"), "zorvacimd.toml:2: tls.client_ca: needs tls.certificate and tls.key");
  EXPECT_EQ(wrong("[tls]\naddresses = [\"::\"]\n"),
            "zorvacimd.toml:2: tls.addresses: needs tls.certificate and tls.key");
}

TEST_F(ServerConfig, AnEmptySocketIsNone) {
  EXPECT_EQ(read("[listen]\nsocket = \"\"\n").socket, "");
  EXPECT_FALSE(read("[listen]\n").socket.has_value());
}

TEST_F(ServerConfig, TheSampleHasEveryKeyWithItsDefault) {
  std::string text = manual::testing::uncommented(manual::sampleOf(serverConfigFile()));
  // Of these keys only examples can be shown, or they need a certificate.
  for (const char* key : {"names = ", "addresses = "}) {
    for (std::size_t at = text.find(key); at != std::string::npos; at = text.find(key)) {
      text.erase(at, text.find('\n', at) + 1 - at);
    }
  }
  Config sample = read(text);
  EXPECT_EQ(sample.socket, kDefaultSocket);
  sample.socket.reset();
  EXPECT_EQ(sample, read(""));
}

TEST_F(ServerConfig, EachKeyThatIsDeclaredIsReadAndMatters) {
  const Config all = read(manual::testing::examplesWithout(configKeys(), {}));
  for (const util::TomlSection& section : configKeys()) {
    for (const util::TomlKey& key : section.keys) {
      const std::string without = manual::testing::examplesWithout(configKeys(), {section.name, key.name});
      if (section.name == "tls" && (key.name == "certificate" || key.name == "key")) {
        EXPECT_NE(wrong(without), "nothing") << key.name;
      } else {
        EXPECT_NE(read(without), all) << section.name << "." << key.name;
      }
    }
  }
}

TEST_F(ServerConfig, AnErrorNamesFileLineAndKey) {
  EXPECT_EQ(wrong("[listen]\nport = 1\nprot = 2\n"),
            "zorvacimd.toml:3: listen.prot: is not a known key; did you mean port?");
  EXPECT_EQ(wrong("[listen]\nport = \"x\"\n"),
            "zorvacimd.toml:2: listen.port: expected a whole number from 0 to 65535");
  EXPECT_EQ(wrong("[listen]\nport = 65536\n"), "zorvacimd.toml:2: listen.port: must be from 0 to 65535");
  EXPECT_EQ(wrong("[listen]\naddresses = []\n"),
            "zorvacimd.toml:2: listen.addresses: expected a list of texts such as [\"127.0.0.1\"]");
  EXPECT_EQ(wrong("\n[ssl]\n"), "zorvacimd.toml:2: ssl: is not a known table or key");
  EXPECT_EQ(wrong("http = 1\n"), "zorvacimd.toml:1: http: expected a table");
  EXPECT_EQ(wrong("[limits]\narrival_seconds = 0\n"),
            "zorvacimd.toml:2: limits.arrival_seconds: must be from 1 to 86400");
  EXPECT_EQ(wrong("[pull]\ndefault_seconds = 9\nlongest_seconds = 8\n"),
            "zorvacimd.toml:2: pull.default_seconds: must not be more than pull.longest_seconds");
  EXPECT_EQ(wrong("[access]\nanonymous = \"all\"\n"),
            "zorvacimd.toml:2: access.anonymous: must be \"read\", \"operate\" or \"none\"");
  EXPECT_EQ(wrong("[access]\nsocket = \"operate\"\n"), "zorvacimd.toml:2: access.socket: must be \"read\" or \"none\"");
  EXPECT_THAT(wrong("[listen\n"), ::testing::StartsWith("zorvacimd.toml:1: "));
}

TEST_F(ServerConfig, WhatIsNoFileIsAnErrorAndNoWait) {
  EXPECT_THROW(readConfig(directory_.path()), zorva::agent::ConfigError);
  EXPECT_THROW(readConfig(directory_ / "absent.toml"), zorva::agent::ConfigError);
}

TEST_F(ServerConfig, TheCommandLineHoldsOverTheFile) {
  directory_.write("zorvacimd.toml", "[listen]\nport = 1\n[log]\nlevel = 2\n");
  const std::string file = directory_ / "zorvacimd.toml";
  const char* words[] = {"zorvacimd", "--config", file.c_str(), "--port",      "7",      "--listen",
                         "::1",       "--listen", "127.0.0.3",  "--anonymous", "operate"};
  const auto line = readCommandLine(static_cast<int>(std::size(words)), words);
  const Config config = configOf(std::get<CommandLine>(line));
  EXPECT_EQ(config.port, 7);
  EXPECT_EQ(config.logLevel, 2);
  EXPECT_EQ(config.access.anonymous, access::Role::Operate);
  EXPECT_THAT(config.addresses.value(), ElementsAre("::1", "127.0.0.3"));
}

TEST_F(ServerConfig, OnlyLoopbackAddressesAreTaken) {
  for (const char* address : {"0.0.0.0", "::", "192.0.2.1", "10.0.0.1", "128.0.0.1", "::ffff:127.0.0.1", "fe80::1"}) {
    const std::string file = directory_.write("zorvacimd.toml", "");
    const char* words[] = {"zorvacimd", "--config", file.c_str(), "--listen", address};
    const auto line = readCommandLine(static_cast<int>(std::size(words)), words);
    EXPECT_THROW(configOf(std::get<CommandLine>(line)), std::invalid_argument) << address;
  }
}

TEST(ServerCommandLine, UnknownWordsAreWrongUsage) {
  const char* words[] = {"zorvacimd", "--lisen", "::1"};
  const auto line = readCommandLine(3, words);
  ASSERT_TRUE(std::holds_alternative<Telling>(line));
  EXPECT_TRUE(std::get<Telling>(line).isError);
}

TEST(ServerCommandLine, HelpHasExamples) {
  const char* words[] = {"zorvacimd", "--help"};
  const auto line = readCommandLine(2, words);
  ASSERT_TRUE(std::holds_alternative<Telling>(line));
  EXPECT_THAT(std::get<Telling>(line).text, ::testing::HasSubstr("zorvacimd --port 0"));
  EXPECT_FALSE(std::get<Telling>(line).isError);
}

}  // namespace
}  // namespace zorva::server
