// The server as other programs see it: each operation of sblim's wbemcli is run against zorvacimd on a host that is a
// file.

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <filesystem>
#include <string>
#include <vector>

#include "agent/testing/Program.h"
#include "agent/testing/TemporaryDirectory.h"
#include "util/NotCopied.h"

namespace zorva::cimom {
namespace {

using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;
using zorva::agent::testing::contentsOf;

constexpr const char* kTree = R"json({ "system_name": "host1", "nodes": [
  { "type": "System", "name": "system", "description": "Computer", "children": [
    { "type": "Port", "name": "eth0", "description": "", "children": [
      { "type": "NetworkIPConfig", "name": "ip", "description": "", "properties": {
        "name": "eth0", "host_name": "host1", "domain_name": "example.org", "dns_suffixes": ["example.org"],
        "dns_server_addresses": ["192.0.2.53", "2001:db8::53"], "protocol_if_type": 4097, "enabled_state": 1,
        "addresses": [ { "address": "192.0.2.10", "prefix_length": 24, "origin": "static" } ] } } ] } ] } ] })json";

constexpr const char* kFile =
    "HOSTNAME=host1\nDOMAINNAME=example.org\nCONFIG_NAME=office\nDNSSERVERS=192.0.2.53 \nDNSSUFFIXES=example.org \n";

/// A program's standard output and error.
std::string outputOf(const std::vector<std::string>& words, int& exitCode) {
  std::array<int, 2> ends{};
  EXPECT_EQ(pipe2(ends.data(), O_CLOEXEC), 0);
  const zorva::agent::testing::Program program(words);
  const pid_t child = fork();
  if (child == 0) program.exec(ends[1], ends[1]);
  close(ends[1]);
  std::string output;
  char piece[4096];
  for (ssize_t got = read(ends[0], piece, sizeof piece); got > 0; got = read(ends[0], piece, sizeof piece)) {
    output.append(piece, static_cast<std::size_t>(got));
  }
  close(ends[0]);
  int state = 0;
  waitpid(child, &state, 0);
  exitCode = WIFEXITED(state) ? WEXITSTATUS(state) : 128;
  return output;
}

/// zorvacimd on a free port, over the tree above; the destructor ends it.
class Server : util::NotCopied {
 public:
  Server() {
    directory_.write("tree.json", kTree);
    directory_.write("data/keep", "");
    directory_.write("agent.toml", "[agent]\ndata_dir = \"" + (directory_ / "data/") +
                                       "\"\n[tree]\nsource = \"file\"\nfile = \"" + (directory_ / "tree.json") +
                                       "\"\n[log]\ntarget = \"off\"\n");
    directory_.write("server.toml", "");
    directory_.write("data/ifcfg-eth0", kFile);
    std::array<int, 2> ends{};
    EXPECT_EQ(pipe2(ends.data(), O_CLOEXEC), 0);
    process_ = fork();
    if (process_ == 0) {
      dup2(ends[1], STDOUT_FILENO);
      execl(ZORVA_BIN_DIR "/zorvacimd", "zorvacimd", "--port", "0", "--listen", "127.0.0.1", "--config",
            (directory_ / "server.toml").c_str(), "--agent-config", (directory_ / "agent.toml").c_str(), "--anonymous",
            "operate", nullptr);
      _exit(127);
    }
    close(ends[1]);
    FILE* told = fdopen(ends[0], "r");
    char line[256] = {};
    EXPECT_NE(std::fgets(line, sizeof line, told), nullptr) << "zorvacimd did not start";
    std::fclose(told);
    const std::string text(line);
    const std::size_t colon = text.find("127.0.0.1:");
    EXPECT_NE(colon, std::string::npos) << text;
    if (colon != std::string::npos) port_ = std::stoi(text.substr(colon + 10));
  }
  ~Server() {
    kill(process_, SIGTERM);
    waitpid(process_, nullptr, 0);
  }

