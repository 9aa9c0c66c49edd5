#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <net/if.h>
#include <sys/mount.h>
#include <unistd.h>

#include <filesystem>
#include <sstream>

#include "agent/apply/Writers.h"
#include "agent/testing/FakeDaemon.h"
#include "agent/testing/ObservedOwners.h"
#include "agent/testing/PrivateHostTest.h"
#include "agent/testing/TemporaryDirectory.h"

namespace zorva::agent {
namespace {

using namespace testing;
using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;

class NetworkManagerWriter : public PrivateHostTest {};

constexpr const char* kSocket = "/run/dbus/system_bus_socket";
constexpr const char* kProfiles = "/etc/NetworkManager/system-connections/";

// A profile with settings of many types beside those of DNS.
constexpr const char* kLan =
    "[connection]\nid=lan\nuuid=11111111-1111-4111-8111-111111111111\ntype=ethernet\ninterface-name=eth0\n"
    "autoconnect=false\nautoconnect-priority=-7\n"
    "[ethernet]\nmtu=1400\nmac-address-blacklist=02:00:00:00:00:01;02:00:00:00:00:02;\n"
    "[ethtool]\nfeature-gro=true\n"
    "[ipv4]\nmethod=manual\naddress1=192.0.2.10/24,192.0.2.1\nroute1=198.51.100.0/24,192.0.2.2,50\n"
    "route1_options=mtu=1200,table=100\nrouting-rule1=priority 5 from 192.0.2.5/32 table 100\n"
    "dns=192.0.2.53#dns.example.org;192.0.2.54;\ndns-options=timeout:3;\ndns-priority=20\n"
    "dns-search=lan.example.org;~corp.example;\n"
    "[ipv6]\nmethod=manual\naddress1=2001:db8::10/64\ndns=2001:db8::53;\ndns-search=six.example;~.;\n"
    "[proxy]\nmethod=1\npac-url=http://example.org/proxy.pac\n"
    "[user]\norg.example.note=left alone\n";

// NetworkManager with a profile that is active on eth0, and a writer.
class Host {
 public:
  explicit Host(const std::string& profile = kLan) : profile_(std::string(kProfiles) + "lan.nmconnection") {
    makeCables();
    writeFile(profile_, profile);
    std::filesystem::permissions(profile_, std::filesystem::perms(0600));
    daemons.start("NetworkManager");
    // So that the file has the form that NetworkManager gives it.
    outputOf("nmcli connection modify lan connection.id lan && nmcli connection up lan");
  }

  DnsTarget target(const std::string& interface = "eth0") {
    const DnsFacts& facts = owners[interface];
    const auto index = static_cast<int>(::if_nametoindex(interface.c_str()));
    return {interface, index, facts.profile, facts.serversInFull, facts.routingDomains};
  }

  std::string refusalOf(const DnsSettings& settings, const std::string& interface = "eth0") {
    const auto result = writer->write(target(interface), settings);
    return result ? "nothing is refused" : result.error();
  }

  bool shows(const StringList& servers, const StringList& suffixes) {
    return soon([&] { return owners["eth0"].servers == servers && owners["eth0"].suffixes == suffixes; });
  }

  // Without the time of its last use, which NetworkManager writes into it at each change.
  std::string file() const { return without({"timestamp="}); }
  std::string fileWithoutDns() const { return without({"timestamp=", "dns=", "dns-search=", "ignore-auto-dns="}); }

  Daemons daemons;
  Observer owners;
  BusCalls bus{kSocket, std::chrono::seconds(5)};
  std::unique_ptr<DnsWriter> writer = makeNetworkManagerWriter(bus);

 private:
  std::string without(const StringList& beginnings) const {
    std::istringstream lines(contentsOf(profile_));
    std::string rest;
    for (std::string line; std::getline(lines, line);) {
      const bool isLeftOut = std::any_of(beginnings.begin(), beginnings.end(),
                                         [&](const std::string& beginning) { return line.starts_with(beginning); });
      if (!isLeftOut) rest += line + '\n';
    }
    return rest;
  }

