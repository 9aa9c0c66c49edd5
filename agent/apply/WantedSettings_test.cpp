#include "agent/apply/WantedSettings.h"

#include <gtest/gtest.h>

#include "agent/sources/DnsProperties.h"
#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;
using testing::TemporaryDirectory;

constexpr const char* kNode = "/system/eth0/ip";

class WantedSettingsTest : public ::testing::Test {
 protected:
  WantedSettings read() { return readWanted(directory_.path(), "eth0", overlay_, kNode).value(); }

  TemporaryDirectory directory_;
  OverlayValues overlay_;
};

TEST_F(WantedSettingsTest, AreNoneWithoutAFileOrAnOverlay) { EXPECT_FALSE(read().any()); }

TEST_F(WantedSettingsTest, AreThoseOfTheFileForTheKeysThatItHas) {
  overlay_[kNode] = {{PROP_DNS_SERVER_ADDRESSES, share({"192.0.2.9"})},
                     {PROP_DNS_SUFFIXES, share({"overlay.example"})},
                     {PROP_DOMAIN_NAME, std::string("overlay.example")},
                     {PROP_HOST_NAME, std::string("host9")}};
  directory_.write("ifcfg-eth0",
                   "#DOMAINNAME=comment.example\nDNSSERVERS= 192.0.2.1  2001:db8::1\r\nDNSSERVERS=192.0.2.2\n"
                   "DNSSUFFIXES=\nXDOMAINNAME=other.example\n");
  const WantedSettings wanted = read();
  EXPECT_EQ(wanted.servers, (StringList{"192.0.2.1", "2001:db8::1"}));
  EXPECT_EQ(wanted.suffixes, StringList()) << "a key without a value is a list without elements";
  EXPECT_EQ(wanted.domain, "overlay.example");
}

TEST_F(WantedSettingsTest, AHostNameAloneIsNone) {
  overlay_[kNode] = {{PROP_HOST_NAME, std::string("host9")}};
  directory_.write("ifcfg-eth0", "HOSTNAME=host9\n");
  EXPECT_FALSE(read().any());
}

TEST_F(WantedSettingsTest, AFileThatCannotBeReadIsAnError) {
  directory_.write("ifcfg-eth0/file", "");
  const auto wanted = readWanted(directory_.path(), "eth0", overlay_, kNode);
  ASSERT_FALSE(wanted);
  EXPECT_EQ(wanted.error(), directory_ / "ifcfg-eth0: cannot be read: not a regular file");
}

struct Refused {
  const char* property;
  std::string value;
  const char* problem;
};

std::string problemOf(const Refused& refused) {
  WantedSettings wanted;
  const std::string property = refused.property;
  if (property == "servers") wanted.servers = StringList{"192.0.2.1", refused.value};
  if (property == "suffixes") wanted.suffixes = StringList{"lab.example", refused.value};
  if (property == "domain") wanted.domain = refused.value;
  const auto result = checked(wanted, "eth0");
  return result ? "nothing" : result.error();
}

