#include "agent/tree/TreeJson.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <limits>
#include <stdexcept>
#include <utility>

#include "agent/tree/IpAddress.h"
#include "util/Nearest.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;
using Kind = JsonValue::Kind;

// Of the documents that are written. One without a version is read as well: people write them by hand.
constexpr std::uint64_t kTreeVersion = 1;

struct TypeName {
  NodeType type;
  const char* name;
};

constexpr std::array kTypes{
    TypeName{NodeType::System, "System"},
    TypeName{NodeType::Port, "Port"},
    TypeName{NodeType::NetworkIPConfig, "NetworkIPConfig"},
};

enum class ValueType { Text, Number, TextList, Addresses };

struct PropertyName {
  PropertyNumber number;
  const char* name;
  ValueType type;
};

// In the order in which a document has them.
constexpr std::array kProperties{
    PropertyName{PROP_NAME, "name", ValueType::Text},
    PropertyName{PROP_HOST_NAME, "host_name", ValueType::Text},
    PropertyName{PROP_DOMAIN_NAME, "domain_name", ValueType::Text},
    PropertyName{PROP_DNS_SUFFIXES, "dns_suffixes", ValueType::TextList},
    PropertyName{PROP_DNS_SERVER_ADDRESSES, "dns_server_addresses", ValueType::TextList},
    PropertyName{PROP_PROTOCOL_IF_TYPE, "protocol_if_type", ValueType::Number},
    PropertyName{PROP_ENABLED_STATE, "enabled_state", ValueType::Number},
    PropertyName{kAddresses, "addresses", ValueType::Addresses},
    PropertyName{kDnsOwner, "dns_owner", ValueType::Text},
    PropertyName{kDnsProfile, "dns_profile", ValueType::Text},
    PropertyName{kDnsOrigin, "dns_origin", ValueType::Text},
    PropertyName{kDnsServersInFull, "dns_servers_in_full", ValueType::TextList},
    PropertyName{kDnsRoutingDomains, "dns_routing_domains", ValueType::TextList},
    PropertyName{kDnsDefaultRoute, "dns_default_route", ValueType::Text},
    PropertyName{kDnsOverTls, "dns_over_tls", ValueType::Text},
    PropertyName{kDnssec, "dnssec", ValueType::Text},
    PropertyName{kLlmnr, "llmnr", ValueType::Text},
    PropertyName{kMulticastDns, "multicast_dns", ValueType::Text},
    PropertyName{kResolverServers, "resolver_servers", ValueType::TextList},
    PropertyName{kResolverNotAsked, "resolver_servers_not_asked", ValueType::TextList},
    PropertyName{kResolverSearch, "resolver_search", ValueType::TextList},
    PropertyName{kResolverOptions, "resolver_options", ValueType::TextList},
    PropertyName{kReadAt, "read_at", ValueType::Number},
    PropertyName{kReadInterval, "read_interval", ValueType::Number},
    PropertyName{kReadProblem, "read_problem", ValueType::Text},
};

struct OriginName {
  AddressOrigin origin;
  const char* name;
};

constexpr std::array kOrigins{
    OriginName{AddressOrigin::Unknown, "unknown"},
    OriginName{AddressOrigin::Static, "static"},
    OriginName{AddressOrigin::Dhcp, "dhcp"},
    OriginName{AddressOrigin::Slaac, "slaac"},
    OriginName{AddressOrigin::LinkLocal, "link-local"},
};

// The place of a value, for errors: the document and the keys that lead there, as in nodes[0].children[1].name. It
// refers to the place around it, so that keys are composed only for an error.
class Place {
 public:
  Place(const std::string& document, std::string_view key) : document_(document), name_(key) {}

  Place member(std::string_view name) const { return Place(*this, name, 0); }
  Place element(std::size_t index) const { return Place(*this, {}, index); }

  [[noreturn]] void fail(const JsonValue& value, const std::string& problem) const {
    throw ConfigError(document_, value.line, key(), problem);
  }

 private:
  Place(const Place& around, std::string_view name, std::size_t index)
      : document_(around.document_), around_(&around), name_(name), index_(index) {}

  std::string key() const {
    std::string text = around_ == nullptr ? std::string() : around_->key();
    if (name_.data() == nullptr) return text + '[' + std::to_string(index_) + ']';
    if (!text.empty()) text += '.';
    return text.append(name_);
  }

  const std::string& document_;
  const Place* around_ = nullptr;
  std::string_view name_;  // null for an element of a list
  std::size_t index_ = 0;
};

const std::string& textOf(const JsonValue& value, const Place& place) {
  if (value.kind != Kind::Text) place.fail(value, "expected a text");
  return value.text;
}

unsigned int numberOf(const JsonValue& value, const Place& place, unsigned int largest) {
  if (value.kind != Kind::Number || value.number > largest) {
    place.fail(value, "expected a whole number from 0 to " + std::to_string(largest));
  }
  return static_cast<unsigned int>(value.number);
}

const std::vector<JsonValue>& itemsOf(const JsonValue& value, const Place& place) {
  if (value.kind != Kind::List) place.fail(value, "expected a list");
  return value.items;
}

