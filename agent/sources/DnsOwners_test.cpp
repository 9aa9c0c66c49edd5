#include "agent/sources/DnsOwners.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <thread>

#include "agent/testing/LogLines.h"
#include "agent/testing/NetworkNamespace.h"
#include "agent/testing/ObservedOwners.h"
#include "agent/testing/PrivateHostTest.h"
#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent {
namespace {

using namespace testing;

class Owners : public PrivateHostTest {};

bool resolvedIsShown() {
  makeCables();
  Daemons daemons;
  daemons.start("systemd-resolved");
  outputOf("resolvectl dns eth0 192.0.2.53 2001:db8::53 fe80::1 192.0.2.54:5353#dns.example.org");
  outputOf("resolvectl domain eth0 lan.example.org '~corp.example'; resolvectl default-route eth0 yes");
  Observer host;
  const DnsFacts& eth0 = host["eth0"];
  EXPECT_EQ(eth0.owner, "systemd-resolved");
  EXPECT_EQ(eth0.servers, (StringList{"192.0.2.53", "2001:db8::53", "fe80::1%eth0", "192.0.2.54"}));
  EXPECT_EQ(eth0.serversInFull.back(), "192.0.2.54:5353#dns.example.org");
  EXPECT_EQ(eth0.suffixes, StringList{"lan.example.org"});
  EXPECT_EQ(eth0.routingDomains, StringList{"corp.example"});
  EXPECT_EQ(eth0.defaultRoute, true);
  EXPECT_EQ(eth0.llmnr, "yes");
  outputOf("resolvectl llmnr eth0 no");
  EXPECT_EQ(host["eth0"].llmnr, "no");
  outputOf("resolvectl dns eth0 192.0.2.9");
  EXPECT_EQ(host["eth0"].servers, StringList{"192.0.2.9"});
  outputOf("resolvectl revert eth0");
  EXPECT_FALSE(host["eth0"].saysAnything());
  return true;
}

TEST_F(Owners, ResolvedIsShownAndItsChangesAreNoticed) { EXPECT_TRUE(succeedsOnHostWithDaemons(resolvedIsShown)); }

bool comingAndGoingIsNoticed() {
  makeCables();
  Observer host;
  EXPECT_FALSE(host["eth0"].saysAnything());
  EXPECT_FALSE(host.owners().changed()) << "without a bus nothing changes";
  Daemons daemons;
  EXPECT_FALSE(host["eth0"].saysAnything());
  daemons.start("systemd-resolved");
  outputOf("resolvectl dns eth0 192.0.2.53");
  // The bus came after the first look: whoever watches its socket looks again then.
  host.lookAgain();
  EXPECT_EQ(host["eth0"].servers, StringList{"192.0.2.53"});
  daemons.stop("systemd-resolved");
  EXPECT_TRUE(soon([&] { return !host["eth0"].saysAnything(); }));
  daemons.start("systemd-resolved");
  EXPECT_TRUE(soon([&] { return host["eth0"].servers == StringList{"192.0.2.53"}; })) << "it kept the setting in /run";
  daemons.stop("dbus-daemon");
  EXPECT_TRUE(soon([&] { return !host["eth0"].saysAnything(); }));
  return true;
}

TEST_F(Owners, ComingGoingAndRestartsAreNoticed) { EXPECT_TRUE(succeedsOnHostWithDaemons(comingAndGoingIsNoticed)); }

bool frozenOneIsWaitedForOnce() {
  using Clock = std::chrono::steady_clock;
  makeCables();
  Daemons daemons;
  for (const char* name : {"systemd-resolved", "systemd-networkd"}) daemons.start(name);
  outputOf("resolvectl dns eth0 192.0.2.53");
  Observer host;
  EXPECT_EQ(host["eth0"].servers, StringList{"192.0.2.53"});

  LogLines log;
  outputOf("resolvectl dns eth0 192.0.2.99");
  daemons.freeze("systemd-resolved");
  const Clock::time_point start = Clock::now();
  EXPECT_EQ(host["eth0"].servers, StringList{"192.0.2.53"}) << "what was known holds";
  const Clock::time_point middle = Clock::now();
  Interfaces().addBridge("br0");  // a reason to look again
  host.lookAgain();
  EXPECT_EQ(host["eth0"].servers, StringList{"192.0.2.53"});
  EXPECT_GE(middle - start, DnsOwners::kLongestWait);
  EXPECT_LT(Clock::now() - middle, middle - start) << "it is not waited for again";
  EXPECT_EQ(log.lines.size(), 1U) << log.lines.back();
  EXPECT_NE(log.lines.front().find("no answer within 250 ms from systemd-resolved;"), std::string::npos);

  daemons.thaw("systemd-resolved");
  EXPECT_TRUE(soon([&] { return host["eth0"].servers == StringList{"192.0.2.99"}; }));
  return true;
}

TEST_F(Owners, OneThatHangsIsWaitedForOnceAndBelievedMeanwhile) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(frozenOneIsWaitedForOnce));
}

