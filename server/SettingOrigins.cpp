#include "server/SettingOrigins.h"

#include <set>
#include <string>
#include <utility>

#include "agent/Agent.h"
#include "agent/files/SettingFiles.h"
#include "agent/interface/PlatformUtilities.h"
#include "frontend/SettingOrigins.h"
#include "frontend/SettingsClaims.h"
#include "host/HostProvider.h"

namespace zorva::server {

namespace {

using agent::Node;
using host::HostObject;

constexpr const char* kPrefix = "SettingOrigin";

void addText(HostObject& object, const char* name, const std::string* text) {
  if (text != nullptr && !text->empty()) object.properties.push_back({name, *text});
}

void addList(HostObject& object, const char* name, const agent::StringList* list) {
  if (list != nullptr && !list->empty()) object.properties.push_back({name, *list});
}

HostObject originOf(const std::string& id, const std::string& interface, const agent::SettingFiles& files) {
  HostObject origin{frontend::kSettingOriginClass, {{"InstanceID", id}}, {}};
  if (interface.empty()) return origin;
  const std::string file = agent::settingFileName(interface);
  origin.properties.push_back({"FileName", file});
  if (files.has(interface)) origin.properties.push_back({"File", file});
  return origin;
}

void addOwner(HostObject& origin, const Node& node) {
  addText(origin, "Owner", node.text(agent::kDnsOwner));
  addText(origin, "OwnerProfile", node.text(agent::kDnsProfile));
  addText(origin, "OwnerOrigin", node.text(agent::kDnsOrigin));
  addList(origin, "OwnerServers", node.list(ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES));
}

HostObject originOfInterface(const Node& node, const std::string& name, bool isServiceProcessor,
                             const agent::SettingFiles& files) {
  HostObject origin = originOf(frontend::settingIdOf(name, isServiceProcessor), name, files);
  addOwner(origin, node);
  const agent::StringList set = frontend::setPropertiesOf(node);
  addList(origin, "SetProperties", &set);
  return origin;
}

HostObject originOfHost(const agent::TreeSnapshot& tree, const agent::SettingFiles& files) {
  HostObject origin =
      originOf("dnsgen1:" + ZV::getSystemName(), frontend::interfaceOfHostSettings(tree).value_or(""), files);
  const Node* system = tree.ownSystem();
  if (system == nullptr) return origin;
  addOwner(origin, *system);
  addList(origin, "ResolverServers", system->list(agent::kResolverServers));
  addList(origin, "ResolverServersNotAsked", system->list(agent::kResolverNotAsked));
  addList(origin, "ResolverSearch", system->list(agent::kResolverSearch));
  return origin;
}

using Provider = host::Provider<settingOrigins>;

CMPIInstanceMI* create(const CMPIBroker* broker, const CMPIContext*, CMPIStatus*) {
  static CMPIInstanceMIFT table = Provider::table("instanceSettingOrigin");
  static CMPIInstanceMI mi = {nullptr, &table};
  Provider::broker = broker;
  return &mi;
}

}  // namespace

std::vector<HostObject> settingOrigins(const agent::TreeSnapshot& tree) {
  const agent::SettingFiles files = agent::findSettingFiles(agent::dataDirectory());
  std::vector<HostObject> origins;
  std::set<std::pair<bool, std::string>> seen;
  for (const Node& node : tree.nodes()) {
    const std::string* name = node.text(ZV::NodeLexicon::PROP_NAME);
    if (node.type() != agent::NodeType::NetworkIPConfig || name == nullptr) continue;
    const bool isServiceProcessor = tree.systemOf(node).isServiceProcessor();
    if (!seen.emplace(isServiceProcessor, *name).second) continue;
    origins.push_back(originOfInterface(node, *name, isServiceProcessor, files));
  }
  origins.push_back(originOfHost(tree, files));
  return origins;
}

void serveSettingOrigins(broker::BrokerOptions& options) {
  options.registry.add({frontend::kSettingOriginClass, kPrefix, "", broker::InstanceMi});
  options.linked.push_back({std::string(kPrefix) + "_Create_InstanceMI", reinterpret_cast<void (*)()>(create)});
}

}  // namespace zorva::server