std::string withSuggestion(const std::string& problem, std::string_view word, const std::vector<std::string>& known) {
  const std::string question = util::didYouMean(word, known);
  return question.empty() ? problem : problem + "; " + question;
}

void checkObject(const JsonValue& value, const Place& place, std::initializer_list<std::string_view> known) {
  if (value.kind != Kind::Object) place.fail(value, "expected an object");
  for (std::size_t i = 0; i < value.keys.size(); ++i) {
    if (std::find(known.begin(), known.end(), value.keys[i]) == known.end()) {
      place.member(value.keys[i])
          .fail(value.items[i], withSuggestion("is not a known key", value.keys[i], {known.begin(), known.end()}));
    }
  }
}

const JsonValue& required(const JsonValue& object, const Place& place, const char* key) {
  const JsonValue* value = object.find(key);
  if (value == nullptr) place.member(key).fail(object, "is missing");
  return *value;
}

SharedStrings textsOf(const JsonValue& value, const Place& place) {
  StringList list;
  for (const JsonValue& item : itemsOf(value, place)) list.push_back(textOf(item, place.element(list.size())));
  return std::make_shared<const StringList>(std::move(list));
}

AddressOrigin originOf(const JsonValue& value, const Place& place) {
  const std::string& text = textOf(value, place);
  for (const OriginName& origin : kOrigins) {
    if (text == origin.name) return origin.origin;
  }
  place.fail(value, "expected \"static\", \"dhcp\", \"slaac\", \"link-local\" or \"unknown\"");
}

InterfaceAddress addressOf(const JsonValue& value, const Place& place) {
  constexpr unsigned int kBitsOfIPv4 = 32;
  constexpr unsigned int kBitsOfIPv6 = 128;
  checkObject(value, place, {"address", "prefix_length", "origin"});
  InterfaceAddress result;
  const JsonValue& address = required(value, place, "address");
  result.address = textOf(address, place.member("address"));
  const bool isIPv4 = isIPv4Address(result.address);
  if (!isIPv4 && !isIPv6Address(result.address)) {
    place.member("address").fail(address, "expected an IPv4 or IPv6 address");
  }
  result.prefixLength = numberOf(required(value, place, "prefix_length"), place.member("prefix_length"),
                                 isIPv4 ? kBitsOfIPv4 : kBitsOfIPv6);
  const JsonValue* origin = value.find("origin");
  if (origin != nullptr) result.origin = originOf(*origin, place.member("origin"));
  return result;
}

SharedAddresses addressesOf(const JsonValue& value, const Place& place) {
  AddressList list;
  for (const JsonValue& item : itemsOf(value, place)) list.push_back(addressOf(item, place.element(list.size())));
  return std::make_shared<const AddressList>(std::move(list));
}

const PropertyName& descriptionOf(PropertyNumber number) {
  const auto* found = std::find_if(kProperties.begin(), kProperties.end(),
                                   [number](const PropertyName& property) { return property.number == number; });
  if (found == kProperties.end()) throw std::invalid_argument("no property has that number");
  return *found;
}

PropertyValue valueOf(PropertyNumber number, const JsonValue& value, const Place& place) {
  switch (descriptionOf(number).type) {
    case ValueType::Text:
      return textOf(value, place);
    case ValueType::Number:
      return numberOf(value, place, std::numeric_limits<unsigned int>::max());
    case ValueType::TextList:
      return textsOf(value, place);
    default:
      return addressesOf(value, place);
  }
}

NodeType typeOf(const JsonValue& value, const Place& place) {
  const std::string& text = textOf(value, place);
  for (const TypeName& type : kTypes) {
    if (text == type.name) return type.type;
  }
  place.fail(value, "expected \"System\", \"Port\" or \"NetworkIPConfig\"");
}

std::vector<std::string> propertyNames() {
  std::vector<std::string> names;
  for (const PropertyName& property : kProperties) names.emplace_back(property.name);
  return names;
}

void readProperties(const JsonValue& value, const Place& place, TreeBuilder& builder, std::size_t node) {
  if (value.kind != Kind::Object) place.fail(value, "expected an object");
  for (std::size_t i = 0; i < value.keys.size(); ++i) {
    const Place member = place.member(value.keys[i]);
    const PropertyNumber number = propertyNumber(value.keys[i]);
    if (number == 0) {
      member.fail(value.items[i], withSuggestion("is not a known property", value.keys[i], propertyNames()));
    }
    builder.set(node, number, valueOf(number, value.items[i], member));
  }
}

void readNodes(const JsonValue& value, const Place& place, TreeBuilder& builder, std::size_t parent);

void readNode(const JsonValue& value, const Place& place, TreeBuilder& builder, std::size_t parent) {
  checkObject(value, place, {"type", "name", "description", "properties", "children"});
  const NodeType type = typeOf(required(value, place, "type"), place.member("type"));
  const JsonValue& name = required(value, place, "name");
  const JsonValue* description = value.find("description");
  std::size_t node = 0;
  try {
    node = builder.add(parent, type, textOf(name, place.member("name")),
                       description == nullptr ? "" : textOf(*description, place.member("description")));
  } catch (const std::invalid_argument& error) {
    place.member("name").fail(name, error.what());
  }
  const JsonValue* properties = value.find("properties");
  if (properties != nullptr) readProperties(*properties, place.member("properties"), builder, node);
  const JsonValue* children = value.find("children");
  if (children != nullptr) readNodes(*children, place.member("children"), builder, node);
}