bool frozenBusIsWaitedForOnce() {
  makeCables();
  Daemons daemons;
  daemons.start("systemd-resolved");
  outputOf("resolvectl dns eth0 192.0.2.53");
  daemons.freeze("dbus-daemon");
  LogLines log;
  Observer host;
  for (int i = 0; i < 3; ++i) {
    EXPECT_FALSE(host["eth0"].saysAnything());
    host.lookAgain();
  }
  EXPECT_EQ(log.lines.size(), 1U);
  daemons.thaw("dbus-daemon");
  EXPECT_TRUE(soon([&] { return host["eth0"].servers == StringList{"192.0.2.53"}; }));
  return true;
}

TEST_F(Owners, ABusThatHangsIsWaitedForOnce) { EXPECT_TRUE(succeedsOnHostWithDaemons(frozenBusIsWaitedForOnce)); }

std::size_t openDescriptors() {
  const std::filesystem::directory_iterator all("/proc/self/fd");
  return static_cast<std::size_t>(std::distance(begin(all), end(all)));
}

bool forkedProcessHasItsOwnConnection() {
  makeCables();
  Daemons daemons;
  daemons.start("systemd-resolved");
  outputOf("resolvectl dns eth0 192.0.2.53");
  Observer host;
  EXPECT_EQ(host["eth0"].servers, StringList{"192.0.2.53"});
  const std::size_t before = openDescriptors();
  EXPECT_TRUE(succeedsInChild([&] {
    host.owners().reopen();
    const bool closed = openDescriptors() == before - 1;
    host.lookAgain();
    const bool read = host["eth0"].servers == StringList{"192.0.2.53"};
    outputOf("resolvectl dns eth0 192.0.2.99");
    return closed && read && host["eth0"].servers == StringList{"192.0.2.99"};
  }));
  EXPECT_EQ(host["eth0"].servers, StringList{"192.0.2.99"}) << "the child took no report from its parent";
  return outputOf("true; exec ls -l /proc/self/fd").find("socket") == std::string::npos;
}

TEST_F(Owners, AForkedProcessHasItsOwnConnectionAndNoOtherProgramHasOne) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(forkedProcessHasItsOwnConnection));
}

bool everybodyNoticesWhatIsNotSignalled() {
  makeCables();
  Daemons daemons;
  daemons.start("systemd-resolved");
  // Root changes what nobody watches the private directory for.
  const pid_t observer = startChild([] {
    if (::setresuid(65534, 65534, 65534) != 0) return false;
    Observer host;
    const bool before = host["eth0"].llmnr == "yes";
    std::ofstream("/tmp/looked") << "yes";
    return before && soon([&] { return host["eth0"].llmnr == "no"; });
  });
  EXPECT_TRUE(soon([] { return std::filesystem::exists("/tmp/looked"); }));
  outputOf("resolvectl llmnr eth0 no");
  return succeeded(observer);
}

TEST_F(Owners, ChangesWithoutASignalAreNoticedByProcessesWithoutRights) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(everybodyNoticesWhatIsNotSignalled));
}

bool everyNameIsTheRoot() {
  makeCables();
  Daemons daemons;
  daemons.start("NetworkManager");
  outputOf(
      "nmcli connection add type ethernet ifname eth0 con-name lan ipv4.method manual ipv4.addresses 192.0.2.10/24 "
      "ipv4.dns 192.0.2.53 ipv4.dns-search '~.' ipv6.method disabled && nmcli connection up lan");
  Observer host;
  return soon([&] { return host["eth0"].routingDomains == StringList{"."}; });
}

TEST_F(Owners, ARoutingDomainForEveryNameIsShownAsTheRoot) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(everyNameIsTheRoot));
}

bool leasesAreLearned() {
  makeCables();
  Daemons daemons;
  writeFile("/etc/systemd/network/20-lan.network",
            "[Match]\nName=eth0\n[Network]\nDHCP=ipv4\n[DHCPv4]\nUseDomains=yes\n");
  makeLeases(daemons);
  Observer host;
  EXPECT_TRUE(soon([&] { return host["eth0"].servers == StringList{"192.0.2.53"}; }));
  EXPECT_EQ(host["eth0"].origin, DnsOrigin::Learned);
  EXPECT_EQ(host["eth0"].profile, "/etc/systemd/network/20-lan.network");
  std::filesystem::remove("/etc/systemd/network/20-lan.network");
  outputOf("networkctl reload");
  EXPECT_TRUE(soon([&] { return !host["eth0"].saysAnything(); }));

  daemons.start("NetworkManager");
  outputOf("nmcli connection add type ethernet ifname eth0 con-name lan ipv6.method disabled");
  outputOf("nmcli connection up lan");
  EXPECT_TRUE(soon([&] { return host["eth0"].owner == "NetworkManager" && !host["eth0"].servers.empty(); }));
  EXPECT_EQ(host["eth0"].origin, DnsOrigin::Learned);
  EXPECT_EQ(host["eth0"].domain, "lease.example");
  outputOf("nmcli connection modify lan ipv4.dns 192.0.2.9 && nmcli connection up lan");
  EXPECT_TRUE(soon([&] { return host["eth0"].servers.size() == 2; }));
  EXPECT_EQ(host["eth0"].origin, DnsOrigin::Mixed);
  return true;
}

TEST_F(Owners, WhatALeaseBringsIsLearned) { EXPECT_TRUE(succeedsOnHostWithDaemons(leasesAreLearned)); }

}  // namespace
}  // namespace zorva::agent
