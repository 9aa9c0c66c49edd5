#include "agent/sources/HostNames.h"

#include <gtest/gtest.h>

namespace zorva::agent {
namespace {

std::string domainOf(const std::string& nodeName, const std::string& hosts, const std::string& resolvConf = "") {
  return findHostNames(nodeName, hosts, parseResolvConf(resolvConf, nodeName)).domain;
}

TEST(HostNames, AWholeNodeNameIsSplitAtItsFirstDot) {
  const HostNames names =
      findHostNames("host1.lab.example.org", "", parseResolvConf("domain other.org\n", "host1.lab.example.org"));
  EXPECT_EQ(names.host, "host1");
  EXPECT_EQ(names.domain, "lab.example.org");
}

TEST(HostNames, TheCanonicalNameInHostsGivesTheDomain) {
  EXPECT_EQ(domainOf("host1", "127.0.0.1 localhost\n127.0.1.1 host1.example.org host1\n"), "example.org");
  EXPECT_EQ(domainOf("host1", "192.0.2.1 HOST1.example.org # me\r\n"), "example.org");
  EXPECT_EQ(domainOf("host1", "192.0.2.1\twww.example.org\thost1\n"), "example.org");
}

TEST(HostNames, OtherHostsAndLocalhostDoNotGiveTheDomain) {
  EXPECT_EQ(domainOf("host1", "192.0.2.1 host2.example.org host2\n192.0.2.2 host10.example.org\n"), "");
  EXPECT_EQ(domainOf("host1", "127.0.0.1 localhost.localdomain localhost host1\n"), "");
  EXPECT_EQ(domainOf("host1", "127.0.1.1 host1\n127.0.1.1\n\n# 127.0.1.1 host1.example.org\n"), "");
}

TEST(HostNames, AFirstLineWithoutDomainDoesNotHideALaterOneWithOne) {
  EXPECT_EQ(domainOf("host1", "127.0.1.1 host1\n192.0.2.1 host1.example.org\n"), "example.org");
}

TEST(HostNames, HostsGoesBeforeResolvConf) {
  EXPECT_EQ(domainOf("host1", "192.0.2.1 host1.example.org\n", "domain other.org\n"), "example.org");
}

TEST(HostNames, ResolvConfGivesTheDomainLast) {
  EXPECT_EQ(domainOf("host1", "", "domain example.org\n"), "example.org");
  EXPECT_EQ(domainOf("host1", "", "search first.org second.org\n"), "first.org");
  EXPECT_EQ(domainOf("host1", "", ""), "");
}

TEST(HostNames, AnEmptyNodeNameHasNoDomain) { EXPECT_EQ(domainOf("", "192.0.2.1 x.example.org\n"), ""); }

}  // namespace
}  // namespace zorva::agent