// The names of siblings, each with its index in their list, by name.
void refuseRepeatedNames(const std::vector<JsonValue>& siblings, const Place& place) {
  std::vector<std::pair<std::string_view, std::size_t>> names;
  for (std::size_t i = 0; i < siblings.size(); ++i) names.emplace_back(siblings[i].find("name")->text, i);
  std::sort(names.begin(), names.end());
  const auto repeated = std::adjacent_find(
      names.begin(), names.end(), [](const auto& left, const auto& right) { return left.first == right.first; });
  if (repeated == names.end()) return;
  const std::size_t second = std::next(repeated)->second;
  place.element(second).member("name").fail(*siblings[second].find("name"), "is the name of a sibling too");
}

void readNodes(const JsonValue& value, const Place& place, TreeBuilder& builder, std::size_t parent) {
  const std::vector<JsonValue>& nodes = itemsOf(value, place);
  for (std::size_t i = 0; i < nodes.size(); ++i) readNode(nodes[i], place.element(i), builder, parent);
  refuseRepeatedNames(nodes, place);
}

JsonValue addressesToJson(const AddressList& addresses) {
  JsonValue list = JsonValue::list();
  for (const InterfaceAddress& address : addresses) {
    JsonValue item = JsonValue::object();
    item.add("address", JsonValue::ofText(address.address));
    item.add("prefix_length", JsonValue::ofNumber(address.prefixLength));
    for (const OriginName& origin : kOrigins) {
      if (origin.origin == address.origin) item.add("origin", JsonValue::ofText(origin.name));
    }
    list.add(std::move(item));
  }
  return list;
}

JsonValue nodesToJson(const TreeSnapshot& tree, const Node& parent) {
  JsonValue list = JsonValue::list();
  for (const Node* node : tree.children(parent)) {
    JsonValue item = JsonValue::object();
    for (const TypeName& type : kTypes) {
      if (type.type == node->type()) item.add("type", JsonValue::ofText(type.name));
    }
    item.add("name", JsonValue::ofText(node->name()));
    item.add("description", JsonValue::ofText(node->description()));
    JsonValue properties = JsonValue::object();
    for (const PropertyName& name : kProperties) {
      const Property* property = node->find(name.number);
      if (property != nullptr) properties.add(name.name, propertyToJson(property->value));
    }
    if (!properties.items.empty()) item.add("properties", std::move(properties));
    JsonValue children = nodesToJson(tree, *node);
    if (!children.items.empty()) item.add("children", std::move(children));
    list.add(std::move(item));
  }
  return list;
}

}  // namespace

const char* propertyName(PropertyNumber number) {
  for (const PropertyName& property : kProperties) {
    if (property.number == number) return property.name;
  }
  return nullptr;
}

PropertyNumber propertyNumber(std::string_view name) {
  for (const PropertyName& property : kProperties) {
    if (property.name == name) return property.number;
  }
  return 0;
}

PropertyValue propertyFromJson(PropertyNumber number, const JsonValue& value, const std::string& document,
                               const std::string& key) {
  return valueOf(number, value, Place(document, key));
}

JsonValue propertyToJson(const PropertyValue& value) {
  if (const auto* number = std::get_if<unsigned int>(&value)) return JsonValue::ofNumber(*number);
  if (const auto* text = std::get_if<std::string>(&value)) return JsonValue::ofText(*text);
  if (const auto* addresses = std::get_if<SharedAddresses>(&value)) return addressesToJson(**addresses);
  return JsonValue::ofTexts(*std::get<SharedStrings>(value));
}

JsonValue treeToJsonValue(const TreeSnapshot& tree) {
  JsonValue document = JsonValue::object();
  document.add("version", JsonValue::ofNumber(kTreeVersion));
  document.add("system_name", JsonValue::ofText(tree.systemName()));
  document.add("nodes", nodesToJson(tree, tree.root()));
  return document;
}

std::shared_ptr<const TreeSnapshot> treeFromJsonValue(const JsonValue& document, const std::string& name) {
  const Place place(name, "");
  checkObject(document, place, {"version", "system_name", "nodes"});
  if (const JsonValue* version = document.find("version"); version != nullptr) {
    if (version->kind != Kind::Number || version->number != kTreeVersion) {
      place.member("version").fail(*version,
                                   "expected " + std::to_string(kTreeVersion) + ", the one that is known here");
    }
  }
  const JsonValue* systemName = document.find("system_name");
  TreeBuilder builder(systemName == nullptr ? "" : textOf(*systemName, place.member("system_name")));
  const JsonValue* nodes = document.find("nodes");
  if (nodes != nullptr) readNodes(*nodes, place.member("nodes"), builder, 0);
  return builder.finish();
}

}  // namespace zorva::agent