  std::string profile_;
};

const DnsSettings kWanted{{"198.51.100.1", "2001:db8::99", "192.0.2.53"}, {"new.example", "lan.example.org"}};

bool aChangeIsShown() {
  Host host;
  const std::string before = host.file();
  const std::string others = host.fileWithoutDns();
  const DnsTarget target = host.target();
  EXPECT_EQ(target.routingDomains, (StringList{"corp.example", "."}));
  const auto saved = host.writer->save(target);
  EXPECT_TRUE(saved) << saved.error();
  EXPECT_EQ(host.refusalOf(kWanted), "nothing is refused");
  const DnsSettings held = host.writer->asHeld(kWanted);
  EXPECT_EQ(held.servers, (StringList{"198.51.100.1", "192.0.2.53", "2001:db8::99"}));
  EXPECT_TRUE(host.shows(held.servers, held.suffixes));
  EXPECT_EQ(host.owners["eth0"].origin, DnsOrigin::Static);
  EXPECT_EQ(host.owners["eth0"].routingDomains, target.routingDomains) << "routing-only domains stay";
  EXPECT_EQ(outputOf("nmcli --escape no --get-values IP4.DNS,IP6.DNS device show eth0"),
            "198.51.100.1 | 192.0.2.53\n2001:db8::99\n");
  EXPECT_THAT(host.file(), HasSubstr("dns=198.51.100.1;192.0.2.53#dns.example.org;")) << "the name of a server stays";
  EXPECT_EQ(host.fileWithoutDns(), others);
  const std::string changed = host.file();
  EXPECT_EQ(host.refusalOf(kWanted), "nothing is refused");
  EXPECT_EQ(host.file(), changed) << "a second change to the same";
  for (int turn = 0; turn < 2; ++turn) {
    const auto restored = host.writer->restore(host.target(), *saved);
    EXPECT_TRUE(restored) << restored.error();
    EXPECT_EQ(host.file(), before);
  }
  return host.shows({"192.0.2.53", "192.0.2.54", "2001:db8::53"}, {"lan.example.org", "six.example"});
}

TEST_F(NetworkManagerWriter, ChangesDnsAndNothingElseAndPutsItBack) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(aChangeIsShown));
}

bool aChangeOutlivesTheDaemon() {
  Host host;
  EXPECT_EQ(host.refusalOf({{"198.51.100.1"}, {}}), "nothing is refused");
  host.daemons.stop("NetworkManager");
  EXPECT_THAT(host.refusalOf(kWanted), HasSubstr("org.freedesktop.NetworkManager does not run"));
  EXPECT_THAT(host.file(), HasSubstr("dns=198.51.100.1;"));
  host.daemons.start("NetworkManager");
  outputOf("nmcli connection up lan");
  EXPECT_TRUE(host.shows({"198.51.100.1"}, {}));
  EXPECT_EQ(host.owners["eth0"].routingDomains, (StringList{"corp.example", "."}));
  return true;
}

TEST_F(NetworkManagerWriter, AChangeIsOnDisk) { EXPECT_TRUE(succeedsOnHostWithDaemons(aChangeOutlivesTheDaemon)); }

// NetworkManager gives no password to those who ask for a profile. Any connection may have these settings.
bool aPasswordStays() {
  std::string profile = kLan + std::string("[pppoe]\nusername=me\npassword=a secret\n");
  // NetworkManager 1.42 drops the password of such a profile at any change, by nmcli too.
  const std::string ethtool = "[ethtool]\nfeature-gro=true\n";
  profile.erase(profile.find(ethtool), ethtool.size());
  Host host(profile);
  EXPECT_EQ(outputOf("busctl call org.freedesktop.NetworkManager /org/freedesktop/NetworkManager/Settings/1 "
                     "org.freedesktop.NetworkManager.Settings.Connection GetSettings")
                .find("a secret"),
            std::string::npos);
  const auto saved = host.writer->save(host.target());
  EXPECT_TRUE(saved);
  EXPECT_EQ(saved->find("secret"), std::string::npos);
  EXPECT_EQ(host.refusalOf(kWanted), "nothing is refused");
  EXPECT_THAT(host.file(), AllOf(HasSubstr("dns=198.51.100.1;"), HasSubstr("password=a secret")));
  EXPECT_TRUE(host.writer->restore(host.target(), *saved));
  EXPECT_THAT(host.file(), AllOf(HasSubstr("192.0.2.54"), HasSubstr("password=a secret")));
  return true;
}

