#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <net/if.h>

#include <filesystem>

#include "agent/apply/Writers.h"
#include "agent/testing/ObservedOwners.h"
#include "agent/testing/PrivateHostTest.h"

namespace zorva::agent {
namespace {

using namespace testing;
using ::testing::AllOf;
using ::testing::HasSubstr;

class ResolvedWriter : public PrivateHostTest {};

constexpr const char* kSocket = "/run/dbus/system_bus_socket";

// systemd-resolved, and a writer.
class Host {
 public:
  Host() {
    makeCables();
    daemons.start("systemd-resolved");
  }

  DnsTarget target() {
    const DnsFacts& facts = owners["eth0"];
    return {"eth0", static_cast<int>(::if_nametoindex("eth0")), "", facts.serversInFull, facts.routingDomains};
  }

  std::string refusalOf(const DnsSettings& settings) {
    const auto result = writer->write(target(), settings);
    return result ? "nothing is refused" : result.error();
  }

  Daemons daemons;
  Observer owners;
  BusCalls bus{kSocket, std::chrono::seconds(2)};
  std::unique_ptr<DnsWriter> writer = makeResolvedWriter(bus);
};

std::string shown() { return outputOf("resolvectl dns eth0; resolvectl domain eth0; resolvectl dnsovertls eth0"); }

bool aChangeIsShown() {
  Host host;
  outputOf(
      "resolvectl dns eth0 192.0.2.53:5353#dns.example.org 2001:db8::53 192.0.2.54; resolvectl dnsovertls eth0 yes; "
      "resolvectl domain eth0 Lan.example '~corp.example' '~other.example' '~.'");
  const std::string before = shown();
  const auto saved = host.writer->save(host.target());
  EXPECT_TRUE(saved) << saved.error();
  const DnsSettings wanted{{"198.51.100.1", "fe80::1%eth0", "192.0.2.53"}, {"other.example.", "lan.example"}};
  EXPECT_EQ(host.refusalOf(wanted), "nothing is refused");
  const DnsSettings held = host.writer->asHeld(wanted);
  const std::string after = shown();
  for (int turn = 0; turn < 2; ++turn) {
    const DnsFacts& eth0 = host.owners["eth0"];
    EXPECT_EQ(eth0.servers, held.servers);
    EXPECT_EQ(eth0.suffixes, held.suffixes);
    EXPECT_EQ(eth0.serversInFull.back(), "192.0.2.53:5353#dns.example.org") << "port and name stay";
    EXPECT_EQ(eth0.routingDomains, (StringList{"corp.example", "."})) << "but for the one that is a suffix now";
    EXPECT_EQ(eth0.dnsOverTls, "yes");
    EXPECT_THAT(after, AllOf(HasSubstr("198.51.100.1 fe80::1 192.0.2.53:5353#dns.example.org"),
                             HasSubstr("other.example lan.example ~corp.example ~.")));
    EXPECT_EQ(shown(), after);
    EXPECT_EQ(host.refusalOf(wanted), "nothing is refused") << "a second change to the same";
  }
  for (int turn = 0; turn < 2; ++turn) {
    const auto restored = host.writer->restore(host.target(), *saved);
    EXPECT_TRUE(restored) << restored.error();
    EXPECT_EQ(shown(), before);
  }
  return true;
}

TEST_F(ResolvedWriter, ChangesServersAndDomainsAndPutsThemBack) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(aChangeIsShown));
}

bool nothingComesBack() {
  Host host;
  outputOf("resolvectl dnsovertls eth0 opportunistic");
  const std::string before = shown();
  const auto saved = host.writer->save(host.target());
  EXPECT_EQ(host.refusalOf({{"192.0.2.1"}, {"a.example"}}), "nothing is refused");
  EXPECT_EQ(host.owners["eth0"].servers, StringList{"192.0.2.1"});
  EXPECT_TRUE(host.writer->restore(host.target(), *saved));
  EXPECT_FALSE(host.owners["eth0"].saysAnything());
  EXPECT_EQ(shown(), before) << "with the modes that were set by hand";
  return true;
}

TEST_F(ResolvedWriter, ALinkThatHadNothingHasNothingAgain) { EXPECT_TRUE(succeedsOnHostWithDaemons(nothingComesBack)); }

bool theNoteIsTrue() {
  Host host;
  EXPECT_EQ(host.writer->note(), "gone when the link goes or the host restarts: systemd-resolved has no file for it");
  EXPECT_EQ(host.refusalOf({{"192.0.2.1"}, {}}), "nothing is refused");
  host.daemons.stop("systemd-resolved");
  EXPECT_EQ(host.refusalOf({{"192.0.2.2"}, {}}),
            "eth0: systemd-resolved cannot be asked: org.freedesktop.resolve1 does not run; see 'systemctl status "
            "systemd-resolved'");
  host.daemons.start("systemd-resolved");
  EXPECT_TRUE(soon([&] { return host.owners["eth0"].servers == StringList{"192.0.2.1"}; })) << "a restart of its own";
  host.daemons.stop("systemd-resolved");
  std::filesystem::remove_all("/run/systemd/resolve");  // as when the host restarts
  host.daemons.start("systemd-resolved");
  return soon([&] { return !host.owners["eth0"].saysAnything(); });
}

TEST_F(ResolvedWriter, AChangeLastsUntilTheHostRestarts) { EXPECT_TRUE(succeedsOnHostWithDaemons(theNoteIsTrue)); }

bool refusalsLeaveTheOldState() {
  Host host;
  outputOf("resolvectl dns eth0 192.0.2.53; resolvectl domain eth0 lan.example");
  const std::string before = shown();
  EXPECT_THAT(host.refusalOf({{"192.0.2.1", "127.0.0.53"}, {"a.example"}}),
              HasSubstr("eth0: systemd-resolved does not take the settings: SetLinkDNS is refused: "));
  EXPECT_EQ(shown(), before);
  EXPECT_THAT(host.refusalOf({{"192.0.2.1"}, {"a..example"}}), HasSubstr("SetLinkDomains is refused: "));
  EXPECT_EQ(shown(), before) << "the servers are put back";
  EXPECT_EQ(host.refusalOf({{"fe80::1%tun1"}, {}}), "eth0: server fe80::1%tun1 is on another link; name it for tun1");
  host.daemons.freeze("systemd-resolved");
  const auto result = host.writer->write(host.target(), {{"192.0.2.1"}, {}});
  EXPECT_TRUE(!result && result.error().find("does not answer in time") != std::string::npos);
  host.daemons.thaw("systemd-resolved");
  EXPECT_EQ(shown(), before);
  writeFile("/etc/systemd/network/10-lan.network", "[Match]\nName=eth0\n[Network]\nDNS=192.0.2.7\n");
  host.daemons.start("systemd-networkd");
  EXPECT_TRUE(soon([&] { return host.refusalOf({{"192.0.2.1"}, {}}).find("is managed") != std::string::npos; }));
  return true;
}

TEST_F(ResolvedWriter, ARefusalLeavesTheOldState) { EXPECT_TRUE(succeedsOnHostWithDaemons(refusalsLeaveTheOldState)); }

}  // namespace
}  // namespace zorva::agent
