#include "agent/sources/DnsProperties.h"

#include <memory>
#include <utility>

namespace zorva::agent {
namespace {

const char* wordOf(DnsOrigin origin) {
  switch (origin) {
    case DnsOrigin::Static:
      return "static";
    case DnsOrigin::Learned:
      return "learned";
    case DnsOrigin::Mixed:
      return "mixed";
    default:
      return "";
  }
}

}  // namespace

SharedStrings share(StringList list) { return std::make_shared<const StringList>(std::move(list)); }

void setDnsProperties(TreeBuilder& builder, std::size_t node, const DnsFacts& facts) {
  const auto setText = [&](PropertyNumber number, const std::string& text) {
    if (!text.empty()) builder.set(node, number, text);
  };
  const auto setList = [&](PropertyNumber number, const StringList& list) {
    if (!list.empty()) builder.set(node, number, share(list));
  };
  setText(kDnsOwner, facts.owner);
  setText(kDnsProfile, facts.profile);
  setText(kDnsOrigin, wordOf(facts.origin));
  setList(kDnsServersInFull, facts.serversInFull);
  setList(kDnsRoutingDomains, facts.routingDomains);
  if (facts.defaultRoute.has_value()) setText(kDnsDefaultRoute, *facts.defaultRoute ? "yes" : "no");
  setText(kDnsOverTls, facts.dnsOverTls);
  setText(kDnssec, facts.dnssec);
  setText(kLlmnr, facts.llmnr);
  setText(kMulticastDns, facts.multicastDns);
}

void setResolverProperties(TreeBuilder& builder, std::size_t node, const ResolvConf& conf) {
  builder.set(node, kResolverServers, share(conf.servers));
  if (!conf.notAsked.empty()) builder.set(node, kResolverNotAsked, share(conf.notAsked));
  builder.set(node, kResolverSearch, share(conf.search));
  if (!conf.options.empty()) builder.set(node, kResolverOptions, share(conf.options));
}

}  // namespace zorva::agent
