#include "frontend/SettingPlace.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>

#include "agent/Agent.h"
#include "agent/testing/TemporaryDirectory.h"

namespace zorva::frontend {
namespace {

using ::testing::HasSubstr;
using zorva::agent::testing::TemporaryDirectory;

constexpr const char* kTree = R"({"system_name": "host1", "nodes": [
  {"type": "System", "name": "sp", "description": "BMC", "children": [
    {"type": "Port", "name": "p0", "description": "", "children": [
      {"type": "NetworkIPConfig", "name": "ip", "description": "", "properties": {"name": "mgmt0"}}]}]},
  {"type": "System", "name": "system", "description": "Computer", "children": [
    {"type": "Port", "name": "p1", "description": "", "children": [
      {"type": "NetworkIPConfig", "name": "ip", "description": "", "properties": {"name": "eth0"}}]}]}]})";

/// A host with the interface eth0 and the service processor's mgmt0; its data directory exists.
class SettingPlaceTest : public ::testing::Test {
 protected:
  SettingPlaceTest() {
    directory_.write("tree.json", kTree);
    std::filesystem::create_directory(directory_ / "data");
    zorva::agent::loadConfig(directory_.write(
        "agent.toml", "[agent]\ndata_dir = \"data/\"\n[tree]\nsource = \"file\"\nfile = \"tree.json\"\n"));
  }

  static broker::Instance instance(const std::string& className, const std::string& id = "") {
    broker::Instance made;
    made.path.className = className;
    made.properties.push_back({"InstanceID", broker::Value::text(id)});
    return made;
  }

  /// The reason for a property of eth0's settings; empty if there is none.
  static std::string reason(const std::string& property) {
    return missingPlace(instance("ZORVA_DNSSettingData", "Computer%eth0"), property).value_or("");
  }

  std::string data(const std::string& name) const { return directory_ / ("data/" + name); }

  TemporaryDirectory directory_;
};

TEST_F(SettingPlaceTest, IsALineOfTheInterfacesFile) {
  EXPECT_EQ(reason("DomainName"),
            data("ifcfg-eth0") + " does not exist; 'zorvactl ifcfg init eth0' makes it, then repeat this");
  directory_.write("data/ifcfg-eth0", "DOMAINNAME=a\nDHCP_HOSTNAME=x\n");
  EXPECT_EQ(reason("DomainName"), "");
  EXPECT_EQ(reason("requestedhostname"), "") << "the providers replace every line with the key in it";
  EXPECT_EQ(reason("DNSServerAddresses"), data("ifcfg-eth0") +
                                              " has no line DNSSERVERS=; add it, or let 'zorvactl ifcfg init eth0 "
                                              "--force' write all six, then repeat this");
  EXPECT_EQ(reason("Caption"), "") << "it is not stored anywhere";
}

TEST_F(SettingPlaceTest, OfTheWholeHostIsTheFileOfTheFirstInterfaceOutsideTheServiceProcessor) {
  const broker::Instance general = instance("ZORVA_DNSGeneralSettingData", "dnsgen1:host1");
  EXPECT_THAT(missingPlace(general, "DNSSuffixesToAppend").value_or(""), HasSubstr("ifcfg-eth0 does not exist"));
  EXPECT_THAT(missingFile(general, "DNSSuffixesToAppend").value_or(""), HasSubstr("ifcfg-eth0 does not exist"));
  directory_.write("data/ifcfg-eth0", "");
  EXPECT_THAT(missingPlace(general, "DNSSuffixesToAppend").value_or(""), HasSubstr("has no line DNSSUFFIXES="));
  EXPECT_EQ(missingFile(general, "DNSSuffixesToAppend"), std::nullopt);
}

TEST_F(SettingPlaceTest, IsNoneInWhatIsNoFile) {
  std::filesystem::create_directory(data("ifcfg-eth0"));
  EXPECT_EQ(reason("DomainName"), data("ifcfg-eth0") + ": not a regular file");
  EXPECT_EQ(missingPlace(instance("ZORVA_DNSSettingData", "Computer%"), "DomainName"),
            "the interface has no name, and so no file");
}

TEST_F(SettingPlaceTest, NeedsTheDataDirectory) {
  const broker::Instance endpoint = instance("ZORVA_DNSProtocolEndPoint");
  EXPECT_EQ(missingPlace(endpoint, "Hostname"), std::nullopt);
  std::filesystem::remove(directory_ / "data");
  EXPECT_THAT(missingPlace(endpoint, "Hostname").value_or(""), ::testing::EndsWith("data/ does not exist"));
  EXPECT_THAT(reason("DomainName"), testing::MatchesRegex("the data directory .*data/ does not exist"));
}

TEST_F(SettingPlaceTest, NeedsRoomOnTheDisk) {
  // In a child process, with a separate disk mounted at the data directory, which is unmounted when the child ends.
  const pid_t child = fork();
  if (child == 0) {
    if (unshare(CLONE_NEWNS) != 0 || mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
        mount("none", (directory_ / "data").c_str(), "tmpfs", 0, "size=64k") != 0) {
      _exit(77);
    }
    std::ofstream(data("ifcfg-eth0")) << "HOSTNAME=a\n";
    const bool hadRoom = reason("RequestedHostname").empty();
    std::ofstream(data("filler")) << std::string(1000000, 'x');
    const bool isFull = reason("RequestedHostname") == "the disk of " + data("ifcfg-eth0") + " is full" &&
                        reason("DomainName") == reason("RequestedHostname");
    _exit(hadRoom && isFull ? 0 : 1);
  }
  int state = 0;
  ASSERT_EQ(waitpid(child, &state, 0), child);
  ASSERT_TRUE(WIFEXITED(state));
  if (WEXITSTATUS(state) == 77) GTEST_SKIP() << "no disk can be mounted here";
  EXPECT_EQ(WEXITSTATUS(state), 0);
}

}  // namespace
}  // namespace zorva::frontend