  /// The file of the interface's settings.
  std::string file() const { return directory_ / "data/ifcfg-eth0"; }

  std::string url(const std::string& rest) const { return "http://localhost:" + std::to_string(port_) + "/" + rest; }

 private:
  zorva::agent::testing::TemporaryDirectory directory_;
  pid_t process_ = -1;
  int port_ = 0;
};

constexpr const char* kEndpoint =
    "root/cimv2:ZORVA_DNSProtocolEndPoint.SystemCreationClassName=\"ZORVA_ComputerSystem\","
    "CreationClassName=\"ZORVA_DNSProtocolEndPoint\",SystemName=\"host1\",Name=\"eth0\"";
constexpr const char* kSetting = "root/cimv2:ZORVA_DNSSettingData.InstanceID=\"Computer%eth0\"";
constexpr const char* kGeneralSetting = "root/cimv2:ZORVA_DNSGeneralSettingData.InstanceID=\"dnsgen1:host1\"";
constexpr const char* kProfile = "interop:CIM_RegisteredProfile.InstanceID=\"ZORVA:DNSClient:1.0.0\"";

class Wbemcli : public ::testing::Test {
 protected:
  void SetUp() override {
    int exitCode = 0;
    outputOf({"wbemcli", "-h"}, exitCode);
    if (exitCode == 127) GTEST_SKIP() << "wbemcli (sblim-wbemcli) is not installed";
    server_.emplace();
  }

  /// wbemcli's answer to one operation.
  std::string ask(const std::string& operation, const std::string& path, const std::vector<std::string>& more = {},
                  const std::vector<std::string>& options = {}) {
    std::vector<std::string> words{"wbemcli", operation};
    words.insert(words.end(), options.begin(), options.end());
    words.push_back(server_->url(path));
    words.insert(words.end(), more.begin(), more.end());
    int exitCode = 0;
    return outputOf(words, exitCode);
  }

  std::optional<Server> server_;
};

TEST_F(Wbemcli, ReadsInstances) {
  EXPECT_THAT(ask("ein", "root/cimv2:ZORVA_DNSProtocolEndPoint"), HasSubstr("SystemName=\"host1\",Name=\"eth0\"\n"));
  EXPECT_THAT(ask("ei", "root/cimv2:ZORVA_DNSProtocolEndPoint"),
              AllOf(HasSubstr("Hostname=\"host1\""), HasSubstr("DomainName=\"example.org\"")));
  EXPECT_THAT(ask("ei", "root/cimv2:CIM_RemoteServiceAccessPoint"),
              AllOf(HasSubstr("192.0.2.53"), HasSubstr("2001:db8::53")));
  EXPECT_THAT(ask("gi", kEndpoint), HasSubstr("Hostname=\"host1\""));
  EXPECT_THAT(ask("gi", kEndpoint, {"Hostname"}), Not(HasSubstr("DomainName")));
  EXPECT_THAT(ask("gi", "root/cimv2:ZORVA_DNSSettingData.InstanceID=\"none\""), HasSubstr("wbemcli: Cim: ("));
  EXPECT_THAT(ask("gp", kEndpoint, {"Hostname"}), HasSubstr("host1"));
}

TEST_F(Wbemcli, MayLeaveOutKeysThatSayNothing) {
  const std::string brief = "root/cimv2:ZORVA_DNSProtocolEndPoint.Name=\"eth0\"";
  EXPECT_THAT(ask("gi", brief), HasSubstr("Hostname=\"host1\""));
  EXPECT_EQ(ask("ain", brief), ask("ain", kEndpoint));
  EXPECT_THAT(ask("gi", "root/cimv2:ZORVA_DNSProtocolEndPoint.Name=\"eth7\""), HasSubstr("(6) CIM_ERR_NOT_FOUND"));
}

