#include "frontend/SettingOrigins.h"

#include <utility>

#include "agent/interface/NodeLexicon.h"

namespace zorva::frontend {

std::vector<std::string> setPropertiesOf(const zorva::agent::Node& node) {
  constexpr std::pair<zorva::agent::PropertyNumber, const char*> kNames[] = {
      {ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES, "DNSServerAddresses"},
      {ZV::NodeLexicon::PROP_HOST_NAME, "Hostname"},
      {ZV::NodeLexicon::PROP_DOMAIN_NAME, "DomainName"},
      {ZV::NodeLexicon::PROP_DNS_SUFFIXES, "DNSSuffixesToAppend"},
  };
  std::vector<std::string> names;
  for (const auto& [number, name] : kNames) {
    const zorva::agent::Property* property = node.find(number);
    if (property != nullptr && property->overlaid) names.emplace_back(name);
  }
  return names;
}

}  // namespace zorva::frontend