TEST_F(NetworkManagerWriter, KeepsPasswords) { EXPECT_TRUE(succeedsOnHostWithDaemons(aPasswordStays)); }

// The sections of profiles of many types, other than [connection] and those of IP; with the passwords and keys of each.
const std::string kKey = "AAECAwQFBgcICQoLDA0ODxAREhMUFRYXGBkaGxwdHh8=";
const std::vector<std::pair<std::string, std::string>> kTypes{
    {"ethernet",
     "[ethernet]\ncloned-mac-address=stable\nauto-negotiate=true\nspeed=100\nduplex=full\nwake-on-lan=64\n"
     "[802-1x]\neap=peap;\nidentity=me\npassword=a secret\nphase2-auth=mschapv2\n[dcb]\napp-fcoe-flags=1\n"
     "[tc]\nqdisc.root=fq_codel\n[sriov]\ntotal-vfs=2\nvf.0=mac=02:00:00:00:00:03 spoof-check=true\n"
     "[ethtool]\nring-rx=256\n[match]\ninterface-name=eth*;\n[hostname]\npriority=7\n"},
    {"wifi",
     "[wifi]\nssid=a name\nmode=infrastructure\nhidden=true\n[wifi-security]\nkey-mgmt=wpa-psk\npsk=a secret text\n"},
    {"wireguard", "[wireguard]\nlisten-port=51820\nprivate-key=" + kKey + "\n[wireguard-peer." + kKey +
                      "]\nendpoint=203.0.113.1:51820\npreshared-key=" + kKey +
                      "\npreshared-key-flags=0\nallowed-ips=192.0.2.0/24;\n"},
    {"vpn",
     "[vpn]\nservice-type=org.freedesktop.NetworkManager.openvpn\nremote=vpn.example\npassword-flags=0\n"
     "[vpn-secrets]\npassword=a secret\n"},
    {"pppoe", "[pppoe]\nusername=me\npassword=a secret\nparent=far0\n[ppp]\nlcp-echo-failure=5\nlcp-echo-interval=9\n"},
    {"gsm", "[gsm]\napn=internet\nusername=me\npassword=a secret\npin=1234\n"},
    {"macsec",
     "[macsec]\nparent=far0\nmode=0\nmka-cak=00112233445566778899001122334455\n"
     "mka-ckn=0011223344556677889900112233445500112233445566778899001122334455\n"},
    {"bridge", "[bridge]\nvlan-filtering=true\nvlans=10-20, 25 pvid, 30 untagged\nstp=false\n"},
    {"bond", "[bond]\nmode=802.3ad\nlacp_rate=fast\nmiimon=100\n"},
    {"vlan", "[vlan]\nid=7\nparent=far0\negress-priority-map=1:2\nflags=1\n"},
    {"ip-tunnel", "[ip-tunnel]\nmode=1\nlocal=192.0.2.1\nremote=192.0.2.2\n"},
    {"vxlan", "[vxlan]\nid=7\nremote=192.0.2.1\nparent=far0\n"},
};

std::string addProfile(const std::string& type, const std::string& sections) {
  const std::string method = type == "vpn" ? "auto" : "manual";  // others are not permitted
  const std::string file = kProfiles + type + ".nmconnection";
  writeFile(file, "[connection]\nid=" + type + "\nuuid=22222222-2222-4222-8222-222222222222\ntype=" + type +
                      "\ninterface-name=new0\nautoconnect=false\nzone=public\npermissions=user:root;\n" + sections +
                      "[ipv4]\nmethod=" + method +
                      "\naddress1=192.0.2.10/24,192.0.2.1\ndhcp-client-id=mine\nmay-fail=false\n"
                      "[ipv6]\nmethod=" +
                      method +
                      "\naddress1=2001:db8::10/64,2001:db8::1\nip6-privacy=2\ntoken=::7\n"
                      "route1=2001:db8:1::/64,2001:db8::2,5\nroute1_options=mtu=1300,onlink=true\naddr-gen-mode=0\n");
  std::filesystem::permissions(file, std::filesystem::perms(0600));
  outputOf("nmcli connection load " + file);
  return file;
}

