// Owners that say what they should not: what is wrong is left out, and the rest holds.
#include <gtest/gtest.h>
#include <net/if.h>
#include <unistd.h>

#include <array>
#include <string>

#include "agent/sources/BusNames.h"
#include "agent/sources/DnsOwners.h"
#include "agent/testing/FakeDaemon.h"
#include "agent/testing/LogLines.h"
#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/PrivateHostTest.h"
#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent {
namespace {

using namespace testing;

class HostileOwners : public PrivateHostTest {};

// What comes of an owner's answer for the interface eth0, in a process of its own host.
struct Outcome {
  DnsFacts facts;
  StringList log;
};

Outcome outcomeOf(const std::string& busName, const FakeDaemon::Answer& answer) {
  Daemons daemons;
  const FakeDaemon fake(busName, answer);
  Interfaces interfaces;
  interfaces.addBridge("eth0");
  Outcome outcome;
  const LogLines log;
  const std::vector<Link> links = LinkReader().read().links;
  DnsOwners owners("");
  owners.look(links);
  // A long answer may take longer than one look waits.
  for (int turn = 0; turn < 3000 && log.lines.size() == 1 && log.lines.front().starts_with("no answer"); ++turn) {
    ::usleep(10000);
    owners.look(links);
  }
  for (const Link& link : links) {
    if (link.name == "eth0") outcome.facts = owners.factsOf(link);
  }
  outcome.log = log.lines;
  return outcome;
}

int indexOfEth0() { return static_cast<int>(::if_nametoindex("eth0")); }

// A server of eth0 with as many bytes of address as are asked for.
void addServer(sd_bus_message* message, std::size_t bytes, const char* name = "") {
  const std::array<unsigned char, 64> address{192, 0, 2, 53};
  ::sd_bus_message_open_container(message, 'r', "iiayqs");
  ::sd_bus_message_append(message, "ii", indexOfEth0(), 2);
  ::sd_bus_message_append_array(message, 'y', address.data(), bytes);
  ::sd_bus_message_append(message, "qs", 0, name);
  ::sd_bus_message_close_container(message);
}

// Properties of the manager; fill adds the servers.
template <typename Fill>
int answerServers(sd_bus_message* message, Fill fill) {
  ::sd_bus_message_open_container(message, 'a', "{sv}");
  ::sd_bus_message_open_container(message, 'e', "sv");
  ::sd_bus_message_append(message, "s", "DNSEx");
  ::sd_bus_message_open_container(message, 'v', "a(iiayqs)");
  ::sd_bus_message_open_container(message, 'a', "(iiayqs)");
  fill();
  for (int level = 0; level < 4; ++level) ::sd_bus_message_close_container(message);
  return 0;
}

bool wrongServersAreLeftOut() {
  const Outcome outcome = outcomeOf(kResolvedService, [](sd_bus_message* answer, const std::string&) {
    return answerServers(answer, [&] {
      for (const std::size_t bytes : {0U, 3U, 4U, 17U, 64U}) addServer(answer, bytes);
      addServer(answer, 4, "a\x1B[2J.example");
      addServer(answer, 4, std::string(300, 'x').c_str());
    });
  });
  EXPECT_EQ(outcome.facts.servers, StringList{"192.0.2.53"});
  EXPECT_FALSE(outcome.log.empty());
  return true;
}

TEST_F(HostileOwners, ServersThatAreNoneAreLeftOut) { EXPECT_TRUE(succeedsOnHostWithDaemons(wrongServersAreLeftOut)); }

bool tooManyAreCut() {
  const Outcome outcome = outcomeOf(kResolvedService, [](sd_bus_message* answer, const std::string&) {
    return answerServers(answer, [&] {
      for (int i = 0; i < 20000; ++i) addServer(answer, 4);
    });
  });
  EXPECT_EQ(outcome.facts.servers.size(), kMostDnsValues);
  EXPECT_LE(outcome.log.size(), 2U) << "not a line for each";
  return true;
}

TEST_F(HostileOwners, TooManyServersAreCut) { EXPECT_TRUE(succeedsOnHostWithDaemons(tooManyAreCut)); }

bool wrongDomainsAreLeftOut() {
  const Outcome outcome = outcomeOf(kResolvedService, [](sd_bus_message* answer, const std::string&) {
    const int eth0 = indexOfEth0();
    return ::sd_bus_message_append(answer, "a{sv}", 2, "Domains", "a(isb)", 5, eth0, "good.example", 0, eth0,
                                   "line\nfeed.example", 0, eth0, "", 0, eth0, "a..b", 1, eth0, "~.", 0,  //
                                   "LLMNR", "s", "\x1B[31m");
  });
  EXPECT_EQ(outcome.facts.suffixes, StringList{"good.example"});
  EXPECT_EQ(outcome.facts.llmnr, "");
  return true;
}

TEST_F(HostileOwners, DomainsThatAreNoneAreLeftOut) { EXPECT_TRUE(succeedsOnHostWithDaemons(wrongDomainsAreLeftOut)); }

// Answers of every other form than the right one.
bool otherFormsSayNothing() {
  for (const char* name : {kResolvedService, kNetworkManagerService, kNetworkdService}) {
    for (int form = 0; form < 6; ++form) {
      const Outcome outcome = outcomeOf(name, [form](sd_bus_message* answer, const std::string&) {
        if (form == 0) return -1;
        if (form == 1) return 0;  // nothing at all
        if (form == 2) return ::sd_bus_message_append(answer, "s", "{\"Interfaces\": [[[[[\"no link\"]]]]]}");
        if (form == 3) return ::sd_bus_message_append(answer, "s", "no JSON");
        if (form == 4) return ::sd_bus_message_append(answer, "a{sv}", 2, "DNSEx", "s", "text", "Domains", "b", 1);
        return ::sd_bus_message_append(answer, "a{oa{sa{sv}}}", 1, "/", 1, kNetworkManagerDevice, 3, "Interface", "s",
                                       "eth0", "Managed", "s", "yes", "Ip4Config", "o", "/none");
      });
      EXPECT_FALSE(outcome.facts.saysAnything()) << name << ' ' << form;
      Interfaces().remove("eth0");
    }
  }
  return true;
}

TEST_F(HostileOwners, AnswersOfAnotherFormSayNothing) { EXPECT_TRUE(succeedsOnHostWithDaemons(otherFormsSayNothing)); }

bool wrongProfileIsLeftOut() {
  const Outcome outcome = outcomeOf(kNetworkManagerService, [](sd_bus_message* answer, const std::string& method) {
    if (method != "GetManagedObjects") return -1;
    const std::string prefix = "org.freedesktop.NetworkManager.";
    return ::sd_bus_message_append(
        answer, "a{oa{sa{sv}}}", 3,  //
        "/d", 1, (prefix + "Device").c_str(), 4, "Interface", "s", "eth0", "Managed", "b", 1, "ActiveConnection", "o",
        "/a", "Ip4Config", "o", "/i",                                                                          //
        "/a", 1, (prefix + "Connection.Active").c_str(), 2, "Id", "s", "line\nfeed", "Connection", "o", "/p",  //
        "/i", 1, (prefix + "IP4Config").c_str(), 2, "NameserverData", "aa{sv}", 2, 1, "address", "s", "no address", 1,
        "address", "s", "192.0.2.53", "Searches", "as", 2, "~corp.example", "\x7F");
  });
  EXPECT_EQ(outcome.facts.owner, "NetworkManager");
  EXPECT_EQ(outcome.facts.profile, "");
  EXPECT_EQ(outcome.facts.servers, StringList{"192.0.2.53"});
  EXPECT_EQ(outcome.facts.routingDomains, StringList{"corp.example"});
  EXPECT_TRUE(outcome.facts.suffixes.empty());
  EXPECT_EQ(outcome.facts.origin, DnsOrigin::Unknown) << "its profile is not shown to everybody";
  return true;
}

TEST_F(HostileOwners, AProfileNameWithControlCharactersIsLeftOut) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(wrongProfileIsLeftOut));
}

