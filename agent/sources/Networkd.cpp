#include "agent/sources/Networkd.h"

#include <algorithm>
#include <array>
#include <limits>
#include <utility>

#include "agent/sources/BusNames.h"

namespace zorva::agent {
namespace {

using Kind = JsonValue::Kind;

constexpr std::size_t kLongestAddress = 16;

const JsonValue* member(const JsonValue& object, const char* name, Kind kind) {
  if (object.kind != Kind::Object) return nullptr;
  const JsonValue* value = object.find(name);
  return value != nullptr && value->kind == kind ? value : nullptr;
}

std::string textIn(const JsonValue& object, const char* name) {
  const JsonValue* value = member(object, name, Kind::Text);
  return value == nullptr ? "" : value->text;
}

unsigned int numberIn(const JsonValue& object, const char* name) {
  const JsonValue* value = member(object, name, Kind::Number);
  const bool fits = value != nullptr && value->number <= std::numeric_limits<unsigned int>::max();
  return fits ? static_cast<unsigned int>(value->number) : 0;
}

const std::vector<JsonValue>& itemsIn(const JsonValue& object, const char* name) {
  static const std::vector<JsonValue> kNone;
  const JsonValue* value = member(object, name, Kind::List);
  return value == nullptr ? kNone : value->items;
}

// A list of numbers from 0 to 255.
std::vector<unsigned char> bytesIn(const JsonValue& object, const char* name) {
  constexpr std::uint64_t kLargest = 255;
  std::vector<unsigned char> bytes;
  for (const JsonValue& item : itemsIn(object, name)) {
    if (item.kind != Kind::Number || item.number > kLargest || bytes.size() > kLongestAddress) return {};
    bytes.push_back(static_cast<unsigned char>(item.number));
  }
  return bytes;
}

// "static" is of a file, "runtime" was set by a person or program since; everything else is a protocol.
DnsOrigin originOf(const std::string& source) {
  if (source.empty()) return DnsOrigin::Unknown;
  return source == "static" || source == "runtime" ? DnsOrigin::Static : DnsOrigin::Learned;
}

void addOrigin(DnsOrigin& origin, const JsonValue& item) {
  const DnsOrigin more = originOf(textIn(item, "ConfigSource"));
  if (origin == DnsOrigin::Unknown) origin = more;
  if (more != DnsOrigin::Unknown && more != origin) origin = DnsOrigin::Mixed;
}

struct ModeName {
  const char* name;
  std::string DnsFacts::*mode;
};

constexpr std::array kModes{ModeName{"LLMNR", &DnsFacts::llmnr}, ModeName{"MDNS", &DnsFacts::multicastDns},
                            ModeName{"DNSOverTLS", &DnsFacts::dnsOverTls}, ModeName{"DNSSEC", &DnsFacts::dnssec}};

}  // namespace

Networkd::Networkd(const std::string& root)
    : DnsOwner({"systemd-networkd",
                kNetworkdService,
                {propertyChangesBelow(kNetworkdPath)},
                root + "/run/systemd/netif/links"}) {}

void Networkd::startAsking(const std::vector<Link>&) {
  answer_.clear();
  ask(kNetworkdPath, kNetworkdManager, "Describe", {}, [this](BusReader& reader) { readDescription(reader); });
}

void Networkd::readDescription(BusReader& reader) {
  try {
    const JsonValue description = parseJson(reader.text(), "the description of links");
    for (const JsonValue& link : itemsIn(description, "Interfaces")) readLink(link);
  } catch (const ConfigError& error) {
    throw BusError(error.what());
  }
}

// It manages the links that it has a file for.
void Networkd::readLink(const JsonValue& link) {
  const std::string file = textIn(link, "NetworkFile");
  if (file.empty()) return;
  const std::string interface = textIn(link, "Name");
  DnsFacts facts;
  facts.owner = name();
  DnsFactsBuilder builder(facts);
  builder.setProfile(file);
  for (const JsonValue& server : itemsIn(link, "DNS")) {
    builder.addServer(bytesIn(server, "Address"), interface, numberIn(server, "Port"), textIn(server, "ServerName"));
    addOrigin(facts.origin, server);
  }
  DnsOrigin ofDomains = DnsOrigin::Unknown;
  for (const bool routing : {false, true}) {
    for (const JsonValue& domain : itemsIn(link, routing ? "RouteDomains" : "SearchDomains")) {
      builder.addDomain(textIn(domain, "Domain"), routing);
      addOrigin(ofDomains, domain);
    }
  }
  if (facts.servers.empty()) facts.origin = ofDomains;
  if (!facts.suffixes.empty()) facts.domain = facts.suffixes.front();
  for (const JsonValue& setting : itemsIn(link, "DNSSettings")) {
    for (const ModeName& mode : kModes) {
      const std::string value = textIn(setting, mode.name);
      if (!value.empty() && isShownText(value)) facts.*mode.mode = value;
    }
  }
  reportWhatIsLeftOut(interface, builder);
  answer_[numberIn(link, "Index")] = std::move(facts);
}

void Networkd::takeAnswers() { facts_ = std::exchange(answer_, {}); }

void Networkd::forget() {
  answer_.clear();
  facts_.clear();
}

const DnsFacts* Networkd::factsOf(const Link& link) const {
  const auto found = facts_.find(static_cast<unsigned int>(link.index));
  return found == facts_.end() ? nullptr : &found->second;
}

}  // namespace zorva::agent