// Nothing shows so well that all is kept as NetworkManager's own file of it.
bool profilesOfAllTypesAreKept() {
  Host host;
  const std::string identity = "{\"profile\": \"22222222-2222-4222-8222-222222222222\", \"ipv4\": ";
  for (const auto& [type, sections] : kTypes) {
    const std::string file = addProfile(type, sections);
    const auto change = [&](const std::string& servers) {
      const auto changed = host.writer->restore(host.target(), identity + "{\"servers\": [" + servers + "]}}");
      EXPECT_TRUE(changed) << type << ": " << changed.error();
      return contentsOf(file);
    };
    outputOf("nmcli connection modify " + type + " ipv6.dns-search gone.example");  // gives it NetworkManager's form
    std::string expected = contentsOf(file);
    EXPECT_TRUE(sections.find("secret") == std::string::npos || expected.find("secret") != std::string::npos) << type;
    const std::string search = "dns-search=gone.example;\n";
    expected.erase(expected.find(search), search.size());
    const std::string with = change("\"192.0.2.9\"");
    EXPECT_THAT(with, HasSubstr("dns=192.0.2.9;\n")) << type;
    EXPECT_EQ(change(""), expected) << type;
    outputOf("nmcli connection delete " + type);
  }
  return true;
}

TEST_F(NetworkManagerWriter, KeepsAllElseInProfilesOfAllTypes) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(profilesOfAllTypesAreKept));
}

bool learnedServersComeBack() {
  makeCables();
  Daemons daemons;
  makeLeases(daemons);
  daemons.start("NetworkManager");
  outputOf("nmcli connection add type ethernet ifname eth0 con-name lan ipv6.method disabled; nmcli connection up lan");
  Observer owners;
  EXPECT_TRUE(soon([&] { return owners["eth0"].servers == StringList{"192.0.2.53"}; }));
  EXPECT_EQ(owners["eth0"].origin, DnsOrigin::Learned);
  BusCalls bus(kSocket);
  const auto writer = makeNetworkManagerWriter(bus);
  const DnsTarget target{"eth0", 0, "lan", {}, {}};
  const auto saved = writer->save(target);
  EXPECT_TRUE(saved);
  EXPECT_TRUE(writer->write(target, {{"198.51.100.1"}, {"my.example"}}));
  EXPECT_TRUE(soon([&] { return owners["eth0"].servers == StringList{"198.51.100.1"}; }));
  EXPECT_EQ(owners["eth0"].suffixes, StringList{"my.example"});
  EXPECT_EQ(owners["eth0"].domain, "my.example");
  EXPECT_EQ(owners["eth0"].origin, DnsOrigin::Static);
  EXPECT_TRUE(writer->restore(target, *saved));
  EXPECT_TRUE(soon([&] { return owners["eth0"].servers == StringList{"192.0.2.53"}; }));
  EXPECT_EQ(owners["eth0"].suffixes, StringList{"lease.example"});
  EXPECT_EQ(owners["eth0"].origin, DnsOrigin::Learned);
  EXPECT_TRUE(writer->write(target, {}));
  EXPECT_TRUE(soon([&] { return owners["eth0"].servers.empty(); })) << "an empty list replaces a learned one too";
  return true;
}

TEST_F(NetworkManagerWriter, ReplacesALeasesServersAndGivesThemBack) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(learnedServersComeBack));
}