// Sends every connection of the bus a signal like those of systemd-resolved: no rule of the receiver's holds that up.
bool sendFalseSignals() {
  sd_bus* bus = nullptr;
  char** names = nullptr;
  if (::sd_bus_open_system(&bus) < 0 || ::sd_bus_list_names(bus, &names, nullptr) < 0) return false;
  for (char** name = names; *name != nullptr; ++name) {
    sd_bus_message* signal = nullptr;
    ::sd_bus_message_new_signal(bus, &signal, kResolvedPath, kBusProperties, "PropertiesChanged");
    ::sd_bus_message_append(signal, "sa{sv}as", kResolvedManager, 0, 0);
    ::sd_bus_message_set_destination(signal, *name);
    ::sd_bus_send(bus, signal, nullptr);
    ::sd_bus_message_unref(signal);
  }
  return ::sd_bus_flush(bus) >= 0 && ::sd_bus_get_name_creds(bus, kResolvedService, 0, nullptr) >= 0;
}

bool strangersSignalsAreIgnored() {
  Daemons daemons;
  daemons.start("systemd-resolved");
  const std::vector<Link> links = LinkReader().read().links;
  DnsOwners owners("");
  owners.look(links);
  owners.changed();
  owners.look(links);
  EXPECT_FALSE(owners.changed());
  EXPECT_TRUE(succeedsInChild(sendFalseSignals));
  EXPECT_FALSE(owners.changed());
  return true;
}

TEST_F(HostileOwners, SignalsOfStrangersAreIgnored) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(strangersSignalsAreIgnored));
}

TEST(Domains, AreNamesThatCanBeShown) {
  for (const char* good : {"example.org", "example.org.", ".", "_tcp.example", "xn--bcher-kva.example",
                           "b\xC3\xBC"
                           "cher.example"}) {
    EXPECT_TRUE(isDomain(good)) << good;
  }
  const std::string longLabel(64, 'x');
  for (const std::string& bad :
       {std::string(), std::string("~."), std::string(".."), std::string(".a"), std::string("a..b"), std::string("a b"),
        std::string("a\nb"), std::string("a\0b", 3), longLabel, std::string("\xFF.example"),
        std::string("\xC2\x85.example"), std::string("a\r")}) {
    EXPECT_FALSE(isDomain(bad)) << bad;
  }
  std::string longest = "a";
  while (longest.size() < 253) longest += ".a";
  EXPECT_TRUE(isDomain(longest));
  EXPECT_FALSE(isDomain(longest + ".a"));
}

}  // namespace
}  // namespace zorva::agent