TEST_F(Wbemcli, WalksAssociations) {
  EXPECT_THAT(ask("ain", kEndpoint),
              AllOf(HasSubstr("ZORVA_RemoteServiceAccessPoint."), HasSubstr("ZORVA_ComputerSystem."),
                    HasSubstr("ZORVA_DNSGeneralSettingData."), HasSubstr("ZORVA_DNSSettingData.")));
  EXPECT_THAT(ask("ai", kEndpoint, {}, {"-ac", "ZORVA_DNSHostedAccessPoint"}),
              AllOf(HasSubstr("ZORVA_ComputerSystem"), Not(HasSubstr("ZORVA_DNSSettingData."))));
  EXPECT_THAT(ask("ain", kEndpoint, {}, {"-arc", "CIM_SettingData"}),
              AllOf(HasSubstr("ZORVA_DNSSettingData."), Not(HasSubstr("ZORVA_ComputerSystem."))));
  EXPECT_THAT(ask("rin", kEndpoint), HasSubstr("ZORVA_DNSHostedAccessPoint."));
  EXPECT_THAT(ask("ri", kEndpoint, {}, {"-arc", "CIM_HostedAccessPoint"}),
              AllOf(HasSubstr("ZORVA_DNSHostedAccessPoint"), Not(HasSubstr("ZORVA_DNSSAPSAPDependency."))));
}

TEST_F(Wbemcli, ReadsClasses) {
  EXPECT_THAT(ask("ecn", "root/cimv2"), HasSubstr("root/cimv2:CIM_ManagedElement\n"));
  EXPECT_THAT(ask("ec", "root/cimv2"), HasSubstr("CIM_ManagedElement InstanceID="));
  EXPECT_THAT(ask("gc", "root/cimv2:ZORVA_DNSSettingData"), HasSubstr("InstanceID="));
  EXPECT_THAT(ask("gcd", "root/cimv2:ZORVA_DNSSettingData"), HasSubstr("<CLASS NAME=\"ZORVA_DNSSettingData\""));
}

TEST_F(Wbemcli, ChangesThings) {
  EXPECT_THAT(ask("cm", kEndpoint, {"RequestStateChange.RequestedState=2"}), Not(HasSubstr("Exception")));
  EXPECT_THAT(ask("cm", kEndpoint, {"NoSuchMethod"}), HasSubstr("CIM_ERR_METHOD_NOT_FOUND"));
  EXPECT_EQ(ask("mi", kEndpoint, {"DomainName=\"example.net\""}), "");
  EXPECT_EQ(ask("sp", kEndpoint, {"DomainName=\"example.net\""}), "");
  EXPECT_THAT(ask("ci", kEndpoint, {"Name=\"eth9\""}), HasSubstr("(7) CIM_ERR_NOT_SUPPORTED"));
  EXPECT_THAT(ask("di", kEndpoint), HasSubstr("(7) CIM_ERR_NOT_SUPPORTED"));
  EXPECT_THAT(ask("dc", "root/cimv2:CIM_DNSSettingData"), HasSubstr("(7) CIM_ERR_NOT_SUPPORTED"));
}

TEST_F(Wbemcli, ChangesOneSettingAndLeavesTheOthers) {
  EXPECT_EQ(ask("mi", kSetting, {"DomainName=\"example.net\""}), "");
  EXPECT_EQ(ask("sp", kSetting, {"RequestedHostname=\"host2\""}), "");
  EXPECT_EQ(ask("mi", kGeneralSetting, {"DNSSuffixesToAppend=\"a.example\",\"b.example\""}), "");
  EXPECT_EQ(contentsOf(server_->file()),
            "HOSTNAME=host2\nDOMAINNAME=example.net\nCONFIG_NAME=office\nDNSSERVERS=192.0.2.53 \n"
            "DNSSUFFIXES=a.example b.example \n");
}