TEST(HostileSettings, AreRefusedByPropertyWithTheValueInOneLine) {
  const std::string longName = std::string(64, 'a') + ".example";
  const std::vector<Refused> all{
      {"servers", "", "dns_server_addresses: '' is no IP address"},
      {"servers", "localhost", "dns_server_addresses: 'localhost' is no IP address"},
      {"servers", "192.0.2", "dns_server_addresses: '192.0.2' is no IP address"},
      {"servers", "192.0.2.1:53", "dns_server_addresses: '192.0.2.1:53' is no IP address"},
      {"servers", "192.0.2.1\nDNS=198.51.100.1",
       "dns_server_addresses: '192.0.2.1\\nDNS=198.51.100.1' is no IP address"},
      {"servers", std::string("192.0.2.1\0", 10), "dns_server_addresses: '192.0.2.1\\x00' is no IP address"},
      {"servers", "\x1B[31m", "dns_server_addresses: '\\x1b[31m' is no IP address"},
      {"servers", "0.0.0.0", "dns_server_addresses: '0.0.0.0' is no address of a host"},
      {"servers", "0.1.2.3", "dns_server_addresses: '0.1.2.3' is no address of a host"},
      {"servers", "::", "dns_server_addresses: '::' is no address of a host"},
      {"servers", "::ffff:0.0.0.0", "dns_server_addresses: '::ffff:0.0.0.0' is no address of a host"},
      {"servers", "224.0.0.251", "dns_server_addresses: '224.0.0.251' is no unicast address"},
      {"servers", "255.255.255.255", "dns_server_addresses: '255.255.255.255' is no unicast address"},
      {"servers", "ff02::fb", "dns_server_addresses: 'ff02::fb' is no unicast address"},
      {"servers", "::ffff:224.0.0.1", "dns_server_addresses: '::ffff:224.0.0.1' is no unicast address"},
      {"servers", "fe80::1%eth1", "dns_server_addresses: 'fe80::1%eth1' has another zone than the interface"},
      {"servers", "2001:db8::1%eth0",
       "dns_server_addresses: '2001:db8::1%eth0' has a zone, which only link-local addresses have"},
      {"suffixes", "", "dns_suffixes: '' is no DNS name"},
      {"suffixes", ".", "dns_suffixes: '.' is no DNS name"},
      {"suffixes", "~corp.example", "dns_suffixes: '~corp.example' is no DNS name"},
      {"suffixes", "a..example", "dns_suffixes: 'a..example' is no DNS name"},
      {"suffixes", "a\tb", "dns_suffixes: 'a\\tb' is no DNS name"},
      {"suffixes", "a.example\n[Network]", "dns_suffixes: 'a.example\\n[Network]' is no DNS name"},
      {"suffixes", "a.example\\", "dns_suffixes: 'a.example\\' is no DNS name"},
      {"suffixes", "*.example", "dns_suffixes: '*.example' is no DNS name"},
      {"suffixes", "b\xC3\xBC.example", "dns_suffixes: 'b\xC3\xBC.example' is no DNS name"},
      {"domain", "a b", "domain_name: 'a b' is no DNS name"},
      {"domain", "\"a.example\"", "domain_name: '\"a.example\"' is no DNS name"},
  };
  for (const Refused& refused : all) EXPECT_EQ(problemOf(refused), refused.problem);
  EXPECT_EQ(problemOf({"domain", longName, ""}), "domain_name: '" + longName + "' is no DNS name");
}

TEST(HostileSettings, EveryPropertyWithAProblemIsNamed) {
  WantedSettings wanted;
  wanted.servers = StringList{"here"};
  wanted.suffixes = StringList(65, "a.example");
  wanted.domain = "a b";
  EXPECT_EQ(checked(wanted, "eth0").error(),
            "dns_server_addresses: 'here' is no IP address; dns_suffixes: there are 65 values, and 64 at most can be "
            "applied; domain_name: 'a b' is no DNS name");
}

TEST(CheckedSettings, HaveEachValueOnceInItsUsualForm) {
  WantedSettings wanted;
  wanted.servers = StringList{"2001:DB8:0::1", "192.0.2.1", "2001:db8::1", "fe80::1", "FE80::1%eth0", "127.0.0.53"};
  wanted.suffixes = StringList{"Lab.example.", "lab.example", "xn--bcher-kva.example", "_x.example"};
  wanted.domain = "example.org.";
  const auto result = checked(wanted, "eth0");
  ASSERT_TRUE(result) << result.error();
  EXPECT_EQ(result->servers, (StringList{"2001:db8::1", "192.0.2.1", "fe80::1%eth0", "127.0.0.53"}));
  EXPECT_EQ(result->suffixes, (StringList{"Lab.example", "xn--bcher-kva.example", "_x.example"}));
  EXPECT_EQ(result->domain, "example.org");
  wanted.domain = "";
  EXPECT_EQ(checked(wanted, "eth0")->domain, "") << "no domain is no problem";
}

TEST(SearchList, BeginsWithTheDomain) {
  EXPECT_EQ(searchListOf({"a", "b"}, "", "own"), (StringList{"a", "b"}));
  EXPECT_EQ(searchListOf({"a", "b"}, "A", "own"), (StringList{"a", "b"}));
  EXPECT_EQ(searchListOf({"a", "b"}, "b", "own"), (StringList{"b", "a"}));
  EXPECT_EQ(searchListOf({"a", "b"}, "c", "own"), (StringList{"c", "a", "b"}));
  EXPECT_EQ(searchListOf({}, "c", "own"), (StringList{"c"}));
  EXPECT_EQ(searchListOf({}, "own", "own"), StringList());
  EXPECT_EQ(searchListOf({"a"}, "own", "own"), (StringList{"own", "a"}));
}

}  // namespace
}  // namespace zorva::agent