bool aFamilyThatIsOffIsNamed() {
  Host host;
  outputOf(
      "nmcli connection modify lan ipv6.dns '' ipv6.dns-search '' ipv6.addresses '' ipv6.method disabled && "
      "nmcli connection up lan");
  const std::string before = host.file();
  EXPECT_EQ(host.refusalOf(kWanted),
            "eth0: profile lan of NetworkManager has IPv6 disabled, which permits no servers; 'nmcli connection modify "
            "lan ipv6.method auto' changes that");
  outputOf("nmcli connection modify lan ipv6.method link-local && nmcli connection up lan");
  EXPECT_THAT(host.refusalOf(kWanted), HasSubstr("has IPv6 link-local, which permits no servers"));
  outputOf("nmcli connection modify lan ipv6.method disabled && nmcli connection up lan");
  EXPECT_EQ(host.file(), before);
  EXPECT_EQ(host.refusalOf({{"192.0.2.1", "fe80::1%tun1"}, {}}),
            "eth0: server fe80::1%tun1 is on another link; name it for tun1");
  // Only IPv6: its servers, and the search list with them.
  outputOf(
      "nmcli connection modify lan ipv6.method manual ipv6.addresses 2001:db8::10/64 ipv4.dns '' ipv4.dns-search '' "
      "ipv4.addresses '' ipv4.gateway '' ipv4.routes '' ipv4.routing-rules '' ipv4.method disabled && "
      "nmcli connection up lan");
  EXPECT_EQ(host.refusalOf({{"2001:db8::5", "fe80::1%eth0"}, {"new.example"}}), "nothing is refused");
  EXPECT_TRUE(host.shows({"2001:db8::5", "fe80::1%eth0"}, {"new.example"}));
  return true;
}

TEST_F(NetworkManagerWriter, RefusesServersOfAFamilyThatIsOff) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(aFamilyThatIsOffIsNamed));
}

// The profile has got a change that NetworkManager cannot make while it is in use.
bool whatIsNotUsedIsPutBack() {
  Host host;
  outputOf("nmcli connection modify lan 802-1x.eap md5 802-1x.identity me 802-1x.password 'a secret'");
  const std::string before = host.file();
  EXPECT_THAT(host.refusalOf(kWanted),
              AllOf(HasSubstr("Can't reapply any changes to '802-1x' setting"),
                    HasSubstr("'nmcli connection up lan' does, then apply again"), Not(HasSubstr("revert"))));
  EXPECT_EQ(host.file(), before);
  EXPECT_THAT(before, HasSubstr("password=a secret"));
  EXPECT_TRUE(host.shows({"192.0.2.53", "192.0.2.54", "2001:db8::53"}, {"lan.example.org", "six.example"}));
  return true;
}

TEST_F(NetworkManagerWriter, PutsTheProfileBackWhereItIsNotUsed) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(whatIsNotUsedIsPutBack));
}

bool aReadOnlyFileSystemIsNamed() {
  Host host;
  const std::string before = host.file();
  const std::string folder = "/etc/NetworkManager";
  EXPECT_EQ(::mount(folder.c_str(), folder.c_str(), nullptr, MS_BIND, nullptr), 0);
  EXPECT_EQ(::mount(nullptr, folder.c_str(), nullptr, MS_BIND | MS_REMOUNT | MS_RDONLY, nullptr), 0);
  EXPECT_THAT(host.refusalOf(kWanted),
              AllOf(HasSubstr("eth0: NetworkManager does not change profile lan (" + std::string(kProfiles)),
                    HasSubstr("Read-only file system"), HasSubstr("apply again"), Not(HasSubstr("revert"))));
  EXPECT_EQ(outputOf("nmcli --get-values ipv6.dns connection show lan"), "2001\\:db8\\:\\:53\n");
  EXPECT_EQ(host.file(), before);
  EXPECT_EQ(::umount(folder.c_str()), 0);
  EXPECT_EQ(host.refusalOf(kWanted), "nothing is refused");
  return true;
}

TEST_F(NetworkManagerWriter, AReadOnlyFileSystemLeavesTheOldState) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(aReadOnlyFileSystemIsNamed));
}

