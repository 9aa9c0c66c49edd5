// Changes DNS settings in the profiles of NetworkManager.

#include <algorithm>
#include <cctype>
#include <charconv>
#include <chrono>
#include <thread>
#include <utility>

#include "agent/apply/NetworkManagerDevice.h"
#include "agent/apply/NetworkManagerProfile.h"
#include "agent/apply/SettingsText.h"
#include "agent/apply/Writers.h"
#include "agent/sources/BusNames.h"
#include "agent/tree/IpAddress.h"

namespace zorva::agent {
namespace {

using Family = NetworkManagerProfile::Family;
using Device = NetworkManagerDevice;
using Done = Expected<void, std::string>;

constexpr const char* kSettingsPath = "/org/freedesktop/NetworkManager/Settings";
constexpr const char* kSettings = "org.freedesktop.NetworkManager.Settings";
constexpr const char* kLease = "org.freedesktop.NetworkManager.DHCP4Config";

// The profile as an argument of nmcli that needs no quotes.
std::string argumentFor(const NetworkManagerProfile& profile) {
  const auto isPlain = [](unsigned char letter) {
    return std::isalnum(letter) != 0 || letter == '.' || letter == '_' || letter == '-';
  };
  const bool isWord = !profile.name.empty() && profile.name.front() != '-' &&
                      std::all_of(profile.name.begin(), profile.name.end(), isPlain);
  return inOneLine(isWord ? profile.name : profile.uuid);
}

std::string nameOf(const NetworkManagerProfile& profile) { return "profile " + inOneLine(profile.name); }

// With any other method a family is off or has no servers to ask.
bool takesDns(const Family& family) {
  return family.method == "auto" || family.method == "manual" || family.method == "dhcp";
}

bool learnsDns(const Family& family) { return family.method == "auto" || family.method == "dhcp"; }

// 0 where that is no number.
std::chrono::seconds secondsIn(const std::string& text) {
  std::uint32_t number = 0;
  std::from_chars(text.data(), text.data() + text.size(), number);
  return std::chrono::seconds(number);
}

// The address of a server as a profile may have it: "192.0.2.1#name", "dns+tls://[2001:db8::1]:853#name".
std::string addressIn(std::string server) {
  if (const std::size_t scheme = server.find("://"); scheme != std::string::npos) server.erase(0, scheme + 3);
  server.erase(std::min(server.find('#'), server.size()));
  if (server.starts_with('[')) {
    server = server.substr(1, server.find(']') - 1);
  } else if (std::count(server.begin(), server.end(), ':') == 1) {
    server.erase(server.find(':'));
  }
  return canonicalAddress(withoutZone(server));
}

// The wanted servers of one family, each as the profile has it so far. Its link is the zone of each.
StringList serversFor(const StringList& present, const StringList& wanted, bool (*isOfFamily)(const std::string&)) {
  StringList servers;
  for (const std::string& server : wanted) {
    const std::string address = withoutZone(server);
    if (!isOfFamily(address)) continue;
    const auto known = std::find_if(present.begin(), present.end(),
                                    [&](const std::string& other) { return addressIn(other) == address; });
    servers.push_back(known == present.end() ? address : *known);
  }
  return servers;
}

// The routing-only domains of a list that are not to be suffixes.
StringList routingIn(const StringList& searches, const StringList& suffixes) {
  StringList routing;
  for (const std::string& search : searches) {
    if (search.starts_with('~') && !holds(suffixes, search.substr(1))) routing.push_back(search);
  }
  return routing;
}

StringList routingOnly(const StringList& domains, const StringList& suffixes) {
  StringList marked;
  for (const std::string& domain : domains) marked.push_back('~' + domain);
  return routingIn(marked, suffixes);
}

JsonValue jsonOf(const ProfileDns& dns) {
  JsonValue value = JsonValue::object();
  value.add("servers", JsonValue::ofTexts(dns.servers));
  value.add("searches", JsonValue::ofTexts(dns.searches));
  value.add("ignores_learned", JsonValue::ofNumber(dns.ignoresLearned ? 1 : 0));
  return value;
}

ProfileDns dnsIn(const JsonValue& value) {
  return {textsIn(value, "servers"), textsIn(value, "searches"), numberIn(value, "ignores_learned") != 0};
}

class NetworkManagerWriter : public DnsWriter {
 public:
  explicit NetworkManagerWriter(BusCalls& bus) : bus_(bus) {}

