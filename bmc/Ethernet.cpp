#include "bmc/Ethernet.h"

#include <algorithm>
#include <array>
#include <set>

#include "agent/sources/DnsFacts.h"
#include "agent/sources/DnsProperties.h"
#include "agent/tree/BmcJson.h"
#include "agent/tree/IpAddress.h"
#include "bmc/Redfish.h"
#include "util/Names.h"

namespace zorva::bmc {

namespace {

using namespace ZV::NodeLexicon;
using agent::AddressOrigin;
using agent::InterfaceAddress;
using Kind = JsonValue::Kind;

constexpr std::size_t kMostAddresses = 64;

std::optional<bool> booleanIn(const JsonValue& value, std::string_view name) {
  const JsonValue* boolean = memberOf(value, name, Kind::Boolean);
  return boolean == nullptr ? std::nullopt : std::optional(boolean->boolean);
}

std::optional<StringList> textsIn(const JsonValue& value, std::string_view name) {
  const JsonValue* list = memberOf(value, name, Kind::List);
  if (list == nullptr || list->items.size() > agent::kMostDnsValues) return std::nullopt;
  StringList texts;
  for (const JsonValue& item : list->items) texts.push_back(item.kind == Kind::Text ? item.text : std::string());
  return texts;
}

struct OriginName {
  std::string_view name;
  AddressOrigin origin;
};
constexpr std::array kOrigins{
    OriginName{"Static", AddressOrigin::Static},       OriginName{"DHCP", AddressOrigin::Dhcp},
    OriginName{"BOOTP", AddressOrigin::Dhcp},          OriginName{"DHCPv6", AddressOrigin::Dhcp},
    OriginName{"SLAAC", AddressOrigin::Slaac},         OriginName{"IPv4LinkLocal", AddressOrigin::LinkLocal},
    OriginName{"LinkLocal", AddressOrigin::LinkLocal},
};

/// The prefix length of a mask of IPv4; nothing if its ones are not together.
std::optional<unsigned int> prefixOf(const std::string& mask) {
  unsigned int bits = 0;
  bool ended = false;
  const std::vector<unsigned char> bytes = agent::bytesOfAddress(mask);
  constexpr std::size_t kBytes = 4;
  constexpr int kTopBit = 7;
  if (bytes.size() != kBytes) return std::nullopt;
  for (const unsigned char byte : bytes) {
    for (int bit = kTopBit; bit >= 0; --bit) {
      const bool isSet = ((byte >> bit) & 1) != 0;
      if (isSet && ended) return std::nullopt;
      if (isSet) ++bits;
      ended = !isSet;
    }
  }
  return bits;
}

std::optional<unsigned int> prefixLengthIn(const JsonValue& item, std::size_t bytes) {
  constexpr std::size_t kBitsOfByte = 8;
  constexpr std::size_t kIPv4Bytes = 4;
  if (bytes == kIPv4Bytes) return prefixOf(shownTextIn(item, "SubnetMask"));
  const JsonValue* length = memberOf(item, "PrefixLength", Kind::Number);
  if (length == nullptr || length->number > bytes * kBitsOfByte) return std::nullopt;
  return static_cast<unsigned int>(length->number);
}

/// Addresses with all that the tree needs of them.
void addAddresses(const JsonValue& body, std::string_view name, agent::AddressList& addresses) {
  const JsonValue* list = memberOf(body, name, Kind::List);
  if (list == nullptr) return;
  for (const JsonValue& item : list->items) {
    if (addresses.size() == kMostAddresses) return;
    const std::vector<unsigned char> bytes = agent::bytesOfAddress(shownTextIn(item, "Address"));
    const std::optional<unsigned int> length = prefixLengthIn(item, bytes.size());
    if (bytes.empty() || agent::isUnspecifiedAddress(bytes) || !length) continue;
    InterfaceAddress address{agent::textOfAddress(bytes), *length, AddressOrigin::Unknown};
    const std::string origin = shownTextIn(item, "AddressOrigin");
    for (const OriginName& known : kOrigins) {
      if (known.name == origin) address.origin = known.origin;
    }
    const auto isSame = [&](const InterfaceAddress& other) { return other.address == address.address; };
    if (std::none_of(addresses.begin(), addresses.end(), isSame)) addresses.push_back(address);
  }
}

bool isNodeName(const std::string& name) { return !name.empty() && name.find('/') == std::string::npos; }

agent::DnsOrigin originOf(const Ethernet& ethernet) {
  const StringList servers = ethernet.servers();
  const std::size_t learned = ethernet.learnedServers().size();
  if (servers.empty() || (learned == 0 && !ethernet.staticServers)) return agent::DnsOrigin::Unknown;
  if (learned == 0) return agent::DnsOrigin::Static;
  return learned == servers.size() ? agent::DnsOrigin::Learned : agent::DnsOrigin::Mixed;
}

unsigned int rawState(const Ethernet& ethernet) {
  if (!ethernet.enabled.value_or(ethernet.state != "Disabled")) return agent::kRawDown;
  const bool hasNoLink = ethernet.linkStatus == "LinkDown" || ethernet.linkStatus == "NoLink";
  return hasNoLink ? agent::kRawUpWithoutCarrier : agent::kRawUpWithCarrier;
}

agent::DnsFacts factsOf(const Ethernet& ethernet) {
  agent::DnsFacts facts;
  facts.owner = agent::kBmcOwner;
  facts.profile = ethernet.resource;
  facts.origin = originOf(ethernet);
  agent::DnsFactsBuilder builder(facts);
  for (const std::string& server : ethernet.servers()) builder.addServer(server, ethernet.id);
  return facts;
}

void addInterface(agent::TreeBuilder& builder, std::size_t port, const Ethernet& ethernet) {
  const std::size_t node = builder.add(port, agent::NodeType::NetworkIPConfig, "ip");
  const agent::DnsFacts facts = factsOf(ethernet);
  const std::string domain = ethernet.domain();
  builder.set(node, PROP_NAME, ethernet.id);
  if (!ethernet.hostName.empty()) builder.set(node, PROP_HOST_NAME, ethernet.hostName);
  if (!domain.empty()) builder.set(node, PROP_DOMAIN_NAME, domain);
  // It appends its domain, and has no other search list.
  builder.set(node, PROP_DNS_SUFFIXES, agent::share(domain.empty() ? StringList() : StringList{domain}));
  builder.set(node, PROP_DNS_SERVER_ADDRESSES, agent::share(facts.servers));
  builder.set(node, PROP_PROTOCOL_IF_TYPE, agent::protocolTypeOf(ethernet.addresses));
  builder.set(node, PROP_ENABLED_STATE, rawState(ethernet));
  builder.set(node, agent::kAddresses, std::make_shared<const agent::AddressList>(ethernet.addresses));
  agent::setDnsProperties(builder, node, facts);
}

/// A name that no sibling has: hostile services repeat an Id.
std::string uniqueName(std::set<std::string>& taken, const std::string& name) {
  std::string unique = name;
  for (int number = 2; !taken.insert(unique).second; ++number) unique = name + '~' + std::to_string(number);
  return unique;
}

}  // namespace

StringList withoutPadding(const StringList& servers) {
  StringList list;
  for (const std::string& server : servers) {
    const std::string address = server.substr(0, server.find('%'));
    const std::vector<unsigned char> bytes = agent::bytesOfAddress(address);
    if (bytes.empty() || agent::isUnspecifiedAddress(bytes)) continue;
    const std::string usual = agent::textOfAddress(bytes);
    if (std::find(list.begin(), list.end(), usual) == list.end()) list.push_back(usual);
  }
  return list;
}

StringList Ethernet::servers() const {
  if (nameServers) return withoutPadding(*nameServers);
  return staticServers ? withoutPadding(*staticServers) : StringList();
}

StringList Ethernet::learnedServers() const {
  StringList learned = servers();
  const StringList own = staticServers ? withoutPadding(*staticServers) : StringList();
  if (!staticServers && !v4.givesServers() && !v6.givesServers()) return {};
  std::erase_if(learned, [&](const std::string& each) { return std::find(own.begin(), own.end(), each) != own.end(); });
  return learned;
}

std::string Ethernet::domain() const {
  if (!fqdn) return {};
  const std::size_t dot = hostName.size();
  const bool followsName = !hostName.empty() && fqdn->size() > dot && (*fqdn)[dot] == '.' &&
                           util::sameName(std::string_view(*fqdn).substr(0, dot), hostName);
  const std::size_t first = followsName ? dot : fqdn->find('.');
  std::string domain = first == std::string::npos ? std::string() : fqdn->substr(first + 1);
  if (domain.ends_with('.')) domain.pop_back();
  return agent::isDomain(domain) ? domain : std::string();
}

Ethernet readEthernet(const JsonValue& body) {
  Ethernet ethernet;
  ethernet.resource = idOf(body);
  ethernet.id = shownTextIn(body, "Id");
  if (!isNodeName(ethernet.id)) ethernet.id = lastNameOf(ethernet.resource);
  ethernet.name = shownTextIn(body, "Name");
  ethernet.hostName = shownTextIn(body, "HostName");
  if (const std::string fqdn = shownTextIn(body, "FQDN"); !fqdn.empty()) ethernet.fqdn = fqdn;
  ethernet.nameServers = textsIn(body, "NameServers");
  ethernet.staticServers = textsIn(body, "StaticNameServers");
  if (const JsonValue* list = memberOf(body, "StaticNameServers", Kind::List)) {
    ethernet.padsWithNull = std::any_of(list->items.begin(), list->items.end(),
                                        [](const JsonValue& item) { return item.kind == Kind::Null; });
  }
  if (const JsonValue* v4 = memberOf(body, "DHCPv4", Kind::Object)) {
    ethernet.v4 = {booleanIn(*v4, "DHCPEnabled"), booleanIn(*v4, "UseDNSServers"), booleanIn(*v4, "UseDomainName")};
  }
  if (const JsonValue* v6 = memberOf(body, "DHCPv6", Kind::Object)) {
    const std::string mode = shownTextIn(*v6, "OperatingMode");
    ethernet.v6 = {mode.empty() ? std::nullopt : std::optional(mode != "Disabled"), booleanIn(*v6, "UseDNSServers"),
                   booleanIn(*v6, "UseDomainName")};
  }
  ethernet.enabled = booleanIn(body, "InterfaceEnabled");
  ethernet.linkStatus = shownTextIn(body, "LinkStatus");
  if (const JsonValue* status = memberOf(body, "Status", Kind::Object)) ethernet.state = shownTextIn(*status, "State");
  addAddresses(body, "IPv4Addresses", ethernet.addresses);
  addAddresses(body, "IPv6Addresses", ethernet.addresses);
  const JsonValue* later = memberOf(body, "@Redfish.Settings", Kind::Object);
  const JsonValue* settings = later == nullptr ? nullptr : memberOf(*later, "SettingsObject", Kind::Object);
  if (settings != nullptr) ethernet.settings = idOf(*settings);
  return ethernet;
}

std::shared_ptr<const agent::TreeSnapshot> treeOf(const std::vector<Manager>& managers) {
  agent::TreeBuilder builder{std::string()};
  std::set<std::string> managerNames;
  for (const Manager& manager : managers) {
    const std::string name = uniqueName(managerNames, agent::kBmcNodePrefix + manager.id);
    const std::size_t system = builder.add(0, agent::NodeType::System, name, "BMC");
    std::set<std::string> portNames;
    for (const Ethernet& ethernet : manager.interfaces) {
      const std::string portName = uniqueName(portNames, ethernet.id);
      addInterface(builder, builder.add(system, agent::NodeType::Port, portName, ethernet.name), ethernet);
    }
  }
  return builder.finish();
}

}  // namespace zorva::bmc
