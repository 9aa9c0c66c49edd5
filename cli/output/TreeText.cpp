#include "cli/output/TreeText.h"

#include <algorithm>
#include <vector>

#include "cli/output/Text.h"

namespace zorva::cli {

namespace {

using zorva::agent::Node;
using zorva::agent::NodeType;
using zorva::agent::Property;
using zorva::agent::TreeSnapshot;

struct PropertyWord {
  zorva::agent::PropertyNumber number;
  const char* word;  // as in the JSON document of a tree
};

constexpr PropertyWord kProperties[] = {
    {ZV::NodeLexicon::PROP_NAME, "name"},
    {ZV::NodeLexicon::PROP_HOST_NAME, "host_name"},
    {ZV::NodeLexicon::PROP_DOMAIN_NAME, "domain_name"},
    {ZV::NodeLexicon::PROP_DNS_SUFFIXES, "dns_suffixes"},
    {ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES, "dns_server_addresses"},
    {ZV::NodeLexicon::PROP_PROTOCOL_IF_TYPE, "protocol_if_type"},
    {ZV::NodeLexicon::PROP_ENABLED_STATE, "enabled_state"},
    {zorva::agent::kAddresses, "addresses"},
    {zorva::agent::kDnsOwner, "dns_owner"},
    {zorva::agent::kDnsProfile, "dns_profile"},
    {zorva::agent::kDnsOrigin, "dns_origin"},
    {zorva::agent::kDnsServersInFull, "dns_servers_in_full"},
    {zorva::agent::kDnsRoutingDomains, "dns_routing_domains"},
    {zorva::agent::kDnsDefaultRoute, "dns_default_route"},
    {zorva::agent::kDnsOverTls, "dns_over_tls"},
    {zorva::agent::kDnssec, "dnssec"},
    {zorva::agent::kLlmnr, "llmnr"},
    {zorva::agent::kMulticastDns, "multicast_dns"},
    {zorva::agent::kResolverServers, "resolver_servers"},
    {zorva::agent::kResolverNotAsked, "resolver_servers_not_asked"},
    {zorva::agent::kResolverSearch, "resolver_search"},
    {zorva::agent::kResolverOptions, "resolver_options"},
};

const char* originWord(zorva::agent::AddressOrigin origin) noexcept {
  switch (origin) {
    case zorva::agent::AddressOrigin::Static:
      return " static";
    case zorva::agent::AddressOrigin::Dhcp:
      return " dhcp";
    case zorva::agent::AddressOrigin::Slaac:
      return " slaac";
    case zorva::agent::AddressOrigin::LinkLocal:
      return " link-local";
    case zorva::agent::AddressOrigin::Unknown:
      break;
  }
  return "";
}

struct ValueWords {
  std::vector<std::string> operator()(unsigned int number) const { return {std::to_string(number)}; }
  std::vector<std::string> operator()(const std::string& text) const { return {text}; }
  std::vector<std::string> operator()(const zorva::agent::SharedStrings& list) const { return *list; }
  std::vector<std::string> operator()(const zorva::agent::SharedAddresses& list) const {
    std::vector<std::string> texts;
    for (const zorva::agent::InterfaceAddress& each : *list) {
      texts.push_back(each.address + "/" + std::to_string(each.prefixLength) + originWord(each.origin));
    }
    return texts;
  }
};

const char* typeWord(NodeType type) noexcept {
  switch (type) {
    case NodeType::System:
      return "System";
    case NodeType::Port:
      return "Port";
    case NodeType::NetworkIPConfig:
      return "NetworkIPConfig";
    case NodeType::Root:
      break;
  }
  return "";
}

std::size_t depthOf(const TreeSnapshot& tree, const Node& node) {
  std::size_t depth = 0;
  for (const Node* at = &node; at->type() != NodeType::Root; at = &tree.parent(*at)) ++depth;
  return depth;
}

std::string headLine(const Node& node, std::size_t indent, const Layout& layout) {
  std::string line(indent, ' ');
  line += styled(printable(node.name()), Style::Heading, layout) + "  " + typeWord(node.type());
  if (!node.description().empty()) line += ", \"" + printable(node.description()) + "\"";
  return line + "\n";
}

std::string propertyLines(const Node& node, std::size_t indent, const Layout& layout) {
  Table table({}, indent);
  for (const PropertyWord& known : kProperties) {
    const Property* property = node.find(known.number);
    if (property == nullptr) continue;
    const std::string value = joined(valueTexts(property->value), ", ");
    if (property->overlaid) {
      table.add({known.word, Cell(value + "  (set; not the host's own)", Style::Warning)});
    } else {
      table.add({known.word, value});
    }
  }
  return table.text(layout);
}

}  // namespace

std::vector<std::string> valueTexts(const zorva::agent::PropertyValue& value) {
  return std::visit(ValueWords(), value);
}

std::string treeText(const TreeSnapshot& tree, const Layout& layout) {
  std::string out = styled(printable(tree.systemName()), Style::Heading, layout) + "\n";
  for (const Node& node : tree.nodes()) {
    if (node.type() == NodeType::Root) continue;
    const std::size_t indent = 2 * depthOf(tree, node);
    out += headLine(node, indent, layout) + propertyLines(node, indent + 4, layout);
  }
  return out;
}

}  // namespace zorva::cli