// Profiles that NetworkManager would change in a copy, or not for long.
bool foreignProfilesAreNamed() {
  const std::string profile =
      "[connection]\nid=tun\nuuid=22222222-2222-4222-8222-222222222222\ntype=ethernet\n"
      "interface-name=tun1\nautoconnect=false\n[ipv4]\nmethod=manual\naddress1=198.51.100.1/24\n"
      "[ipv6]\nmethod=disabled\n";
  Host host;
  const auto useProfile = [&](const std::string& file) {
    writeFile(file, profile);
    std::filesystem::permissions(file, std::filesystem::perms(0600));
    outputOf("nmcli connection reload; nmcli connection up tun");
    const std::string refusal = host.refusalOf({{"192.0.2.1"}, {}}, "tun1");
    EXPECT_TRUE(refusal == "nothing is refused" || contentsOf(file) == profile);
    EXPECT_EQ(host.writer->save(host.target("tun1")).has_value(), refusal == "nothing is refused");
    std::filesystem::remove(file);
    outputOf("nmcli connection reload");
    return refusal;
  };
  std::string file = "/usr/lib/NetworkManager/system-connections/tun.nmconnection";
  EXPECT_EQ(useProfile(file), "tun1: profile tun of NetworkManager is part of a package (" + file +
                                  "); 'nmcli connection clone tun NAME' makes one that can be changed");
  file = "/run/NetworkManager/system-connections/tun.nmconnection";
  EXPECT_EQ(useProfile(file), "tun1: profile tun of NetworkManager is only in memory (" + file +
                                  "); 'nmcli connection modify tun connection.id NAME' saves it to disk");
  file = "/run/NetworkManager/system-connections/netplan-tun.nmconnection";
  EXPECT_EQ(useProfile(file), "tun1: profile tun of NetworkManager is made by netplan (" + file +
                                  "); change it in /etc/netplan and run 'netplan apply'");
  EXPECT_EQ(useProfile("/run/NetworkManager/system-connections/netplan-NM-tun.nmconnection"), "nothing is refused")
      << "NetworkManager keeps its own profiles there, in netplan's files";
  return true;
}

TEST_F(NetworkManagerWriter, RefusesProfilesThatAreNotItsOwnToChange) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(foreignProfilesAreNamed));
}

bool devicesWithoutAProfileAreNamed() {
  Host host;
  EXPECT_THAT(host.refusalOf(kWanted, "tun1"), HasSubstr("tun1: no profile of NetworkManager is active; "));
  EXPECT_THAT(host.refusalOf(kWanted, "absent0"), HasSubstr("No device found for the requested iface."));
  outputOf("nmcli device set tun1 managed no");
  EXPECT_EQ(host.refusalOf(kWanted, "tun1"),
            "tun1 is unmanaged by NetworkManager; 'nmcli device set tun1 managed yes' changes that");
  Interfaces().addAddress("far0", "203.0.113.5", 24);
  EXPECT_TRUE(soon([&] { return host.refusalOf(kWanted, "far0").find("only follows it") != std::string::npos; }));
  return true;
}

TEST_F(NetworkManagerWriter, RefusesDevicesWithoutAProfile) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(devicesWithoutAProfileAreNamed));
}

// Names come from whoever made the profile.
bool aHostileNameStaysOnItsLine() {
  Host host;
  outputOf(
      "nmcli connection modify lan connection.id \"$(printf 'bad\\n\\033[31m $(name)')\" ipv6.dns '' ipv6.dns-search "
      "'' "
      "ipv6.addresses '' ipv6.method disabled");
  const std::string refusal = host.refusalOf(kWanted);
  EXPECT_THAT(refusal, AllOf(HasSubstr("profile bad\\n\\x1b[31m $(name) of NetworkManager"),
                             HasSubstr("'nmcli connection modify 11111111-1111-4111-8111-111111111111 ipv6.method")));
  return true;
}

TEST_F(NetworkManagerWriter, AHostileNameStaysOnItsLine) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(aHostileNameStaysOnItsLine));
}

