#include "agent/sources/ResolvConf.h"

#include <arpa/inet.h>
#include <gtest/gtest.h>
#include <resolv.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <vector>

#include "agent/testing/DnsListeners.h"
#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/PrivateHostTest.h"
#include "agent/testing/TemporaryDirectory.h"
#include "agent/tree/IpAddress.h"

namespace zorva::agent {
namespace {

using testing::DnsListeners;

constexpr const char* kHost = "host1";

StringList serversIn(const std::string& text) { return parseResolvConf(text, kHost).servers; }
StringList searchIn(const std::string& text) { return parseResolvConf(text, kHost).search; }
StringList optionsIn(const std::string& text) { return parseResolvConf(text, kHost).options; }

const StringList kDefault{"127.0.0.1"};

TEST(ResolvConf, ServersAndSearchDomainsKeepTheirOrder) {
  const ResolvConf conf = parseResolvConf("nameserver 192.0.2.1\nsearch b.org a.org\nnameserver 2001:db8::1\n", kHost);
  EXPECT_EQ(conf.servers, (StringList{"192.0.2.1", "2001:db8::1"}));
  EXPECT_EQ(conf.search, (StringList{"b.org", "a.org"}));
  EXPECT_EQ(conf.domain, "");
}

TEST(ResolvConf, AnEmptyFileMeansTheHostItself) {
  EXPECT_EQ(serversIn(""), kDefault);
  EXPECT_TRUE(searchIn("").empty());
}

TEST(ResolvConf, WithoutSearchTheDomainOfTheHostsNameIsSearched) {
  const auto searchOf = [](const char* text, const char* name) { return parseResolvConf(text, name).search; };
  EXPECT_EQ(searchOf("", "host1.lab.example.org"), StringList{"lab.example.org"});
  EXPECT_EQ(searchOf("search \ndomain\n", "host1.example.org"), StringList{"example.org"}) << "they name nothing";
  EXPECT_EQ(searchOf("domain a.org\n", "host1.example.org"), StringList{"a.org"});
  EXPECT_TRUE(searchOf("search .\n", "host1.example.org").empty()) << "the root is searched, which appends nothing";
  EXPECT_TRUE(searchOf("", "host1.").empty());
}

TEST(ResolvConf, ALineThatBeginsLikeACommentIsOneAndNothingElse) {
  EXPECT_EQ(serversIn("# nameserver 192.0.2.1\n;nameserver 192.0.2.2\nnameserver 192.0.2.3 # the third\n"),
            (StringList{"192.0.2.3"}));
  EXPECT_EQ(searchIn("search a.org ; b.org\n"), (StringList{"a.org", ";", "b.org"}));
}

TEST(ResolvConf, ALineThatEndsInCrLfNamesNoServerAndNoDomain) {
  EXPECT_EQ(serversIn("nameserver 192.0.2.1\r\nnameserver 192.0.2.2"), StringList{"192.0.2.2"});
  EXPECT_EQ(serversIn("nameserver 192.0.2.1 \r\n"), StringList{"192.0.2.1"}) << "the return is a word of its own";
  EXPECT_EQ(searchIn("search a.org b.org\r\n"), StringList{"a.org"});
}

TEST(ResolvConf, TabsPartWordsToo) { EXPECT_EQ(serversIn("nameserver\t 192.0.2.1\t\n"), (StringList{"192.0.2.1"})); }

TEST(ResolvConf, AKeywordCountsAtTheBeginningOfALineAlone) {
  EXPECT_EQ(serversIn(" nameserver 192.0.2.1\nnameservers 192.0.2.2\nnameserver\nNameserver 192.0.2.3\n"), kDefault);
}

TEST(ResolvConf, OfDomainAndSearchTheLastOneCounts) {
  const ResolvConf domainLast = parseResolvConf("search a.org b.org\ndomain c.org d.org\n", kHost);
  EXPECT_EQ(domainLast.search, (StringList{"c.org"}));
  EXPECT_EQ(domainLast.domain, "c.org");
  const ResolvConf searchLast = parseResolvConf("domain c.org\nsearch a.org b.org\n", kHost);
  EXPECT_EQ(searchLast.search, (StringList{"a.org", "b.org"}));
  EXPECT_EQ(searchLast.domain, "");
  EXPECT_EQ(searchIn("search a.org\nsearch b.org\n"), (StringList{"b.org"}));
}

TEST(ResolvConf, AddressesMayHaveAnyFormAndAreShownInTheUsualOne) {
  EXPECT_EQ(serversIn("nameserver 127.0.72\nnameserver 0x7f.1\nnameserver 3221225985\n"),
            (StringList{"127.0.0.72", "127.0.0.1", "192.0.2.1"}));
  EXPECT_EQ(serversIn("nameserver 2001:DB8:0:0::1\n"), (StringList{"2001:db8::1"}));
}

TEST(ResolvConf, LinkLocalAddressesKeepTheirZones) {
  EXPECT_EQ(serversIn("nameserver fe80::1%eth0\nnameserver FE80::2%3\nnameserver fe80::3%\n"),
            (StringList{"fe80::1%eth0", "fe80::2%3", "fe80::3"}));
}

TEST(ResolvConf, WhatIsNoAddressIsPassedOver) {
  EXPECT_EQ(serversIn("nameserver dns.example.org\nnameserver 192.0.2.300\nnameserver 192.0.2.1%eth0\n"
                      "nameserver 192.0.2.1#53\n"),
            kDefault);
}

TEST(ResolvConf, ServersPastTheThirdAreNotAsked) {
  const ResolvConf conf = parseResolvConf(
      "nameserver 192.0.2.1\nnameserver 192.0.2.2\nnameserver 192.0.2.3\nnameserver 192.0.2.4\n", kHost);
  EXPECT_EQ(conf.servers, (StringList{"192.0.2.1", "192.0.2.2", "192.0.2.3"}));
  EXPECT_EQ(conf.notAsked, (StringList{"192.0.2.4"}));
}

TEST(ResolvConf, WhatAFileCanMakeItKeepIsBounded) {
  std::string text = "search";
  for (int i = 0; i < 5000; ++i) text += " a" + std::to_string(i) + ".org";
  text += '\n';
  for (int i = 0; i < 5000; ++i) text += "nameserver 192.0.2.1\n";
  EXPECT_EQ(searchIn(text).size(), 256U);
  EXPECT_EQ(parseResolvConf(text, kHost).notAsked.size(), 256U);
}

TEST(ResolvConf, OptionsAreThoseThatTheResolverTakes) {
  EXPECT_EQ(optionsIn("options ndots:2 timeout:99 rotate unheard-of rotated\noptions ndots:3 edns0\r\n"),
            (StringList{"timeout:30", "rotate", "ndots:3", "edns0"}));
  EXPECT_EQ(optionsIn("options attempts:x single-request-reopen single-request\n"),
            (StringList{"attempts:0", "single-request-reopen", "single-request"}));
  EXPECT_TRUE(optionsIn("options\noptions ndots:-1 -rotate\n").empty());
}

TEST(ResolvConf, TheLocalStubIsKnownWhereItStandsAlone) {
  const auto isStub = [](const char* text) { return namesOnlyLocalStub(parseResolvConf(text, kHost)); };
  EXPECT_TRUE(isStub("nameserver 127.0.0.53\n"));
  EXPECT_FALSE(isStub("nameserver 127.0.0.53\nnameserver 192.0.2.1\n"));
  EXPECT_FALSE(isStub("nameserver 127.0.0.1\n"));
  EXPECT_FALSE(isStub(""));
}

// What the C library makes of /etc/resolv.conf.

struct Resolver : __res_state {
  Resolver() : __res_state{} {
    if (::res_ninit(this) != 0) throw std::runtime_error("the resolver cannot be started");
  }
  ~Resolver() { ::res_nclose(this); }
};

StringList serversOf(const Resolver& resolver) {
  StringList servers;
  for (int i = 0; i < resolver.nscount; ++i) {
    const sockaddr_in6* ipv6 = resolver._u._ext.nsaddrs[i];
    const bool isIPv6 = ipv6 != nullptr && ipv6->sin6_family == AF_INET6;
    const auto* bytes =
        isIPv6 ? ipv6->sin6_addr.s6_addr : reinterpret_cast<const unsigned char*>(&resolver.nsaddr_list[i].sin_addr);
    servers.push_back(textOfAddress({bytes, bytes + (isIPv6 ? sizeof(in6_addr) : sizeof(in_addr))}));
  }
  return servers;
}

StringList searchOf(const Resolver& resolver) {
  StringList search;
  for (char* const* domain = resolver.dnsrch; *domain != nullptr; ++domain) search.emplace_back(*domain);
  return search;
}

StringList optionsOf(const Resolver& resolver) {
  StringList options;
  const auto add = [&](const char* prefix, int number, int usual) {
    if (number != usual) options.push_back(prefix + std::to_string(number));
  };
  add("attempts:", resolver.retry, RES_DFLRETRY);
  add("ndots:", static_cast<int>(resolver.ndots), 1);
  add("timeout:", resolver.retrans, RES_TIMEOUT);
  if ((resolver.options & RES_ROTATE) != 0) options.emplace_back("rotate");
  if ((resolver.options & RES_USE_EDNS0) != 0) options.emplace_back("edns0");
  if ((resolver.options & RES_SNGLKUP) != 0) options.emplace_back("single-request");
  if ((resolver.options & RES_SNGLKUPREOP) != 0) options.emplace_back("single-request-reopen");
  std::sort(options.begin(), options.end());
  return options;
}

constexpr std::array kFiles{
    "",
    "nameserver 192.0.2.1\nnameserver 192.0.2.2\nnameserver 192.0.2.3\nnameserver 192.0.2.4\n",
    "nameserver 127.0.72\nnameserver 0x7f.1\nnameserver 3221225985\n",
    "nameserver 192.0.2.1\r\nnameserver 192.0.2.2 \r\nnameserver\t2001:DB8::1\t \n",
    "nameserver 192.0.2.300\nnameserver 192.0.2.1#53\nnameserver 192.0.2.1%lo\nnameserver 2001:db8::2%\n",
    " nameserver 192.0.2.1\nNameserver 192.0.2.2\nnameservers 192.0.2.3\nnameserver\n",
    "# nameserver 192.0.2.1\n;nameserver 192.0.2.2\nnameserver 192.0.2.3 # the third",
    "nameserver 192.0.2.1\v\nnameserver 010.0.0.1\nnameserver 1.2.3\n",
    "search a.org b.org\ndomain c.org d.org\n",
    "domain c.org\nsearch a.org ; b.org # c.org\n",
    "search\ndomain \n",
    "search a.org\nsearch \n",
    "options ndots:2 rotate timeout:7 attempts:4\n",
    "options ndots:99 timeout:99 attempts:99 rotated\noptions ndots:3\n",
    "options ndots:+4 edns0 timeout:9x\r\noptions\tsingle-request\n",
    "options single-request-reopen\nOptions rotate\n options rotate\n",
};

TEST(ResolvConf, TheCLibraryMakesTheSameOfEachFile) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(testing::succeedsOnPrivateHost([] {
    for (const std::string name : {"host1.lab.example.org", "host1"}) {
      ::sethostname(name.data(), name.size());
      for (const char* file : kFiles) {
        testing::writeFile("/etc/resolv.conf", file);
        const Resolver resolver;
        ResolvConf conf = parseResolvConf(file, name);
        std::sort(conf.options.begin(), conf.options.end());
        EXPECT_EQ(conf.servers, serversOf(resolver)) << file;
        EXPECT_EQ(conf.search, searchOf(resolver)) << file;
        EXPECT_EQ(conf.options, optionsOf(resolver)) << file;
      }
    }
    return true;
  }));
}

bool resolverAsksWhoIsShown() {
  const StringList hosts{"192.0.2.1", "192.0.2.2", "192.0.2.3", "192.0.2.4"};
  testing::Interfaces interfaces;
  for (const std::string& host : hosts) interfaces.addAddress("lo", host, 32);
  testing::writeFile("/etc/nsswitch.conf", "hosts: dns\n");
  StringList addresses = hosts;
  for (const char* local : {"127.0.0.1", "127.0.0.72"}) addresses.emplace_back(local);
  for (const std::string file :
       {"nameserver 192.0.2.4\nnameserver 192.0.2.2\nnameserver 192.0.2.1\nnameserver 192.0.2.3\n", "",
        "nameserver 127.0.72\n", "nameserver 192.0.2.1\r\nnameserver 192.0.2.2\n"}) {
    testing::writeFile("/etc/resolv.conf", file);
    DnsListeners listeners(addresses, DnsListeners::kServerFailure);
    listeners.lookUp("name.example.");
    EXPECT_EQ(listeners.asked, serversIn(file)) << file;
  }
  return true;
}

TEST(ResolvConf, TheServersThatAreShownAreThoseThatAreAsked) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(testing::succeedsOnPrivateHost(resolverAsksWhoIsShown));
}

