#include "cli/session/HostView.h"

#include <sys/stat.h>

#include <algorithm>
#include <map>
#include <string_view>
#include <utility>

#include "agent/Agent.h"
#include "cli/output/Failure.h"
#include "cli/output/ValueText.h"

namespace zorva::cli {

namespace {

std::optional<std::uint64_t> numberOf(const broker::Instance& instance, std::string_view property) {
  const broker::Value* value = instance.property(property);
  if (value == nullptr || value->isNull) return std::nullopt;
  const auto* number = std::get_if<std::uint64_t>(&value->scalar);
  return number == nullptr ? std::nullopt : std::optional(*number);
}

std::vector<std::string> textsOf(const broker::Value& value) {
  std::vector<std::string> texts;
  if (value.isNull) return texts;
  if (!value.isArray) return {scalarText(value.scalar)};
  for (const broker::Scalar& element : value.elements) texts.push_back(scalarText(element));
  return texts;
}

EndpointRow endpointRow(const broker::Instance& instance) {
  EndpointRow row;
  row.name = propertyText(instance, "Name");
  row.system = propertyText(instance, "SystemName");
  row.hostName = propertyText(instance, "Hostname");
  row.domainName = propertyText(instance, "DomainName");
  if (const broker::Value* suffixes = instance.property("DNSSuffixesToAppend")) row.suffixes = textsOf(*suffixes);
  row.stateNumber = numberOf(instance, "EnabledState");
  const auto declared = std::find_if(instance.properties.begin(), instance.properties.end(),
                                     [](const broker::Property& property) { return property.name == "EnabledState"; });
  if (row.stateNumber && declared != instance.properties.end() && declared->declaration != nullptr) {
    const auto number = static_cast<std::int64_t>(*row.stateNumber);
    row.state = valueWord(*declared->declaration, number).value_or(std::to_string(*row.stateNumber));
  }
  return row;
}

bool fileStands(const std::string& interface) {
  struct stat status {};
  return ::stat((zorva::agent::dataDirectory() + "ifcfg-" + interface).c_str(), &status) == 0;
}

/// A setting that the providers read from a file or the host.
struct SettingName {
  const char* property;
  bool isList;
  zorva::agent::PropertyNumber number;  ///< of the host's value; kNoNumber: it is only in the file
};

constexpr zorva::agent::PropertyNumber kNoNumber = 0;

constexpr SettingName kInterfaceSettings[] = {
    {"RequestedHostname", false, ZV::NodeLexicon::PROP_HOST_NAME},
    {"DomainName", false, ZV::NodeLexicon::PROP_DOMAIN_NAME},
    {"DNSServerAddresses", true, ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES},
    {"ConfigurationName", false, kNoNumber},
};
constexpr SettingName kHostSettings[] = {
    {"DNSSuffixesToAppend", true, ZV::NodeLexicon::PROP_DNS_SUFFIXES},
    {"ConfigurationName", false, kNoNumber},
};

/// The source of an interface's settings.
struct Origin {
  std::string interface;
  const zorva::agent::Node* node = nullptr;  ///< null: not in the tree
};

/// Only the file counts if it exists: a key that it lacks is an empty value and not the host's.
SettingSource sourceOf(const Origin& origin, zorva::agent::PropertyNumber number, bool hasValue) {
  if (fileStands(origin.interface)) return SettingSource::File;
  if (number == kNoNumber || !hasValue) return SettingSource::None;
  const zorva::agent::Property* property = origin.node == nullptr ? nullptr : origin.node->find(number);
  return property != nullptr && property->overlaid ? SettingSource::Set : SettingSource::Host;
}

/// The configurations of a tree by the names of their interfaces; the first of several with one name.
class Configurations {
 public:
  explicit Configurations(const zorva::agent::TreeSnapshot& tree) {
    for (const zorva::agent::Node& node : tree.nodes()) {
      const std::string* name = node.text(ZV::NodeLexicon::PROP_NAME);
      if (node.type() != zorva::agent::NodeType::NetworkIPConfig || name == nullptr) continue;
      const bool isServiceProcessor = tree.parent(tree.parent(node)).description() == "BMC";
      byName_.try_emplace({isServiceProcessor, *name}, &node);
    }
  }

  /// Null if there is none.
  const zorva::agent::Node* find(const std::string& interface, bool isServiceProcessor) const {
    const auto found = byName_.find({isServiceProcessor, interface});
    return found == byName_.end() ? nullptr : found->second;
  }

