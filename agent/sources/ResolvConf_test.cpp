#include "agent/sources/ResolvConf.h"

#include <gtest/gtest.h>

namespace zorva::agent {
namespace {

StringList serversIn(const std::string& text) { return parseResolvConf(text).servers; }
StringList searchIn(const std::string& text) { return parseResolvConf(text).search; }

TEST(ResolvConf, ServersAndSearchDomainsKeepTheirOrder) {
  const ResolvConf conf = parseResolvConf("nameserver 192.0.2.1\nsearch b.org a.org\nnameserver 2001:db8::1\n");
  EXPECT_EQ(conf.servers, (StringList{"192.0.2.1", "2001:db8::1"}));
  EXPECT_EQ(conf.search, (StringList{"b.org", "a.org"}));
  EXPECT_EQ(conf.domain, "");
}

TEST(ResolvConf, AnEmptyFileSaysNothing) {
  const ResolvConf conf = parseResolvConf("");
  EXPECT_TRUE(conf.servers.empty());
  EXPECT_TRUE(conf.search.empty());
}

TEST(ResolvConf, CommentsAreNoWords) {
  EXPECT_EQ(serversIn("# nameserver 192.0.2.1\n;nameserver 192.0.2.2\nnameserver 192.0.2.3 # the third\n"),
            (StringList{"192.0.2.3"}));
  EXPECT_EQ(searchIn("search a.org ; b.org\n"), (StringList{"a.org"}));
}

TEST(ResolvConf, LinesMayEndInCrLfOrInNothing) {
  EXPECT_EQ(serversIn("nameserver 192.0.2.1\r\nnameserver 192.0.2.2"), (StringList{"192.0.2.1", "192.0.2.2"}));
  EXPECT_EQ(searchIn("search a.org b.org\r\n"), (StringList{"a.org", "b.org"}));
}

TEST(ResolvConf, TabsPartWordsToo) { EXPECT_EQ(serversIn("nameserver\t 192.0.2.1\t\n"), (StringList{"192.0.2.1"})); }

TEST(ResolvConf, AKeywordCountsAtTheBeginningOfALineAlone) {
  EXPECT_TRUE(serversIn(" nameserver 192.0.2.1\nnameservers 192.0.2.2\nnameserver\nNameserver 192.0.2.3\n").empty());
}

TEST(ResolvConf, OfDomainAndSearchTheLastOneCounts) {
  const ResolvConf domainLast = parseResolvConf("search a.org b.org\ndomain c.org\n");
  EXPECT_EQ(domainLast.search, (StringList{"c.org"}));
  EXPECT_EQ(domainLast.domain, "c.org");
  const ResolvConf searchLast = parseResolvConf("domain c.org\nsearch a.org b.org\n");
  EXPECT_EQ(searchLast.search, (StringList{"a.org", "b.org"}));
  EXPECT_EQ(searchLast.domain, "");
  EXPECT_EQ(searchIn("search a.org\nsearch b.org\n"), (StringList{"b.org"}));
}

TEST(ResolvConf, ASearchListOfTheRootIsEmpty) {
  EXPECT_TRUE(searchIn("search .\n").empty());
  EXPECT_EQ(parseResolvConf("domain .\n").domain, "");
}

TEST(ResolvConf, Ipv6AddressesKeepTheirZones) {
  EXPECT_EQ(serversIn("nameserver fe80::1%eth0\nnameserver FE80::2%3\n"), (StringList{"fe80::1%eth0", "FE80::2%3"}));
}

TEST(ResolvConf, WhatIsNoAddressIsPassedOver) {
  EXPECT_TRUE(serversIn("nameserver dns.example.org\nnameserver 192.0.2.300\nnameserver fe80::1%\n"
                        "nameserver 192.0.2.1%eth0\nnameserver 192.0.2.1#53\n")
                  .empty());
}

TEST(ResolvConf, MoreThanThreeServersAreAllListed) {
  EXPECT_EQ(
      serversIn("nameserver 192.0.2.1\nnameserver 192.0.2.2\nnameserver 192.0.2.3\nnameserver 192.0.2.4\n").size(), 4U);
}

TEST(ResolvConf, TheLocalStubIsRecognizedIfItIsTheOnlyServer) {
  EXPECT_TRUE(namesOnlyLocalStub(parseResolvConf("nameserver 127.0.0.53\n")));
  EXPECT_FALSE(namesOnlyLocalStub(parseResolvConf("nameserver 127.0.0.53\nnameserver 192.0.2.1\n")));
  EXPECT_FALSE(namesOnlyLocalStub(parseResolvConf("nameserver 127.0.0.1\n")));
  EXPECT_FALSE(namesOnlyLocalStub(parseResolvConf("")));
}

}  // namespace
}  // namespace zorva::agent
