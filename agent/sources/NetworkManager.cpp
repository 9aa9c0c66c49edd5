#include "agent/sources/NetworkManager.h"

#include <algorithm>
#include <utility>

#include "agent/sources/BusNames.h"
#include "agent/sources/NetworkManagerValues.h"

namespace zorva::agent {
namespace {

constexpr const char* kPrefix = "org.freedesktop.NetworkManager.";
constexpr std::size_t kMostProfiles = 1024;
constexpr std::uint32_t kExternal = 0x80;  // NM_ACTIVATION_STATE_FLAG_EXTERNAL

std::string changesOf(const std::string& interface) {
  return std::string("interface='") + kBusProperties + "',member='PropertiesChanged',arg0='" + (kPrefix + interface) +
         '\'';
}

// A list of dictionaries that have the address, with other things, as text.
void ifAddressData(BusReader& reader, StringList& addresses) {
  reader.ifVariant("aa{sv}", [&] {
    addresses.clear();
    reader.forEach("a{sv}", [&] {
      std::string address;
      reader.forEachProperty([&](const std::string& name) {
        if (name == "address") reader.ifText(address);
      });
      addresses.push_back(std::move(address));
    });
  });
}

void append(StringList& list, const StringList& more) { list.insert(list.end(), more.begin(), more.end()); }

bool holds(const StringList& list, const std::string& value) {
  return std::find(list.begin(), list.end(), value) != list.end();
}

// A value that the profile names was set by hand.
DnsOrigin originOf(const StringList& used, const StringList& inProfile) {
  const auto byHand =
      std::count_if(used.begin(), used.end(), [&](const std::string& value) { return holds(inProfile, value); });
  if (used.empty()) return DnsOrigin::Unknown;
  if (byHand == 0) return DnsOrigin::Learned;
  return byHand == static_cast<std::ptrdiff_t>(used.size()) ? DnsOrigin::Static : DnsOrigin::Mixed;
}

}  // namespace

NetworkManager::NetworkManager()
    : DnsOwner({"NetworkManager",
                kNetworkManagerService,
                {changesOf("Device"), changesOf("IP4Config"), changesOf("IP6Config"), changesOf("Connection.Active"),
                 "interface='org.freedesktop.NetworkManager.Settings.Connection',member='Updated'"},
                ""}) {}

void NetworkManager::startAsking(const std::vector<Link>&) {
  objects_ = {};
  ask("/org/freedesktop", "org.freedesktop.DBus.ObjectManager", "GetManagedObjects", {},
      [this](BusReader& reader) { readObjects(reader); });
}

void NetworkManager::readObjects(BusReader& reader) {
  reader.forEachEntry("oa{sa{sv}}", [&] {
    const std::string path = reader.text();
    reader.forEachEntry("sa{sv}", [&] { readObject(reader, path, reader.text()); });
  });
  askForProfiles();
}

void NetworkManager::readObject(BusReader& reader, const std::string& path, const std::string& interface) {
  const std::string kind = interface.starts_with(kPrefix) ? interface.substr(std::string(kPrefix).size()) : "";
  if (kind == "Device") {
    objects_.devices.push_back(readDevice(reader));
  } else if (kind == "IP4Config" || kind == "IP6Config") {
    objects_.ipConfigs[path] = readIpConfig(reader);
  } else if (kind == "Connection.Active") {
    objects_.actives[path] = readActive(reader);
  } else {
    reader.skip();
  }
}

NetworkManager::Device NetworkManager::readDevice(BusReader& reader) {
  Device device;
  reader.forEachProperty([&](const std::string& name) {
    if (name == "Interface") reader.ifText(device.interface);
    if (name == "IpInterface") reader.ifText(device.ipInterface);
    if (name == "ActiveConnection") reader.ifPath(device.active);
    if (name == "Ip4Config") reader.ifPath(device.ip4);
    if (name == "Ip6Config") reader.ifPath(device.ip6);
    if (name == "Managed") reader.ifVariant("b", [&] { device.managed = reader.flag(); });
  });
  return device;
}

NetworkManager::IpConfig NetworkManager::readIpConfig(BusReader& reader) {
  IpConfig config;
  reader.forEachProperty([&](const std::string& name) {
    // Both mean the same; which of them a version has depends on the family too.
    if (name == "NameserverData") ifAddressData(reader, config.servers);
    if (name == "Nameservers") ifAddressBytes(reader, config.servers);
    if (name == "Searches") ifTexts(reader, config.searches);
    if (name == "Domains") ifTexts(reader, config.domains);
  });
  return config;
}

NetworkManager::Active NetworkManager::readActive(BusReader& reader) {
  Active active;
  reader.forEachProperty([&](const std::string& name) {
    if (name == "Id") reader.ifText(active.name);
    if (name == "Connection") reader.ifPath(active.profile);
    if (name == "StateFlags") {
      reader.ifVariant("u", [&] { active.external = (reader.number() & kExternal) != 0; });
    }
  });
  return active;
}

void NetworkManager::askForProfiles() {
  for (const Device& device : objects_.devices) {
    const auto active = objects_.actives.find(device.active);
    if (!device.managed || active == objects_.actives.end() || active->second.external) continue;
    const std::string path = active->second.profile;
    if (path.size() <= 1 || objects_.profiles.size() >= kMostProfiles) continue;
    if (!objects_.profiles.emplace(path, Profile()).second) continue;
    ask(path, std::string(kPrefix) + "Settings.Connection", "GetSettings", {},
        [this, path](BusReader& reader) { readProfile(reader, objects_.profiles[path]); });
  }
}

void NetworkManager::readProfile(BusReader& reader, Profile& profile) {
  reader.forEachEntry("sa{sv}", [&] {
    const std::string section = reader.text();
    const bool isIp = section == "ipv4" || section == "ipv6";
    StringList servers;
    StringList searches;
    reader.forEachProperty([&](const std::string& name) {
      if (!isIp) return;
      if (name == "dns" && section == "ipv4") ifAddressNumbers(reader, servers);
      if (name == "dns" && section == "ipv6") ifAddressBytes(reader, servers);
      if (name == "dns-search") ifTexts(reader, searches);
    });
    append(profile.servers, servers);
    append(profile.searches, searches);
  });
  profile.known = true;
}

void NetworkManager::takeDevice(const Device& device) {
  const auto active = objects_.actives.find(device.active);
  if (!device.managed || active == objects_.actives.end() || active->second.external) return;
  const IpConfig& ip4 = objects_.ipConfigs[device.ip4];
  const IpConfig& ip6 = objects_.ipConfigs[device.ip6];
  const std::string& interface = device.ipInterface.empty() ? device.interface : device.ipInterface;
  DnsFacts facts;
  facts.owner = name();
  DnsFactsBuilder builder(facts);
  builder.setProfile(active->second.name);
  StringList servers = ip4.servers;
  append(servers, ip6.servers);
  for (const std::string& server : servers) builder.addServer(server, interface);
  // Of the domains, which were learned, none is used where there are searches; they name the domain nevertheless.
  StringList searches = ip4.searches;
  append(searches, ip6.searches);
  StringList domains = ip4.domains;
  append(domains, ip6.domains);
  if (searches.empty()) searches = domains;
  // It leaves out the dot at the end of a domain, also where that is all there is.
  for (const std::string& search : searches) builder.addDomain(search == "~" ? "~." : search);
  domains.insert(domains.end(), facts.suffixes.begin(), facts.suffixes.end());
  const auto domain = std::find_if(domains.begin(), domains.end(), isDomain);
  if (domain != domains.end()) facts.domain = *domain;
  const Profile& profile = objects_.profiles[active->second.profile];
  if (profile.known)
    facts.origin = servers.empty() ? originOf(searches, profile.searches) : originOf(servers, profile.servers);
  reportWhatIsLeftOut(interface, builder);
  facts_[interface] = std::move(facts);
}

void NetworkManager::takeAnswers() {
  facts_.clear();
  for (const Device& device : objects_.devices) takeDevice(device);
  objects_ = {};
}

void NetworkManager::forget() {
  objects_ = {};
  facts_.clear();
}

const DnsFacts* NetworkManager::factsOf(const Link& link) const {
  const auto found = facts_.find(link.name);
  return found == facts_.end() ? nullptr : &found->second;
}

}  // namespace zorva::agent
