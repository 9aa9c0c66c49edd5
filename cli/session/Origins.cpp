#include "cli/session/Origins.h"

#include <cmpidt.h>

#include <chrono>
#include <cstdint>
#include <memory>

#include "agent/Agent.h"
#include "agent/tree/BmcJson.h"
#include "cli/output/ValueText.h"
#include "cli/session/SettingFiles.h"
#include "frontend/SettingOrigins.h"
#include "frontend/SettingsClaims.h"

namespace zorva::cli {

namespace {

// Of this host.

OwnerFacts ownerFacts(const zorva::agent::Node& node) {
  using namespace zorva::agent;
  return {node.textOrEmpty(kDnsOwner),
          node.textOrEmpty(kDnsProfile),
          node.textOrEmpty(kDnsOrigin),
          node.listOrEmpty(kDnsServersInFull),
          node.listOrEmpty(kDnsRoutingDomains),
          node.textOrEmpty(kDnsDefaultRoute),
          node.textOrEmpty(kDnsOverTls),
          node.textOrEmpty(kDnssec),
          node.textOrEmpty(kLlmnr),
          node.textOrEmpty(kMulticastDns)};
}

/// What the node of the host's system says.
void readSystemNode(const zorva::agent::TreeSnapshot& tree, HostRow& host) {
  using namespace zorva::agent;
  const Node* node = tree.ownSystem();
  if (node == nullptr) return;
  host.facts = ownerFacts(*node);
  host.servers = node->listOrEmpty(ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES);
  host.ownSuffixes = node->listOrEmpty(ZV::NodeLexicon::PROP_DNS_SUFFIXES);
  host.resolverServers = node->listOrEmpty(kResolverServers);
  host.resolverNotAsked = node->listOrEmpty(kResolverNotAsked);
  host.resolverSearch = node->listOrEmpty(kResolverSearch);
  host.resolverOptions = node->listOrEmpty(kResolverOptions);
}

std::uint64_t secondsNow() {
  const auto now = std::chrono::system_clock::now().time_since_epoch();
  return static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::seconds>(now).count());
}

std::optional<BmcReading> readingOfBmc(const zorva::agent::TreeSnapshot& tree) {
  using namespace zorva::agent;
  for (const Node& node : tree.nodes()) {
    const unsigned int* at = node.number(kReadAt);
    const unsigned int* interval = node.number(kReadInterval);
    if (!node.isServiceProcessor() || at == nullptr || interval == nullptr) continue;
    BmcState state;
    state.readAt = *at;
    state.interval = *interval;
    const std::uint64_t now = secondsNow();
    return BmcReading{*at, now > *at ? now - *at : 0, state.isUnknownAt(now), node.textOrEmpty(kReadProblem)};
  }
  return std::nullopt;
}

Origins originsOfThisHost(const Session& session) {
  const std::shared_ptr<const zorva::agent::TreeSnapshot> tree = session.tree();
  const SettingFiles files = findSettingFiles(zorva::agent::dataDirectory());
  Origins origins;
  for (const zorva::agent::Node& node : tree->nodes()) {
    const std::string* name = node.text(ZV::NodeLexicon::PROP_NAME);
    if (node.type() != zorva::agent::NodeType::NetworkIPConfig || name == nullptr) continue;
    const auto [place, isNew] = origins.interfaces.try_emplace({tree->systemOf(node).isServiceProcessor(), *name});
    if (!isNew) continue;
    place->second = {files.has(*name), frontend::setPropertiesOf(node), ownerFacts(node),
                     node.listOrEmpty(ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES)};
  }
  origins.host.interface = frontend::interfaceOfHostSettings(*tree).value_or("");
  origins.host.hasFile = files.has(origins.host.interface);
  readSystemNode(*tree, origins.host);
  origins.bmc = readingOfBmc(*tree);
  return origins;
}

// Of another host.

OwnerFacts ownerFacts(const broker::Instance& instance) {
  OwnerFacts facts;
  facts.owner = propertyText(instance, "Owner");
  facts.profile = propertyText(instance, "OwnerProfile");
  facts.origin = propertyText(instance, "OwnerOrigin");
  return facts;
}

bool hasFile(const broker::Instance& instance) { return !propertyText(instance, "File").empty(); }

/// The interface whose file has that name.
std::string interfaceOfFile(const std::string& name) {
  const std::string prefix = zorva::agent::settingFileName("");
  return name.starts_with(prefix) ? name.substr(prefix.size()) : std::string();
}

void add(Origins& origins, const broker::Instance& instance) {
  const std::string id = propertyText(instance, "InstanceID");
  const bool isServiceProcessor = id.starts_with("BMC%");
  if (isServiceProcessor || id.starts_with("Computer%")) {
    origins.interfaces.try_emplace({isServiceProcessor, frontend::interfaceOfId(id)},
                                   Origin{hasFile(instance), propertyTexts(instance, "SetProperties"),
                                          ownerFacts(instance), propertyTexts(instance, "OwnerServers")});
    return;
  }
  HostRow& host = origins.host;
  host.interface = interfaceOfFile(propertyText(instance, "FileName"));
  host.hasFile = hasFile(instance);
  host.facts = ownerFacts(instance);
  host.servers = propertyTexts(instance, "OwnerServers");
  host.resolverServers = propertyTexts(instance, "ResolverServers");
  host.resolverNotAsked = propertyTexts(instance, "ResolverServersNotAsked");
  host.resolverSearch = propertyTexts(instance, "ResolverSearch");
}

std::optional<Origins> originsOfServer(Session& session, std::vector<Problem>& problems) {
  Origins origins;
  const broker::Status status =
      session.cim().enumerateInstances({}, frontend::kSettingOriginClass, {}, [&](const broker::Instance& instance) {
        add(origins, instance);
        return true;
      });
  if (status.ok()) return origins;
  const bool hasNoSuchClass = status.rc == CMPI_RC_ERR_INVALID_CLASS || status.rc == CMPI_RC_ERR_NOT_SUPPORTED;
  if (!hasNoSuchClass) addProblem(problems, frontend::kSettingOriginClass, statusText(status));
  return std::nullopt;
}

}  // namespace

const Origin* Origins::find(const std::string& interface, bool isServiceProcessor) const {
  const auto found = interfaces.find({isServiceProcessor, interface});
  return found == interfaces.end() ? nullptr : &found->second;
}

std::optional<Origins> readOrigins(Session& session, std::vector<Problem>& problems) {
  if (session.isRemote()) return originsOfServer(session, problems);
  return originsOfThisHost(session);
}

}  // namespace zorva::cli
