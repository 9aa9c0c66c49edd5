// The programs together: zorva-bmc beside the tests' Redfish service, and zorvactl, which sees and changes it.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "bmc/testing/RunningBmc.h"
#include "bmc/testing/TestRedfish.h"
#include "http/testing/TestCertificates.h"

namespace zorva::bmc {
namespace {

using agent::testing::contentsOf;
using http::testing::outputOf;
using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using testing::json;
using testing::kEth0;
using ::testing::Not;
using ::testing::Pair;
using testing::RunningBmc;

class ApplyTest : public ::testing::Test {
 protected:
  ApplyTest() {
    // A name that no interface of this machine has.
    redfish_.tell({{"set", {{kEth0, {{"Id", "zvbmc0"}}}}}});
    redfish_.directory().write("data/.keep", "");
    config_ = redfish_.configFile("[agent]\ndata_dir = \"data\"\n[log]\ntarget = \"off\"\n");
  }

  std::string zorvactl(const std::string& words) const {
    return outputOf(ZORVA_BIN_DIR "/zorvactl --config " + config_ + " " + words);
  }

  // The same as a user who is in the group of the files and not root.
  std::string zorvactlOfAUser(const std::string& words) const {
    return outputOf("setpriv --reuid=nobody --clear-groups --inh-caps=-all " ZORVA_BIN_DIR "/zorvactl --config " +
                    config_ + " " + words);
  }

  // The requests by which a command has changed something: each with its ETag, and the properties.
  std::vector<std::pair<std::string, json>> changes() {
    std::vector<std::pair<std::string, json>> found;
    for (const json& each : redfish_.patches()) found.emplace_back(each["If-Match"], each["body"]);
    return found;
  }

  json interfaceShown() const {
    const json view = json::parse(zorvactl("show zvbmc0 --output json"));
    return view["interfaces"][0];
  }