TEST_F(Wbemcli, GetsAnErrorForAReadOnlyProperty) {
  // It sends the whole instance, including the properties without a value.
  EXPECT_THAT(ask("mi", kSetting, {"Caption=\"x\""}), HasSubstr("(7) CIM_ERR_NOT_SUPPORTED: these properties of "
                                                                "ZORVA_DNSSettingData cannot be changed: Caption"));
  EXPECT_THAT(ask("mi", kSetting, {"SoID=\"x\""}), HasSubstr("cannot be changed: SoID"));
  EXPECT_THAT(ask("mi", kSetting, {"InstanceID=\"x\""}), HasSubstr("(4) CIM_ERR_INVALID_PARAMETER: the key"));
  EXPECT_EQ(contentsOf(server_->file()), kFile);
}

TEST_F(Wbemcli, GetsAnErrorForAValueThatWasNotStored) {
  std::filesystem::remove(server_->file());
  for (const char* operation : {"mi", "sp"}) {
    EXPECT_THAT(ask(operation, kSetting, {"DomainName=\"lab.example.org\""}),
                HasSubstr("(1) CIM_ERR_FAILED: DomainName was not stored: " + server_->file() + " does not exist"));
  }
  EXPECT_EQ(ask("mi", kSetting, {"DomainName=\"example.org\""}), "") << "the host says so already";
}

TEST_F(Wbemcli, FindsOutWhatIsHere) {
  for (const std::string nameSpace : {"interop", "root/interop"}) {
    EXPECT_THAT(
        ask("ei", nameSpace + ":CIM_Namespace"),
        AllOf(HasSubstr("Name=\"root/cimv2\""), HasSubstr("Name=\"interop\""), HasSubstr("Name=\"root/interop\"")));
    EXPECT_THAT(ask("ei", nameSpace + ":CIM_ObjectManager"), HasSubstr("ElementName=\"zorvacimd\""));
    EXPECT_THAT(ask("ei", nameSpace + ":CIM_RegisteredProfile"),
                AllOf(HasSubstr("RegisteredName=\"Zorva DNS Client\""), HasSubstr("RegisteredOrganization=1")));
  }
  const std::string conformant = ask("ain", kProfile, {}, {"-ac", "CIM_ElementConformsToProfile"});
  EXPECT_THAT(conformant, AllOf(HasSubstr("root/cimv2:ZORVA_DNSProtocolEndPoint."), Not(HasSubstr("ComputerSystem."))));
  EXPECT_THAT(ask("ain", kEndpoint, {}, {"-ac", "CIM_ElementConformsToProfile"}),
              HasSubstr("interop:CIM_RegisteredProfile.InstanceID="));
  EXPECT_THAT(ask("ai", kEndpoint, {}, {"-arc", "CIM_RegisteredProfile"}),
              HasSubstr("RegisteredName=\"Zorva DNS Client\""));
  EXPECT_THAT(ask("ai", kProfile), HasSubstr("Hostname=\"host1\""));
  EXPECT_THAT(ask("rin", kProfile), HasSubstr("CIM_ElementConformsToProfile."));
  EXPECT_THAT(ask("ri", kProfile), HasSubstr("CIM_ElementConformsToProfile."));
  std::string endpoint = kEndpoint;
  endpoint.replace(0, std::string("root/cimv2").size(), "interop");
  EXPECT_THAT(ask("ain", endpoint), HasSubstr("CIM_RegisteredProfile.InstanceID=\"ZORVA:DNSClient:1.0.0\""));
}

TEST_F(Wbemcli, GetsErrorDescriptions) {
  EXPECT_THAT(ask("ein", "root/none:CIM_System"), HasSubstr("(3) CIM_ERR_INVALID_NAMESPACE: there is no namespace"));
  EXPECT_THAT(ask("ein", "root/cimv2:No_Such"), HasSubstr("(5) CIM_ERR_INVALID_CLASS"));
  EXPECT_THAT(ask("gc", "root/cimv2:No_Such"), HasSubstr("(6) CIM_ERR_NOT_FOUND"));
}

}  // namespace
}  // namespace zorva::cimom
