#include "cli/HostView.h"

#include <sys/stat.h>

#include <algorithm>

#include "agent/Agent.h"
#include "cli/Failure.h"
#include "cli/ValueText.h"

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
  return ::stat((zorvagent::dataDirectory() + "ifcfg-" + interface).c_str(), &status) == 0;
}

/// The file alone decides: where it stands, a key that it lacks is an empty value and not the host's.
SettingSource sourceOf(const std::string& interface, bool hasHostValue, bool hasValue) {
  if (fileStands(interface)) return SettingSource::File;
  return hasHostValue && hasValue ? SettingSource::Host : SettingSource::None;
}

/// A setting that the providers read from a file or the host. ConfigurationName has no place on the host but the file.
struct SettingName {
  const char* property;
  bool isList;
  bool hasHostValue;
};

constexpr SettingName kInterfaceSettings[] = {
    {"RequestedHostname", false, true},
    {"DomainName", false, true},
    {"DNSServerAddresses", true, true},
    {"ConfigurationName", false, false},
};
constexpr SettingName kHostSettings[] = {
    {"DNSSuffixesToAppend", true, true},
    {"ConfigurationName", false, false},
};

template <std::size_t Size>
void addSettings(std::vector<SettingRow>& rows, const SettingName (&names)[Size], const broker::Instance& instance,
                 const std::string& interface) {
  for (const SettingName& name : names) {
    SettingRow row;
    row.interface = interface;
    row.setting = name.property;
    row.isList = name.isList;
    const broker::Value* value = instance.property(name.property);
    if (value != nullptr) row.values = textsOf(*value);
    row.source = sourceOf(interface, name.hasHostValue, value != nullptr && !value->isNull);
    rows.push_back(std::move(row));
  }
}

/// The instances of a class, or none and a line that tells why.
std::vector<broker::Instance> askedFor(Session& session, const char* className, HostView& view) {
  try {
    return instancesOf(session, className);
  } catch (const Failure& failure) {
    view.problems.emplace_back(failure.what());
    return {};
  }
}

void readServers(Session& session, HostView& view) {
  for (const broker::Instance& instance : askedFor(session, kServerClass, view)) {
    view.servers.push_back({numberOf(instance, "OrderOfAccess").value_or(0), propertyText(instance, "Name")});
  }
  std::stable_sort(view.servers.begin(), view.servers.end(),
                   [](const ServerRow& a, const ServerRow& b) { return a.order < b.order; });
}

void readSettings(Session& session, HostView& view) {
  for (const broker::Instance& instance : askedFor(session, kSettingClass, view)) {
    addSettings(view.interfaceSettings, kInterfaceSettings, instance, interfaceOfSetting(instance));
  }
  const std::string general = interfaceOfHostSettings(session).value_or("");
  for (const broker::Instance& instance : askedFor(session, kGeneralSettingClass, view)) {
    addSettings(view.hostSettings, kHostSettings, instance, general);
  }
}

}  // namespace

const char* sourceName(SettingSource source) noexcept {
  switch (source) {
    case SettingSource::File:
      return "file";
    case SettingSource::Host:
      return "host";
    case SettingSource::None:
      break;
  }
  return "-";
}

std::string interfaceOfSetting(const broker::Instance& setting) {
  const std::string id = propertyText(setting, "InstanceID");
  const std::size_t percent = id.find('%');
  return percent == std::string::npos ? std::string() : id.substr(percent + 1);
}

std::optional<std::string> interfaceOfHostSettings(const Session& session) {
  const auto tree = session.tree();
  for (const zorvagent::Node& node : tree->nodes()) {
    if (node.type() != zorvagent::NodeType::NetworkIPConfig) continue;
    if (tree->parent(tree->parent(node)).description() == "BMC") continue;
    const std::string* name = node.text(ZV::NodeLexicon::PROP_NAME);
    return name == nullptr ? std::string() : *name;
  }
  return std::nullopt;
}

std::vector<broker::Instance> instancesOf(Session& session, std::string_view className) {
  std::vector<broker::Instance> instances;
  requireDone(className, session.broker().enumerateInstances({}, className, {}, [&](const broker::Instance& instance) {
    instances.push_back(instance);
    return true;
  }));
  return instances;
}

std::vector<ClassRow> readClassRows(Session& session) {
  const Session::Quiet quiet(session);
  std::vector<ClassRow> rows;
  for (const broker::ProviderEntry& entry : session.broker().registry().entries()) {
    ClassRow row{entry.className, entry.prefix, entry.library, std::nullopt, {}};
    std::uint64_t count = 0;
    // Instances of subclasses are counted at their own class.
    const broker::Status status =
        session.broker().enumerateInstanceNames(entry.nameSpace, entry.className, [&](const broker::ObjectPath& path) {
          count += path.className == entry.className ? 1 : 0;
          return true;
        });
    if (status.ok()) {
      row.count = count;
    } else {
      row.problem = operationFailure(entry.className, status).what();
    }
    rows.push_back(std::move(row));
  }
  return rows;
}

HostView readHostView(Session& session) {
  const Session::Quiet quiet(session);
  HostView view;
  view.systemName = zorvagent::currentConfig().systemName;
  if (view.systemName.empty()) view.systemName = session.tree()->systemName();
  for (const broker::Instance& instance : askedFor(session, kEndpointClass, view)) {
    view.endpoints.push_back(endpointRow(instance));
  }
  readServers(session, view);
  readSettings(session, view);
  view.classes = readClassRows(session);
  return view;
}

}  // namespace zorva::cli