bool resolverTriesTheSuffixesThatAreShown() {
  testing::writeFile("/etc/nsswitch.conf", "hosts: dns\n");
  const std::string hostName = "host1.lab.example.org";
  ::sethostname(hostName.data(), hostName.size());
  for (const std::string file : {"", "search a.org b.org\n", "domain c.org\n", "search a.org\ndomain c.org d.org\n",
                                 "search a.org b.org c.org d.org e.org f.org g.org h.org\n"}) {
    testing::writeFile("/etc/resolv.conf", file);
    DnsListeners listeners({"127.0.0.1"}, DnsListeners::kNoSuchName);
    listeners.lookUp("name");
    StringList expected;
    for (const std::string& suffix : parseResolvConf(file, hostName).search) expected.push_back("name." + suffix);
    expected.emplace_back("name");
    EXPECT_EQ(listeners.names, expected) << file;
  }
  return true;
}

TEST(ResolvConf, TheSuffixesThatAreShownAreThoseThatAreTried) {
  ZORVAGENT_NEEDS_PRIVATE_HOST();
  EXPECT_TRUE(testing::succeedsOnPrivateHost(resolverTriesTheSuffixesThatAreShown));
}

struct Replacement {
  const char* before;
  std::optional<StringList> servers;
  std::optional<StringList> search;
  const char* after;
};