  DnsSettings asHeld(const DnsSettings& settings) const override;
  Expected<std::string, Refusal> save(const DnsTarget& target) override;
  Expected<void, Refusal> write(const DnsTarget& target, const DnsSettings& settings) override;
  Expected<void, Refusal> restore(const DnsTarget& target, const std::string& saved) override;

 private:
  struct Use {
    Device device;
    NetworkManagerProfile profile;
  };

  BusObject object(const std::string& path) const { return networkManagerObject(bus_, path); }
  Expected<Use, Refusal> useOf(const std::string& interface) const;
  Expected<NetworkManagerProfile, Refusal> changed(const NetworkManagerProfile& profile, const DnsTarget& target,
                                                   const DnsSettings& settings) const;
  void waitForLeaseToAge(const Device& device) const;
  Done reapply(const Device& device) const;
  Done putBack(const NetworkManagerProfile& profile) const;
  Expected<std::string, std::string> profileWithUuid(const std::string& uuid) const;

  BusCalls& bus_;
};

// Why nothing can be changed for a device; empty where it can.
Refusal reasonAgainst(const std::string& interface, const Device& device) {
  if (!device.isManaged) {
    return interface + " is unmanaged by NetworkManager; 'nmcli device set " + interface + " managed yes' changes that";
  }
  if (!isBusPath(device.profile)) {
    return interface + ": no profile of NetworkManager is active; 'nmcli device connect " + interface +
           "' activates one";
  }
  if (device.isExternal) {
    return interface +
           " was set up by another program, and NetworkManager only follows it; 'nmcli connection add type "
           "ethernet ifname " +
           interface + "' makes a profile for it";
  }
  return {};
}

// Why a profile is not changed; empty where it can be. NetworkManager would change a copy on disk, which the original
// hides after the next start. Of the profiles in memory it keeps only those in netplan's files that it has made itself.
Refusal reasonAgainst(const std::string& interface, const NetworkManagerProfile& profile) {
  const std::string where = interface + ": " + nameOf(profile) + " of NetworkManager is ";
  const std::string file = inOneLine(profile.file);
  constexpr std::string_view kNetplans = "/run/NetworkManager/system-connections/netplan-";
  const bool isNetplans = profile.file.starts_with(kNetplans);
  if (isNetplans && profile.file.substr(kNetplans.size()).starts_with("NM-")) return {};
  if (isNetplans) return where + "made by netplan (" + file + "); change it in /etc/netplan and run 'netplan apply'";
  if (profile.file.starts_with("/usr/")) {
    return where + "part of a package (" + file + "); 'nmcli connection clone " + argumentFor(profile) +
           " NAME' makes one that can be changed";
  }
  if (profile.isInMemory || profile.file.starts_with("/run/")) {
    return where + "only in memory (" + file + "); 'nmcli connection modify " + argumentFor(profile) +
           " connection.id NAME' saves it to disk";
  }
  return {};
}

// Why a family cannot have the servers that are wanted for it; empty where it can.
Refusal reasonAgainst(const std::string& interface, const NetworkManagerProfile& profile, const Family& family,
                      const std::string& name) {
  if (family.dns.servers.empty() || takesDns(family)) return {};
  const std::string where = interface + ": " + nameOf(profile) + " of NetworkManager has ";
  if (family.method.empty()) {
    return where + "no settings of IP, as " + interface +
           " is a part of another interface; set the servers of that one";
  }
  const std::string key = name == "IPv4" ? "ipv4.method" : "ipv6.method";
  return where + name + " " + (family.method == "ignore" ? "disabled" : inOneLine(family.method)) +
         ", which permits no servers; 'nmcli connection modify " + argumentFor(profile) + " " + key +
         " auto' changes that";
}

Expected<NetworkManagerWriter::Use, Refusal> NetworkManagerWriter::useOf(const std::string& interface) const {
  const std::string shown = inOneLine(interface);
  auto device = readDevice(bus_, interface);
  if (!device) return unexpected(shown + ": NetworkManager cannot be asked: " + device.error());
  if (Refusal reason = reasonAgainst(shown, *device); !reason.empty()) return unexpected(std::move(reason));
  auto profile = readProfile(bus_, device->profile);
  if (!profile) return unexpected(shown + ": the profile cannot be read from NetworkManager: " + profile.error());
  if (Refusal reason = reasonAgainst(shown, *profile); !reason.empty()) return unexpected(std::move(reason));
  return Use{std::move(*device), std::move(*profile)};
}

// NetworkManager leaves out the dot at the end of a domain.
DnsSettings NetworkManagerWriter::asHeld(const DnsSettings& settings) const {
  DnsSettings held;
  for (bool (*const isOfFamily)(const std::string&) : {isIPv4Address, isIPv6Address}) {
    for (const std::string& server : settings.servers) {
      const std::string address = canonicalServer(server);
      if (isOfFamily(withoutZone(address))) addOnce(held.servers, address);
    }
  }
  for (const std::string& suffix : settings.suffixes) addOnce(held.suffixes, withoutFinalDot(suffix));
  return held;
}

Expected<std::string, Refusal> NetworkManagerWriter::save(const DnsTarget& target) {
  const auto use = useOf(target.interface);
  if (!use) return unexpected(use.error());
  JsonValue state = JsonValue::object();
  state.add("profile", JsonValue::ofText(use->profile.uuid));
  state.add("name", JsonValue::ofText(use->profile.name));
  state.add("ipv4", jsonOf(use->profile.ipv4.dns));
  state.add("ipv6", jsonOf(use->profile.ipv6.dns));
  return formatJson(state);
}

// The search list goes to the family that has servers, as NetworkManager may ask only those for its domains.
Expected<NetworkManagerProfile, Refusal> NetworkManagerWriter::changed(const NetworkManagerProfile& profile,
                                                                       const DnsTarget& target,
                                                                       const DnsSettings& settings) const {
  const std::string shown = inOneLine(target.interface);
  if (Refusal reason = foreignZone(target.interface, settings.servers); !reason.empty()) return unexpected(reason);
  NetworkManagerProfile wanted = profile;
  const auto [servers, suffixes] = asHeld(settings);
  wanted.ipv4.dns.servers = serversFor(profile.ipv4.dns.servers, servers, isIPv4Address);
  wanted.ipv6.dns.servers = serversFor(profile.ipv6.dns.servers, servers, isIPv6Address);
  for (const auto& [family, name] : {std::pair(&wanted.ipv4, "IPv4"), std::pair(&wanted.ipv6, "IPv6")}) {
    if (Refusal reason = reasonAgainst(shown, wanted, *family, name); !reason.empty()) return unexpected(reason);
    if (learnsDns(*family)) family->dns.ignoresLearned = true;
    family->dns.searches = routingIn(family->dns.searches, suffixes);
  }
  const bool isIPv6Only = wanted.ipv4.dns.servers.empty() && !wanted.ipv6.dns.servers.empty();
  Family& home = isIPv6Only || !takesDns(wanted.ipv4) ? wanted.ipv6 : wanted.ipv4;
  StringList searches = suffixes;
  for (const std::string& routing : home.dns.searches) addOnce(searches, routing);
  for (const std::string& domain : routingOnly(target.routingDomains, suffixes)) {
    if (!holds(wanted.ipv4.dns.searches, domain) && !holds(wanted.ipv6.dns.searches, domain)) addOnce(searches, domain);
  }
  if (!searches.empty() && !takesDns(home)) {
    return unexpected(shown + ": " + nameOf(profile) +
                      " of NetworkManager has neither IPv4 nor IPv6 that permits domains; "
                      "'nmcli connection modify " +
                      argumentFor(profile) + " ipv4.method auto' changes that");
  }
  home.dns.searches = std::move(searches);
  return wanted;
}

// NetworkManager 1.42 gets a new lease when the profile is used anew. If that ends in the same second as the one
// before, it counts as the same, and what it brings is used or ignored as before.
void NetworkManagerWriter::waitForLeaseToAge(const Device& device) const {
  using std::chrono::seconds;
  using std::chrono::system_clock;
  if (!isBusPath(device.lease)) return;
  std::string end;
  std::string duration;
  (void)object(device.lease).readProperties(kLease, [&](BusReader& reader, const std::string& property) {
    if (property != "Options") return;
    reader.ifVariant("a{sv}", [&] {
      reader.forEachProperty([&](const std::string& name) {
        if (name == "expiry") reader.ifText(end);
        if (name == "dhcp_lease_time") reader.ifText(duration);
      });
    });
  });
  constexpr seconds kOld{2};
  const system_clock::time_point begin{secondsIn(end) - secondsIn(duration)};
  const auto age = system_clock::now() - begin;
  if (age >= seconds(0) && age < kOld) std::this_thread::sleep_for(kOld - age);
}

// What the profile has is used, in the place of what was given when it was activated.
Done NetworkManagerWriter::reapply(const Device& device) const {
  waitForLeaseToAge(device);
  return object(device.path).call(kNetworkManagerDevice, "Reapply", [](BusWriter& arguments) {
    arguments.array("{sa{sv}}", [] {});
    arguments.longNumber(0);  // of any version
    arguments.number(0);      // no flags
  });
}

Done NetworkManagerWriter::putBack(const NetworkManagerProfile& profile) const {
  const auto present = readProfile(bus_, profile.path);
  if (!present) return unexpected(present.error());
  return present->hasSameDns(profile) ? Done() : replaceDns(bus_, profile);
}

Expected<void, Refusal> NetworkManagerWriter::write(const DnsTarget& target, const DnsSettings& settings) {
  const auto use = useOf(target.interface);
  if (!use) return unexpected(use.error());
  const NetworkManagerProfile& profile = use->profile;
  const auto wanted = changed(profile, target, settings);
  if (!wanted) return unexpected(wanted.error());
  Refusal reason = inOneLine(target.interface) + ": NetworkManager does not ";
  if (const Done written = wanted->hasSameDns(profile) ? Done() : replaceDns(bus_, *wanted); !written) {
    reason += "change " + nameOf(profile) + " (" + inOneLine(profile.file) + "): " + written.error() +
              "; see to that, and apply again";
  } else if (const Done used = reapply(use->device); !used) {
    reason += "use " + nameOf(profile) + " anew: " + used.error() + "; 'nmcli connection up " + argumentFor(profile) +
              "' does, then apply again";
  } else {
    return {};
  }
  (void)putBack(profile);  // as far as it takes calls at all
  return unexpected(reason);
}

// Empty where it is gone.
Expected<std::string, std::string> NetworkManagerWriter::profileWithUuid(const std::string& uuid) const {
  std::string path;
  const Done found = object(kSettingsPath)
                         .call(
                             kSettings, "GetConnectionByUuid", [&](BusWriter& arguments) { arguments.text(uuid); },
                             [&](BusReader& answer) { path = answer.text(); });
  if (found) return path;
  // It says no more than that it fails, which it does without NetworkManager too.
  if (!object(kSettingsPath).call(kSettings, "ListConnections")) return unexpected(found.error());
  return std::string();
}

Expected<void, Refusal> NetworkManagerWriter::restore(const DnsTarget& target, const std::string& saved) {
  const std::string where = inOneLine(target.interface) + ": ";
  const auto state = stateIn(saved);
  if (!state) return unexpected(where + state.error());
  const auto path = profileWithUuid(textIn(*state, "profile"));
  if (!path) return unexpected(where + "NetworkManager cannot be asked: " + path.error());
  if (path->empty()) return {};  // what was changed is gone with it
  NetworkManagerProfile before;
  before.path = *path;
  before.name = textIn(*state, "name");
  before.uuid = textIn(*state, "profile");
  if (const JsonValue* dns = state->find("ipv4"); dns != nullptr) before.ipv4.dns = dnsIn(*dns);
  if (const JsonValue* dns = state->find("ipv6"); dns != nullptr) before.ipv6.dns = dnsIn(*dns);
  if (const Done done = putBack(before); !done) {
    return unexpected(where + "NetworkManager does not change " + nameOf(before) + ": " + done.error());
  }
  const auto device = readDevice(bus_, target.interface);
  if (!device || device->profile != *path) return {};
  if (const Done used = reapply(*device); !used) {
    return unexpected(where + "NetworkManager does not use " + nameOf(before) + " anew: " + used.error() +
                      "; 'nmcli connection up " + argumentFor(before) + "' does");
  }
  return {};
}

}  // namespace

std::unique_ptr<DnsWriter> makeNetworkManagerWriter(BusCalls& bus) {
  return std::make_unique<NetworkManagerWriter>(bus);
}

}  // namespace zorva::agent
