#include "metrics/HostMetrics.h"

#include <algorithm>
#include <set>
#include <string>
#include <string_view>
#include <utility>

namespace zorva::metrics {

namespace {

using agent::Node;
using agent::StringList;
using agent::TreeSnapshot;
using namespace ZV::NodeLexicon;

constexpr const char* kHost = "host";
constexpr const char* kBmc = "bmc";

struct Interface {
  std::string_view system;
  std::string_view name;
  const Node* node;
};

struct Interfaces {
  std::vector<Interface> shown;
  std::size_t leftOut = 0;
};

Interfaces interfacesOf(const TreeSnapshot& tree) {
  Interfaces result;
  std::set<std::pair<std::string_view, std::string_view>> seen;
  for (const Node& node : tree.nodes()) {
    const std::string* name = node.text(PROP_NAME);
    if (node.type() != agent::NodeType::NetworkIPConfig || name == nullptr) continue;
    const std::string_view system = tree.systemOf(node).isServiceProcessor() ? kBmc : kHost;
    // Names that the label cuts would make two series of one name.
    const std::string_view key = std::string_view(*name).substr(0, Exposition::kLongestLabel / 4);
    if (!seen.insert({system, key}).second) continue;
    if (result.shown.size() < kMostInterfaces) {
      result.shown.push_back({system, key, &node});
    } else {
      ++result.leftOut;
    }
  }
  return result;
}

std::size_t sizeOf(const Node& node, agent::PropertyNumber number) {
  const StringList* list = node.list(number);
  return list == nullptr ? 0 : list->size();
}

/// The sizes of a list of every interface that has it.
void writeSizes(Exposition& out, const Interfaces& interfaces, agent::PropertyNumber number) {
  for (const Interface& each : interfaces.shown) {
    if (each.node->list(number) == nullptr) continue;
    out.sample({{"system", each.system}, {"interface", each.name}}, static_cast<double>(sizeOf(*each.node, number)));
  }
}

/// How many servers are left out.
std::size_t writeServers(Exposition& out, const Interfaces& interfaces) {
  std::size_t written = 0;
  std::size_t leftOut = 0;
  out.family("zorva_dns_server_info", Type::Gauge,
             "A DNS server of an interface, its place in the search order, and the program or file that names it.");
  for (const Interface& each : interfaces.shown) {
    const StringList* servers = each.node->list(PROP_DNS_SERVER_ADDRESSES);
    if (servers == nullptr) continue;
    const std::size_t most = std::min({servers->size(), kMostServersOfInterface, kMostServers - written});
    for (std::size_t i = 0; i < most; ++i) {
      out.sample({{"system", each.system},
                  {"interface", each.name},
                  {"order", std::to_string(i + 1)},
                  {"address", (*servers)[i]},
                  {"owner", each.node->textOrEmpty(agent::kDnsOwner)}},
                 1);
    }
    written += most;
    leftOut += servers->size() - most;
  }
  return leftOut;
}

/// Interfaces whose state is not known have no sample.
void writeStates(Exposition& out, const Interfaces& interfaces) {
  const auto write = [&](auto holds) {
    for (const Interface& each : interfaces.shown) {
      const unsigned int* state = each.node->number(PROP_ENABLED_STATE);
      if (state != nullptr) out.sample({{"system", each.system}, {"interface", each.name}}, holds(*state) ? 1 : 0);
    }
  };
  out.family("zorva_interface_enabled", Type::Gauge, "Whether the interface is up for its administrator.");
  write([](unsigned int state) { return state != agent::kRawDown; });
  out.family("zorva_interface_carrier", Type::Gauge, "Whether the interface is up and has a carrier.");
  write([](unsigned int state) { return state == agent::kRawUpWithCarrier; });
}

/// The nodes of service processors, or of the host itself.
template <typename Each>
void forEachSystem(const TreeSnapshot& tree, bool isServiceProcessor, Each each) {
  for (const Node* node = tree.nextOfType(agent::NodeType::System, 0); node != nullptr;
       node = tree.nextOfType(agent::NodeType::System, node->index() + 1)) {
    if (node->isServiceProcessor() == isServiceProcessor) each(*node);
  }
}

void writeResolver(Exposition& out, const TreeSnapshot& tree) {
  out.family("zorva_resolver_server_info", Type::Gauge,
             "A DNS server that the C library asks, and its place in /etc/resolv.conf.");
  bool isFirst = true;
  forEachSystem(tree, false, [&](const Node& system) {
    const StringList* servers = std::exchange(isFirst, false) ? system.list(agent::kResolverServers) : nullptr;
    for (std::size_t i = 0; servers != nullptr && i < std::min(servers->size(), kMostServersOfInterface); ++i) {
      out.sample({{"order", std::to_string(i + 1)}, {"address", (*servers)[i]}}, 1);
    }
  });
}

}  // namespace

void writeServiceProcessors(Exposition& out, const TreeSnapshot& tree, std::uint64_t now) {
  constexpr std::size_t kMostSystems = 64;
  const auto write = [&](auto valueOf) {
    std::size_t written = 0;
    forEachSystem(tree, true, [&](const Node& system) {
      const unsigned int* at = system.number(agent::kReadAt);
      if (at == nullptr || written++ >= kMostSystems) return;
      out.sample({{"bmc", std::string_view(system.name()).substr(0, Exposition::kLongestLabel / 4)}},
                 valueOf(system, *at));
    });
  };
  out.family("zorva_bmc_state_age_seconds", Type::Gauge, "Time since the service processor was read.");
  write([now](const Node&, unsigned int at) { return now > at ? static_cast<double>(now - at) : 0.0; });
  out.family("zorva_bmc_read_failed", Type::Gauge, "Whether the latest reading of the service processor failed.");
  write([](const Node& system, unsigned int) { return system.text(agent::kReadProblem) == nullptr ? 0.0 : 1.0; });
}

void writeTree(Exposition& out, const agent::TreeSnapshot& tree) {
  const Interfaces interfaces = interfacesOf(tree);
  const std::size_t serversLeftOut = writeServers(out, interfaces);
  out.family("zorva_dns_servers", Type::Gauge, "DNS servers of an interface.");
  writeSizes(out, interfaces, PROP_DNS_SERVER_ADDRESSES);
  out.family("zorva_dns_suffixes", Type::Gauge, "DNS suffixes of an interface.");
  writeSizes(out, interfaces, PROP_DNS_SUFFIXES);
  writeStates(out, interfaces);
  writeResolver(out, tree);
  out.family("zorva_metrics_left_out", Type::Gauge, "What is beyond the limits of a scrape and has no series.");
  out.sample({{"what", "interfaces"}}, static_cast<double>(interfaces.leftOut));
  out.sample({{"what", "servers"}}, static_cast<double>(serversLeftOut));
}

void writeDrift(Exposition& out, const std::vector<agent::SettingsDrift>& drifts) {
  out.family("zorva_dns_settings_drift", Type::Gauge,
             "Whether the host differs from the settings in the file of an interface or in the overlay.");
  std::set<std::string_view> seen;
  for (const agent::SettingsDrift& drift : drifts) {
    const std::string_view name = std::string_view(drift.interface).substr(0, Exposition::kLongestLabel / 4);
    if (seen.size() >= kMostInterfaces || !seen.insert(name).second) continue;
    for (const auto& [setting, differs] : {std::pair("servers", drift.servers), std::pair("suffixes", drift.suffixes),
                                           std::pair("domain", drift.domain)}) {
      if (differs.has_value()) out.sample({{"interface", name}, {"setting", setting}}, *differs ? 1 : 0);
    }
  }
}

}  // namespace zorva::metrics
