#include "bmc/Change.h"

#include <algorithm>

#include "util/Text.h"

namespace zorva::bmc {

namespace {

using Kind = JsonValue::Kind;

constexpr const char* kServers = "StaticNameServers";
constexpr const char* kFqdn = "FQDN";
constexpr const char* kUseServers = "UseDNSServers";
constexpr const char* kUseDomain = "UseDomainName";

StringList textsOf(const JsonValue& list) {
  StringList texts;
  for (const JsonValue& item : list.items) texts.push_back(item.text);
  return texts;
}

struct DhcpOf {
  const char* name;
  const Dhcp Ethernet::*dhcp;
};
constexpr DhcpOf kFamilies[] = {{"DHCPv4", &Ethernet::v4}, {"DHCPv6", &Ethernet::v6}};

void addBoolean(JsonValue& object, const char* name, std::optional<bool> value) {
  if (value) object.add(name, JsonValue::ofBoolean(*value));
}

void addUnlessEmpty(JsonValue& object, const char* name, JsonValue member) {
  if (!member.items.empty()) object.add(name, std::move(member));
}

/// A list as long as the one that the service has, with its padding.
JsonValue padded(const StringList& servers, const Ethernet& now) {
  JsonValue list = JsonValue::ofTexts(servers);
  const std::size_t length = now.staticServers ? now.staticServers->size() : 0;
  while (list.items.size() < length) list.add(now.padsWithNull ? JsonValue() : JsonValue::ofText({}));
  return list;
}

/// What a second 412 means when the ETag is the one of the first.
std::string whyRefused(const std::string& resource, const std::string& etag) {
  return std::string("the service refuses the ") + (etag.starts_with("W/") ? "weak " : "") +
         "ETag that it gave itself for " + resource + ", so nothing was changed";
}

bool differs(const std::optional<bool>& now, const JsonValue* wanted) {
  return wanted != nullptr && now && *now != wanted->boolean;
}

}  // namespace

JsonValue propertiesFor(const Ethernet& now, const WantedDns& wanted) {
  JsonValue properties = JsonValue::object();
  const bool setsServers = wanted.servers && withoutPadding(*wanted.servers) != now.servers();
  if (setsServers) {
    if (!now.staticServers) {
      throw Failed("interface " + now.id + " has no StaticNameServers: its DNS servers cannot be set by Redfish");
    }
    properties.add(kServers, JsonValue::ofTexts(withoutPadding(*wanted.servers)));
  }
  const bool setsDomain = wanted.domain && *wanted.domain != now.domain();
  if (setsDomain) {
    if (!now.fqdn || now.hostName.empty()) {
      throw Failed("interface " + now.id + " lacks FQDN or HostName: its domain cannot be set by Redfish");
    }
    properties.add(kFqdn, JsonValue::ofText(now.hostName + (wanted.domain->empty() ? "" : "." + *wanted.domain)));
  }
  for (const DhcpOf& family : kFamilies) {
    const Dhcp& dhcp = now.*family.dhcp;
    JsonValue object = JsonValue::object();
    if (setsServers && dhcp.givesServers()) addBoolean(object, kUseServers, false);
    if (setsDomain && dhcp.givesDomain()) addBoolean(object, kUseDomain, false);
    addUnlessEmpty(properties, family.name, std::move(object));
  }
  return properties;
}

JsonValue propertiesOf(const Ethernet& now) {
  JsonValue properties = JsonValue::object();
  if (now.staticServers) properties.add(kServers, JsonValue::ofTexts(withoutPadding(*now.staticServers)));
  if (now.fqdn) properties.add(kFqdn, JsonValue::ofText(*now.fqdn));
  for (const DhcpOf& family : kFamilies) {
    const Dhcp& dhcp = now.*family.dhcp;
    JsonValue object = JsonValue::object();
    addBoolean(object, kUseServers, dhcp.useDnsServers);
    addBoolean(object, kUseDomain, dhcp.useDomainName);
    addUnlessEmpty(properties, family.name, std::move(object));
  }
  return properties;
}

JsonValue differenceFrom(const Ethernet& now, const JsonValue& properties) {
  JsonValue change = JsonValue::object();
  if (const JsonValue* servers = memberOf(properties, kServers, Kind::List)) {
    const StringList wanted = withoutPadding(textsOf(*servers));
    if (now.staticServers && withoutPadding(*now.staticServers) != wanted) change.add(kServers, padded(wanted, now));
  }
  if (const JsonValue* fqdn = memberOf(properties, kFqdn, Kind::Text)) {
    if (now.fqdn && *now.fqdn != fqdn->text) change.add(kFqdn, *fqdn);
  }
  for (const DhcpOf& family : kFamilies) {
    const JsonValue* wanted = memberOf(properties, family.name, Kind::Object);
    if (wanted == nullptr) continue;
    const Dhcp& dhcp = now.*family.dhcp;
    const JsonValue* useServers = memberOf(*wanted, kUseServers, Kind::Boolean);
    const JsonValue* useDomain = memberOf(*wanted, kUseDomain, Kind::Boolean);
    JsonValue object = JsonValue::object();
    if (differs(dhcp.useDnsServers, useServers)) object.add(kUseServers, *useServers);
    if (differs(dhcp.useDomainName, useDomain)) object.add(kUseDomain, *useDomain);
    addUnlessEmpty(change, family.name, std::move(object));
  }
  return change;
}

std::string warningBefore(const Ethernet& now, const WantedDns& wanted) {
  std::string warning;
  StringList dropped;
  if (wanted.servers && withoutPadding(*wanted.servers) != now.servers()) {
    dropped = now.learnedServers();
    const StringList kept = withoutPadding(*wanted.servers);
    std::erase_if(dropped,
                  [&](const std::string& each) { return std::find(kept.begin(), kept.end(), each) != kept.end(); });
  }
  if (!dropped.empty())
    warning = "the service processor will no longer use what DHCP gave it: " + util::joined(dropped);
  const bool dropsDomain =
      wanted.domain && *wanted.domain != now.domain() && (now.v4.givesDomain() || now.v6.givesDomain());
  if (dropsDomain) {
    warning += (warning.empty() ? "" : "; ") + std::string("it will no longer take its domain from DHCP");
  }
  return warning;
}

std::string change(Redfish& redfish, const std::string& resource, const PropertiesOn& propertiesOn) {
  constexpr int kMostAttempts = 2;
  std::string refused;  // the ETag of the attempt before
  for (int attempt = 0; attempt < kMostAttempts; ++attempt) {
    const Resource found = redfish.fetch(resource);
    const Ethernet now = readEthernet(found.body);
    const JsonValue difference = differenceFrom(now, propertiesOn(now));
    if (difference.items.empty()) return {};
    const bool isElsewhere = !now.settings.empty() && now.settings != resource;
    const std::string target = isElsewhere ? now.settings : resource;
    const std::string etag = isElsewhere ? redfish.fetch(target).etag : found.etag;
    if (const auto remarks = redfish.patch(target, difference, etag)) return *remarks;
    if (!etag.empty() && etag == refused) throw Failed(whyRefused(target, etag));
    refused = etag;
  }
  throw Failed("somebody else keeps changing " + resource + "; try again later");
}

}  // namespace zorva::bmc