bool aFrozenDaemonIsNotWaitedForForEver() {
  Host host;
  const DnsTarget target = host.target();
  const std::string before = host.file();
  host.daemons.freeze("NetworkManager");
  const auto result = host.writer->write(target, kWanted);
  EXPECT_TRUE(!result && result.error().find("does not answer in time") != std::string::npos);
  host.daemons.thaw("NetworkManager");
  EXPECT_EQ(host.refusalOf({{"192.0.2.53", "192.0.2.54", "2001:db8::53"}, {"lan.example.org", "six.example"}}),
            "nothing is refused");
  EXPECT_THAT(host.file(), HasSubstr("dns=192.0.2.53#dns.example.org;192.0.2.54;"));
  return true;
}

TEST_F(NetworkManagerWriter, AFrozenDaemonIsNotWaitedForForEver) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(aFrozenDaemonIsNotWaitedForForEver));
}

// Answers as NetworkManager does, and dies at one call.
int answerUntil(const std::string& last, sd_bus_message* answer, const std::string& method) {
  if (method == last) ::_exit(1);
  if (method == "GetDeviceByIpIface") return ::sd_bus_message_append(answer, "o", "/a/device");
  if (method == "GetAll") {
    return ::sd_bus_message_append(answer, "a{sv}", 4, "Managed", "b", 1, "ActiveConnection", "o", "/an/active",
                                   "Connection", "o", "/a/profile", "Filename", "s", "/etc/lan");
  }
  if (method == "GetSettings") {
    return ::sd_bus_message_append(answer, "a{sa{sv}}", 2, "connection", 1, "id", "s", "lan", "ipv4", 1, "method", "s",
                                   "manual");
  }
  return method == "Update2" ? ::sd_bus_message_append(answer, "a{sv}", 0) : 0;
}

bool aDaemonThatDiesIsNamed() {
  const Daemons daemons;
  for (const std::string last : {"Update2", "Reapply"}) {
    const FakeDaemon fake("org.freedesktop.NetworkManager", [&](sd_bus_message* answer, const std::string& method) {
      return answerUntil(last, answer, method);
    });
    BusCalls bus(kSocket);
    const auto result = makeNetworkManagerWriter(bus)->write({"eth0", 1, "lan", {}, {}}, {{"192.0.2.1"}, {}});
    EXPECT_FALSE(result);
    EXPECT_THAT(result.error(), AllOf(HasSubstr("eth0: NetworkManager does not "), HasSubstr("profile lan"),
                                      HasSubstr("org.freedesktop.NetworkManager does not")))
        << last;
  }
  return true;
}

TEST_F(NetworkManagerWriter, ADaemonThatDiesInTheMiddleIsNamed) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(aDaemonThatDiesIsNamed));
}

bool aDeletedProfileNeedsNothing() {
  Host host;
  const auto saved = host.writer->save(host.target());
  outputOf("nmcli connection delete lan");
  EXPECT_TRUE(host.writer->restore(host.target(), *saved)) << "what was changed is gone with it";
  host.daemons.stop("NetworkManager");
  const auto restored = host.writer->restore(host.target(), *saved);
  EXPECT_EQ(restored ? "" : restored.error(),
            "eth0: NetworkManager cannot be asked: org.freedesktop.NetworkManager does not run");
  EXPECT_FALSE(host.writer->restore(host.target(), "{"));
  return true;
}

TEST_F(NetworkManagerWriter, ADeletedProfileNeedsNothing) {
  EXPECT_TRUE(succeedsOnHostWithDaemons(aDeletedProfileNeedsNothing));
}

TEST(NetworkManagerServers, HaveTheOrderInWhichServersAreShown) {
  BusCalls bus("/absent");
  const DnsSettings held = makeNetworkManagerWriter(bus)->asHeld(
      {{"2001:DB8:0::1", "192.0.2.2", "fe80::1%eth0", "192.0.2.1", "192.0.2.2", "2001:db8::1"},
       {"b.example.", "a.example", "b.example"}});
  EXPECT_EQ(held.servers, (StringList{"192.0.2.2", "192.0.2.1", "2001:db8::1", "fe80::1%eth0"}));
  EXPECT_EQ(held.suffixes, (StringList{"b.example", "a.example"}));
}

}  // namespace
}  // namespace zorva::agent
