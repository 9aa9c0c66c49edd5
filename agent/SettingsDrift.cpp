#include "agent/SettingsDrift.h"

#include <algorithm>
#include <utility>

#include "agent/Runtime.h"
#include "agent/apply/HostDns.h"
#include "agent/apply/WantedSettings.h"
#include "agent/config/CurrentConfig.h"
#include "agent/sources/ResolvConf.h"
#include "util/Names.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;
using util::sameName;

StringList ipv4First(StringList servers) {
  std::stable_partition(servers.begin(), servers.end(),
                        [](const std::string& server) { return server.find(':') == std::string::npos; });
  return servers;
}

bool sameServers(StringList wanted, const Node& node) {
  const std::string* owner = node.text(kDnsOwner);
  const bool isResolvConf = owner != nullptr && *owner == kResolvConfOwner;
  if (isResolvConf && wanted.size() > kMostAskedServers) wanted.resize(kMostAskedServers);
  return ipv4First(std::move(wanted)) == ipv4First(node.listOrEmpty(PROP_DNS_SERVER_ADDRESSES));
}

bool contains(const StringList& names, const std::string& name) {
  return std::any_of(names.begin(), names.end(), [&](const std::string& each) { return sameName(each, name); });
}

// Some owners show the domain as the first suffix.
bool sameSuffixes(const WantedSettings& wanted, const Node& node) {
  StringList has = node.listOrEmpty(PROP_DNS_SUFFIXES);
  if (wanted.domain.has_value() && !has.empty() && sameName(has.front(), *wanted.domain) &&
      !contains(*wanted.suffixes, *wanted.domain)) {
    has.erase(has.begin());
  }
  return std::equal(has.begin(), has.end(), wanted.suffixes->begin(), wanted.suffixes->end(), sameName);
}

bool hasDomain(const std::string& domain, const Node& node) {
  return sameName(node.textOrEmpty(PROP_DOMAIN_NAME), domain) || contains(node.listOrEmpty(PROP_DNS_SUFFIXES), domain);
}

SettingsDrift driftOf(const std::string& interface, const WantedSettings& read, const Node& node) {
  SettingsDrift drift{interface, std::nullopt, std::nullopt, std::nullopt};
  const auto wanted = checked(read, interface);
  if (read.servers.has_value()) drift.servers = !wanted || !sameServers(*wanted->servers, node);
  if (read.suffixes.has_value()) drift.suffixes = !wanted || !sameSuffixes(*wanted, node);
  if (read.domain.has_value()) drift.domain = !wanted || !hasDomain(*wanted->domain, node);
  return drift;
}

}  // namespace

std::vector<SettingsDrift> settingsDrift() {
  const std::shared_ptr<const TreeSnapshot> tree = Runtime::instance().lookAtSource();
  const std::string& dataDir = CurrentConfig::instance().get().dataDir;
  const OverlayValues overlay = Runtime::instance().overlay().readIfGood();  // as the tree takes it
  std::vector<SettingsDrift> drifts;
  for (const Node& node : tree->nodes()) {
    const std::string* interface = node.text(PROP_NAME);
    if (node.type() != NodeType::NetworkIPConfig || interface == nullptr) continue;
    if (tree->systemOf(node).isServiceProcessor()) continue;
    const auto wanted = readWanted(dataDir, *interface, overlay, node.path());
    if (!wanted) {
      drifts.push_back({*interface, true, true, true});
    } else if (wanted->any()) {
      drifts.push_back(driftOf(*interface, *wanted, node));
    }
  }
  return drifts;
}

}  // namespace zorva::agent
