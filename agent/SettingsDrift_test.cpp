#include "agent/SettingsDrift.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <vector>

#include "agent/Agent.h"
#include "agent/Seams.h"
#include "agent/apply/HostDns.h"
#include "agent/testing/TemporaryDirectory.h"
#include "agent/testing/Trees.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

/// A host with eth0, and a service processor with an interface of the same name.
class Drift : public ::testing::Test {
 protected:
  Drift() {
    Config config;
    config.dataDir = directory_ / "data/";
    std::filesystem::create_directory(config.dataDir);
    setConfig(config);
    hostHas({}, {}, "");
  }
  ~Drift() override { reset(); }

  static void hostHas(const StringList& servers, const StringList& suffixes, const std::string& domain,
                      const char* owner = "NetworkManager") {
    TreeBuilder builder("host1");
    for (const char* description : {"Computer", "BMC"}) {
      const std::size_t system = builder.add(0, NodeType::System, description, description);
      const std::size_t node =
          builder.add(builder.add(system, NodeType::Port, "port"), NodeType::NetworkIPConfig, "ip");
      builder.set(node, PROP_NAME, std::string("eth0"));
      builder.set(node, PROP_DNS_SERVER_ADDRESSES, std::make_shared<const StringList>(servers));
      builder.set(node, PROP_DNS_SUFFIXES, std::make_shared<const StringList>(suffixes));
      builder.set(node, PROP_DOMAIN_NAME, domain);
      builder.set(node, kDnsOwner, std::string(owner));
    }
    setTreeSource(std::make_shared<testing::FixedSource>(builder.finish()));
  }

  void fileHas(const std::string& text) const { directory_.write("data/ifcfg-eth0", text); }

  /// "servers=1 suffixes=- domain=0" of each.
  static std::vector<std::string> found() {
    const auto word = [](const std::optional<bool>& differs) { return !differs ? "-" : *differs ? "1" : "0"; };
    std::vector<std::string> texts;
    for (const SettingsDrift& each : settingsDrift()) {
      texts.push_back(each.interface + " servers=" + word(each.servers) + " suffixes=" + word(each.suffixes) +
                      " domain=" + word(each.domain));
    }
    return texts;
  }

  const testing::TemporaryDirectory directory_;
};

TEST_F(Drift, IsOnlyOfInterfacesOfTheHostWithSettings) {
  hostHas({"192.0.2.1"}, {}, "");
  EXPECT_THAT(found(), IsEmpty());
  fileHas("DNSSERVERS=192.0.2.1\n");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=0 suffixes=- domain=-"));
  fileHas("DNSSERVERS=192.0.2.2\n");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=1 suffixes=- domain=-"));
}

TEST_F(Drift, OfServersIsInTheirOrderWithinEachFamily) {
  fileHas("DNSSERVERS=192.0.2.1 2001:db8::1 192.0.2.2\n");
  hostHas({"192.0.2.1", "192.0.2.2", "2001:db8::1"}, {}, "");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=0 suffixes=- domain=-"));
  hostHas({"192.0.2.2", "192.0.2.1", "2001:db8::1"}, {}, "");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=1 suffixes=- domain=-"));
}

TEST_F(Drift, OfServersCountsInResolvConfOnlyThoseThatAreAsked) {
  fileHas("DNSSERVERS=192.0.2.1 192.0.2.2 192.0.2.3 192.0.2.4\n");
  const StringList asked = {"192.0.2.1", "192.0.2.2", "192.0.2.3"};
  hostHas(asked, {}, "", kResolvConfOwner);
  EXPECT_THAT(found(), ElementsAre("eth0 servers=0 suffixes=- domain=-"));
  hostHas(asked, {}, "");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=1 suffixes=- domain=-"));
}

TEST_F(Drift, OfNamesIsWhateverTheirCase) {
  fileHas("DNSSUFFIXES=b.example.org\nDOMAINNAME=A.example.org\n");
  hostHas({}, {"B.example.org"}, "a.example.org");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=- suffixes=0 domain=0"));
  hostHas({}, {"a.example.org", "b.example.org"}, "");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=- suffixes=0 domain=0")) << "the owner shows the domain first";
  hostHas({}, {"b.example.org", "c.example.org"}, "d.example.org");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=- suffixes=1 domain=1"));
}

TEST_F(Drift, IsWhatCannotBeReadOrApplied) {
  fileHas("DNSSERVERS=nonsense\n");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=1 suffixes=- domain=-"));
  std::filesystem::remove(directory_ / "data/ifcfg-eth0");
  std::filesystem::create_directory(directory_ / "data/ifcfg-eth0");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=1 suffixes=1 domain=1"));
}

TEST_F(Drift, IsFromTheOverlayTooAndAWrongOneCountsAsNone) {
  directory_.write("data/overlay.json", R"({"/Computer/port/ip": {"dns_server_addresses": ["192.0.2.9"]}})");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=1 suffixes=- domain=-"));
  hostHas({"192.0.2.9"}, {}, "");
  EXPECT_THAT(found(), ElementsAre("eth0 servers=0 suffixes=- domain=-"));
  directory_.write("data/overlay.json", "no overlay");
  EXPECT_THAT(found(), IsEmpty());
}

}  // namespace
}  // namespace zorva::agent