TEST(ResolvConf, ReplacedListsLeaveTheOtherLinesAsTheyAre) {
  const std::vector<Replacement> replacements{
      {"", StringList{"192.0.2.1"}, StringList{"a.org"}, "search a.org\nnameserver 192.0.2.1\n"},
      {"# a\nnameserver 1.1.1.1\noptions rotate\nnameserver 2.2.2.2\n; b\r\n",
       StringList{"192.0.2.1", "192.0.2.2"},
       {},
       "# a\nnameserver 192.0.2.1\nnameserver 192.0.2.2\noptions rotate\n; b\r\n"},
      {"search a.org\nnameserver 1.1.1.1\r\ndomain b.org",
       {},
       StringList{"c.org", "d.org"},
       "search c.org d.org\nnameserver 1.1.1.1\r\n"},
      {"options rotate", StringList{"192.0.2.1"}, {}, "options rotate\nnameserver 192.0.2.1\n"},
      {"nameserver 1.1.1.1\nsearch a.org\n", StringList{}, StringList{}, "search .\n"},
      {"nameserver 1.1.1.1\nx", {}, {}, "nameserver 1.1.1.1\nx"},
      {" nameserver 1.1.1.1\nsearchx\n", StringList{}, {}, " nameserver 1.1.1.1\nsearchx\n"}};
  for (const Replacement& replacement : replacements) {
    EXPECT_EQ(replaceInResolvConf(replacement.before, replacement.servers, replacement.search), replacement.after);
  }
}

}  // namespace
}  // namespace zorva::agent
