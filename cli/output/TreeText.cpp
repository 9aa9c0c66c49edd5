#include "cli/output/TreeText.h"

#include <algorithm>
#include <vector>

#include "cli/output/Text.h"

namespace zorva::cli {

namespace {

struct PropertyWord {
  agent::PropertyNumber number;
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
    {agent::kAddresses, "addresses"},
    {agent::kDnsOwner, "dns_owner"},
    {agent::kDnsProfile, "dns_profile"},
    {agent::kDnsOrigin, "dns_origin"},
    {agent::kDnsServersInFull, "dns_servers_in_full"},
    {agent::kDnsRoutingDomains, "dns_routing_domains"},
    {agent::kDnsDefaultRoute, "dns_default_route"},
    {agent::kDnsOverTls, "dns_over_tls"},
    {agent::kDnssec, "dnssec"},
    {agent::kLlmnr, "llmnr"},
    {agent::kMulticastDns, "multicast_dns"},
    {agent::kResolverServers, "resolver_servers"},
    {agent::kResolverNotAsked, "resolver_servers_not_asked"},
    {agent::kResolverSearch, "resolver_search"},
    {agent::kResolverOptions, "resolver_options"},
};

const char* originWord(agent::AddressOrigin origin) noexcept {
  switch (origin) {
    case agent::AddressOrigin::Static:
      return " static";
    case agent::AddressOrigin::Dhcp:
      return " dhcp";
    case agent::AddressOrigin::Slaac:
      return " slaac";
    case agent::AddressOrigin::LinkLocal:
      return " link-local";
    case agent::AddressOrigin::Unknown:
      break;
  }
  return "";
}

struct ValueWords {
  std::vector<std::string> operator()(unsigned int number) const { return {std::to_string(number)}; }
  std::vector<std::string> operator()(const std::string& text) const { return {text}; }
  std::vector<std::string> operator()(const agent::SharedStrings& list) const { return *list; }
  std::vector<std::string> operator()(const agent::SharedAddresses& list) const {
    std::vector<std::string> texts;
    for (const agent::InterfaceAddress& each : *list) {
      texts.push_back(each.address + "/" + std::to_string(each.prefixLength) + originWord(each.origin));
    }
    return texts;
  }
};

const char* typeWord(agent::NodeType type) noexcept {
  switch (type) {
    case agent::NodeType::System:
      return "System";
    case agent::NodeType::Port:
      return "Port";
    case agent::NodeType::NetworkIPConfig:
      return "NetworkIPConfig";
    case agent::NodeType::Root:
      break;
  }
  return "";
}

std::size_t depthOf(const agent::TreeSnapshot& tree, const agent::Node& node) {
  std::size_t depth = 0;
  for (const agent::Node* at = &node; at->type() != agent::NodeType::Root; at = &tree.parent(*at)) ++depth;
  return depth;
}

std::string headLine(const agent::Node& node, std::size_t indent, const Layout& layout) {
  std::string line(indent, ' ');
  line += styled(printable(node.name()), Style::Heading, layout) + "  " + typeWord(node.type());
  if (!node.description().empty()) line += ", \"" + printable(node.description()) + "\"";
  return line + "\n";
}

std::string propertyLines(const agent::Node& node, std::size_t indent, const Layout& layout) {
  Table table({}, indent);
  for (const PropertyWord& known : kProperties) {
    const agent::Property* property = node.find(known.number);
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

std::vector<std::string> valueTexts(const agent::PropertyValue& value) { return std::visit(ValueWords(), value); }

std::string treeText(const agent::TreeSnapshot& tree, const Layout& layout) {
  std::string out = styled(printable(tree.systemName()), Style::Heading, layout) + "\n";
  for (const agent::Node& node : tree.nodes()) {
    if (node.type() == agent::NodeType::Root) continue;
    const std::size_t indent = 2 * depthOf(tree, node);
    out += headLine(node, indent, layout) + propertyLines(node, indent + 4, layout);
  }
  return out;
}

}  // namespace zorva::cli