  testing::TestRedfish redfish_;
  std::string config_;
};

TEST_F(ApplyTest, AChangeReachesTheServiceProcessorAndIsTakenBack) {
  RunningBmc bmc(redfish_, config_);
  EXPECT_THAT(zorvactl("show zvbmc0"),
              AllOf(HasSubstr("zvbmc0 (BMC)\n  state      Enabled\n  from       BMC, eth0"), HasSubstr(" s ago")));
  zorvactl("ifcfg init zvbmc0");
  EXPECT_THAT(zorvactl("dns set zvbmc0 192.0.2.77"), HasSubstr("192.0.2.77"));
  EXPECT_THAT(zorvactl("domain zvbmc0 lab.example.org"), HasSubstr("lab.example.org"));
  EXPECT_THAT(zorvactl("apply zvbmc0 --dry-run"), AllOf(HasSubstr("192.0.2.53 2001:db8::53  ->  192.0.2.77"),
                                                        HasSubstr("domain_name"), Not(HasSubstr("applied by"))));
  EXPECT_EQ(redfish_.tell({{"get", kEth0}})["StaticNameServers"][0], "192.0.2.53") << "a dry run changes nothing";
  EXPECT_THAT(zorvactl("apply zvbmc0"), HasSubstr("applied by BMC"));
  EXPECT_THAT(changes(), ElementsAre(Pair("\"v2\"", json::parse(R"({"StaticNameServers": ["192.0.2.77", "", "", ""],
                                                                    "FQDN": "host1-bmc.lab.example.org"})"))));
  EXPECT_THAT(zorvactl("apply 'BMC%zvbmc0'"), HasSubstr("the host has these settings already"));
  EXPECT_THAT(zorvactl("revert zvbmc0"), HasSubstr("reverted by BMC"));
  EXPECT_THAT(changes(),
              ElementsAre(Pair("\"v3\"", json::parse(R"({"StaticNameServers": ["192.0.2.53", "2001:db8::53", "", ""],
                                                        "FQDN": "host1-bmc.mgmt.example.org"})"))));
}

TEST_F(ApplyTest, ADryRunNamesTheServersOfDhcpThatWillBeDropped) {
  redfish_.tell({{"set",
                  {{kEth0,
                    {{"StaticNameServers", {"", ""}},
                     {"NameServers", {"198.51.100.1"}},
                     {"DHCPv4", {{"DHCPEnabled", true}, {"UseDNSServers", true}}}}}}}});
  RunningBmc bmc(redfish_, config_);
  zorvactl("ifcfg init zvbmc0");
  zorvactl("dns set zvbmc0 192.0.2.77");
  const std::string warning = "the service processor will no longer use what DHCP gave it: 198.51.100.1";
  EXPECT_THAT(zorvactl("apply zvbmc0 --dry-run"), HasSubstr(warning));
  EXPECT_THAT(changes(), ElementsAre());
}

TEST_F(ApplyTest, AUserSeesWhatWouldChangeAndChangesNothing) {
  if (::geteuid() != 0) GTEST_SKIP() << "only root can be another user";
  RunningBmc bmc(redfish_, config_);
  zorvactl("ifcfg init zvbmc0");
  zorvactl("dns set zvbmc0 192.0.2.77");
  for (const char* place : {"", "run", "data"}) ::chmod((redfish_.directory() / place).c_str(), 0755);
  if (zorvactlOfAUser("--version").find("zorvactl ") != 0) {
    GTEST_SKIP() << "another user cannot run what was built here";
  }
  EXPECT_THAT(zorvactlOfAUser("apply zvbmc0 --dry-run"),
              AllOf(HasSubstr("192.0.2.53 2001:db8::53  ->  192.0.2.77"), HasSubstr("only root may ask zorva-bmc"),
                    Not(HasSubstr("does not answer"))));
  EXPECT_THAT(changes(), ElementsAre());
}

TEST_F(ApplyTest, WithApplyHostTheCommandItselfChangesIt) {
  config_ = redfish_.configFile("[agent]\ndata_dir = \"data\"\n[tree]\napply = \"host\"\n[log]\ntarget = \"off\"\n");
  if (::geteuid() != 0) GTEST_SKIP() << "only root applies";
  RunningBmc bmc(redfish_, config_);
  zorvactl("ifcfg init zvbmc0");
  EXPECT_THAT(zorvactl("dns set zvbmc0 192.0.2.78"), HasSubstr("applied by BMC"));
  zorvactl("domain zvbmc0 lab.example.org");
  EXPECT_THAT(changes(),
              ElementsAre(Pair("\"v2\"", json::parse(R"({"StaticNameServers": ["192.0.2.78", "", "", ""]})")),
                          Pair("\"v3\"", json::parse(R"({"FQDN": "host1-bmc.lab.example.org"})"))));
  redfish_.tell({{"patch", 400}});
  EXPECT_THAT(zorvactl("dns set zvbmc0 192.0.2.79"), HasSubstr("The value 192.0.2.1 of StaticNameServers is refused."));
}

TEST_F(ApplyTest, AValueOfTheEndpointReachesItThroughTheOverlay) {
  config_ = redfish_.configFile("[agent]\ndata_dir = \"data\"\n[tree]\napply = \"host\"\n[log]\ntarget = \"off\"\n");
  if (::geteuid() != 0) GTEST_SKIP() << "only root applies";
  RunningBmc bmc(redfish_, config_);
  const std::string endpoint = "'ZORVA_DNSProtocolEndPoint.Name=\"zvbmc0\"'";
  EXPECT_THAT(zorvactl("modify " + endpoint + " DomainName=lab.example.org"), HasSubstr("lab.example.org"));
  EXPECT_EQ(redfish_.tell({{"get", kEth0}})["FQDN"], "host1-bmc.lab.example.org");
}

TEST_F(ApplyTest, AServiceProcessorThatIsGoneIsShownWithItsAge) {
  { RunningBmc bmc(redfish_, config_); }
  std::string text = contentsOf(redfish_.bmcJson());
  const std::size_t place = text.find("\"read_at\": ") + 11;
  text.replace(place, text.find(',', place) - place, std::to_string(std::time(nullptr) - 3 * 3600));
  redfish_.directory().write("run/bmc.json", text);
  EXPECT_THAT(zorvactl("show --all"), HasSubstr("Service processor\n  read  3 h ago; what it has now is not known\n"));
  EXPECT_EQ(interfaceShown()["state"], 0) << "CIM's Unknown";
  EXPECT_EQ(interfaceShown()["servers"], json::parse(R"(["192.0.2.53", "2001:db8::53"])"));
  zorvactl("ifcfg init zvbmc0");
  zorvactl("dns set zvbmc0 192.0.2.77");
  EXPECT_THAT(zorvactl("apply zvbmc0"), HasSubstr("zorva-bmc does not answer"));
}

TEST_F(ApplyTest, ThePasswordIsInNoPlaceThatOthersSee) {
  RunningBmc bmc(redfish_, config_);
  const std::string secret = testing::kPassword;
  EXPECT_THAT(bmc.inProc("cmdline"), AllOf(HasSubstr("zorva-bmc"), Not(HasSubstr(secret))));
  EXPECT_THAT(bmc.inProc("environ"), Not(HasSubstr(secret)));
  EXPECT_THAT(bmc.inProc("limits"), ::testing::ContainsRegex("Max core file size +0 +0"));
  EXPECT_THAT(contentsOf(redfish_.bmcJson()), Not(HasSubstr(secret)));
  struct stat status {};
  ASSERT_EQ(::stat(bmc.socket().c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 0777U, 0600U);
  EXPECT_EQ(bmc.stop(), 0);
  EXPECT_THAT(bmc.log(), Not(HasSubstr(secret)));
  EXPECT_NE(::access(bmc.socket().c_str(), F_OK), 0);
  EXPECT_THAT(redfish_.requests(), ::testing::Contains(HasSubstr("DELETE")));
}

}  // namespace
}  // namespace zorva::bmc