 private:
  std::map<std::pair<bool, std::string_view>, const zorva::agent::Node*> byName_;
};

template <std::size_t Size>
void addSettings(std::vector<SettingRow>& rows, const SettingName (&names)[Size], const broker::Instance& instance,
                 const Origin* origin, const std::string& interface) {
  for (const SettingName& name : names) {
    SettingRow row;
    row.interface = interface;
    row.setting = name.property;
    row.isList = name.isList;
    const broker::Value* value = instance.property(name.property);
    if (value != nullptr) row.values = textsOf(*value);
    if (origin != nullptr) row.source = sourceOf(*origin, name.number, value != nullptr && !value->isNull);
    rows.push_back(std::move(row));
  }
}

/// The instances of a class; if they cannot be read, the view says why.
std::vector<broker::Instance> askedFor(Session& session, const char* className, HostView& view) {
  std::vector<broker::Instance> instances;
  const broker::Status status = session.cim().enumerateInstances({}, className, {}, [&](const broker::Instance& each) {
    instances.push_back(each);
    return true;
  });
  if (!status.ok()) addProblem(view.problems, className, statusText(status));
  return instances;
}

void readServers(Session& session, HostView& view) {
  for (const broker::Instance& instance : askedFor(session, kServerClass, view)) {
    view.servers.push_back({numberOf(instance, "OrderOfAccess").value_or(0), propertyText(instance, "Name")});
  }
  std::stable_sort(view.servers.begin(), view.servers.end(),
                   [](const ServerRow& a, const ServerRow& b) { return a.order < b.order; });
}

void readSettings(Session& session, HostView& view) {
  const auto tree = session.isRemote() ? nullptr : session.tree();
  std::optional<Configurations> configurations;
  if (tree != nullptr) configurations.emplace(*tree);
  for (const broker::Instance& instance : askedFor(session, kSettingClass, view)) {
    Origin origin{interfaceOfSetting(instance)};
    const bool isServiceProcessor = propertyText(instance, "InstanceID").starts_with("BMC%");
    if (configurations) origin.node = configurations->find(origin.interface, isServiceProcessor);
    addSettings(view.interfaceSettings, kInterfaceSettings, instance, tree == nullptr ? nullptr : &origin,
                origin.interface);
  }
  Origin general{interfaceOfHostSettings(session).value_or("")};
  std::stable_sort(view.interfaceSettings.begin(), view.interfaceSettings.end(),
                   [](const SettingRow& a, const SettingRow& b) { return a.interface < b.interface; });
  if (configurations) general.node = configurations->find(general.interface, false);
  for (const broker::Instance& instance : askedFor(session, kGeneralSettingClass, view)) {
    addSettings(view.hostSettings, kHostSettings, instance, tree == nullptr ? nullptr : &general, general.interface);
  }
}

/// The name of a server's host is that of its computer systems: the host itself first, not its service processor.
std::string systemNameOf(Session& session, HostView& view) {
  if (!session.isRemote()) {
    const std::string& configured = zorva::agent::currentConfig().systemName;
    return configured.empty() ? session.tree()->systemName() : configured;
  }
  for (const broker::Instance& instance : askedFor(session, kSystemClass, view)) {
    if (instance.path.className == kSystemClass) return propertyText(instance, "Name");
  }
  return session.url();
}

}  // namespace

const char* sourceName(SettingSource source) noexcept {
  switch (source) {
    case SettingSource::File:
      return "file";
    case SettingSource::Host:
      return "host";
    case SettingSource::Set:
      return "set";
    case SettingSource::None:
      break;
  }
  return "-";
}

std::string interfaceOfSetting(const broker::Instance& setting) {
  return frontend::interfaceOfId(propertyText(setting, "InstanceID"));
}

std::optional<std::string> interfaceOfHostSettings(const Session& session) {
  if (session.isRemote()) return std::nullopt;
  return frontend::interfaceOfHostSettings(*session.tree());
}

std::vector<broker::Instance> instancesOf(Session& session, std::string_view className) {
  std::vector<broker::Instance> instances;
  requireDone(className, session.cim().enumerateInstances({}, className, {}, [&](const broker::Instance& instance) {
    instances.push_back(instance);
    return true;
  }));
  return instances;
}

bool HostView::couldAsk(std::string_view className) const {
  return std::none_of(problems.begin(), problems.end(), [className](const Problem& each) {
    return std::find(each.names.begin(), each.names.end(), className) != each.names.end();
  });
}

HostView readHostView(Session& session, Progress& progress, bool countsAll) {
  const Session::Quiet quiet(session);
  HostView view;
  view.hasSources = !session.isRemote();
  progress.step("reading the endpoints");
  view.systemName = systemNameOf(session, view);
  for (const broker::Instance& instance : askedFor(session, kEndpointClass, view)) {
    view.endpoints.push_back(endpointRow(instance));
  }
  std::stable_sort(view.endpoints.begin(), view.endpoints.end(),
                   [](const EndpointRow& a, const EndpointRow& b) { return a.name < b.name; });
  progress.step("reading the servers");
  readServers(session, view);
  progress.step("reading the settings");
  readSettings(session, view);
  view.classes = readClassRows(session, progress, countsAll);
  for (const ClassRow& row : view.classes) {
    if (!row.problem.empty()) addProblem(view.problems, row.name, row.problem);
  }
  return view;
}

}  // namespace zorva::cli
