#include "cli/session/HostView.h"

#include <algorithm>
#include <memory>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <utility>

#include "agent/Agent.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "cli/output/ValueText.h"
#include "cli/session/Origins.h"

namespace zorva::cli {

namespace {

constexpr const char* kServiceProcessorClass = "ZORVA_SPComputerSystem";
constexpr const char* kAllInterfaces = "zorvactl show --all lists those that it has";

std::optional<std::uint64_t> numberOf(const broker::Instance& instance, std::string_view property) {
  const broker::Value* value = instance.property(property);
  if (value == nullptr || value->isNull) return std::nullopt;
  const auto* number = std::get_if<std::uint64_t>(&value->scalar);
  return number == nullptr ? std::nullopt : std::optional(*number);
}

void readState(const broker::Instance& instance, InterfaceRow& row) {
  row.stateNumber = numberOf(instance, "EnabledState");
  const auto declared = std::find_if(instance.properties.begin(), instance.properties.end(),
                                     [](const broker::Property& property) { return property.name == "EnabledState"; });
  if (!row.stateNumber || declared == instance.properties.end() || declared->declaration == nullptr) return;
  const auto number = static_cast<std::int64_t>(*row.stateNumber);
  row.state = valueWord(*declared->declaration, number).value_or(std::to_string(*row.stateNumber));
}

InterfaceRow rowOfEndpoint(const broker::Instance& instance) {
  InterfaceRow row;
  row.name = propertyText(instance, "Name");
  row.system = propertyText(instance, "SystemName");
  row.isServiceProcessor = propertyText(instance, "SystemCreationClassName") == kServiceProcessorClass;
  row.hostName = propertyText(instance, "Hostname");
  row.endpointDomain = propertyText(instance, "DomainName");
  row.domainName = row.endpointDomain;
  row.suffixes = propertyTexts(instance, "DNSSuffixesToAppend");
  readState(instance, row);
  return row;
}

/// A setting that the providers read from a file or the host.
struct SettingName {
  const char* property;
  bool isList;
  const char* ofEndpoint;  ///< the endpoint's property with the host's value; null: it is only in the file
};

constexpr SettingName kInterfaceSettings[] = {
    {"RequestedHostname", false, "Hostname"},
    {"DomainName", false, "DomainName"},
    {"DNSServerAddresses", true, "DNSServerAddresses"},
    {"ConfigurationName", false, nullptr},
};
constexpr SettingName kHostSettings[] = {
    {"DNSSuffixesToAppend", true, "DNSSuffixesToAppend"},
    {"ConfigurationName", false, nullptr},
};

/// Only the file counts if it exists: a key that it lacks is an empty value and not the host's. `origin` may be null.
SettingSource sourceOf(const SettingName& setting, const Origin* origin, bool hasValue) {
  if (origin != nullptr && origin->hasFile) return SettingSource::File;
  if (setting.ofEndpoint == nullptr || !hasValue) return SettingSource::None;
  const bool isSet = origin != nullptr && std::find(origin->setProperties.begin(), origin->setProperties.end(),
                                                    setting.ofEndpoint) != origin->setProperties.end();
  return isSet ? SettingSource::Set : SettingSource::Host;
}

/// Null if nothing says.
const Origin* originOf(const Origins* origins, const std::string& interface, bool isServiceProcessor) {
  return origins == nullptr ? nullptr : origins->find(interface, isServiceProcessor);
}

template <std::size_t Size>
std::vector<SettingRow> settingsOf(const SettingName (&names)[Size], const broker::Instance& instance,
                                   const std::string& interface, const Origins* origins, bool isServiceProcessor) {
  const Origin* origin = originOf(origins, interface, isServiceProcessor);
  std::vector<SettingRow> rows;
  for (const SettingName& name : names) {
    SettingRow row{interface, name.property, name.isList, propertyTexts(instance, name.property), SettingSource::None};
    const broker::Value* value = instance.property(name.property);
    const bool hasValue = value != nullptr && !value->isNull;
    if (origins != nullptr) row.source = sourceOf(name, origin, hasValue);
    rows.push_back(std::move(row));
  }
  return rows;
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

/// The rows of the interfaces by system and name. Several may have one name: each setting goes to the next of them.
class RowsByName {
 public:
  explicit RowsByName(std::vector<InterfaceRow>& rows) : rows_(rows) {
    for (std::size_t i = rows.size(); i > 0; --i) {
      const InterfaceRow& row = rows[i - 1];
      waiting_[keyOf(row.name, row.isServiceProcessor)].push_back(i - 1);
    }
  }

  /// A new row if there is none left.
  InterfaceRow& take(const std::string& name, bool isServiceProcessor) {
    std::vector<std::size_t>& waiting = waiting_[keyOf(name, isServiceProcessor)];
    if (waiting.empty()) {
      rows_.emplace_back().name = name;
      rows_.back().isServiceProcessor = isServiceProcessor;
      return rows_.back();
    }
    const std::size_t index = waiting.back();
    waiting.pop_back();
    return rows_[index];
  }

 private:
  static std::string keyOf(const std::string& name, bool isServiceProcessor) {
    return (isServiceProcessor ? 'B' : 'C') + name;
  }

  std::vector<InterfaceRow>& rows_;
  std::unordered_map<std::string, std::vector<std::size_t>> waiting_;
};

const SettingRow* settingNamed(const std::vector<SettingRow>& rows, std::string_view name) {
  const auto found =
      std::find_if(rows.begin(), rows.end(), [name](const SettingRow& row) { return row.setting == name; });
  return found == rows.end() ? nullptr : &*found;
}

void placeSettings(InterfaceRow& row, std::vector<SettingRow> settings) {
  row.settings = std::move(settings);
  if (const SettingRow* servers = settingNamed(row.settings, "DNSServerAddresses")) row.servers = servers->values;
  if (const SettingRow* domain = settingNamed(row.settings, "DomainName")) {
    row.domainName = domain->values.empty() ? std::string() : domain->values.front();
  }
}

void placeOrigin(InterfaceRow& row, const Origin& origin) {
  row.facts = origin.facts;
  if (origin.hasFile) {
    row.source = SettingSource::File;
    row.hostServers = origin.servers;
    return;
  }
  const bool hasValue = row.hasDns() || !row.domainName.empty();
  row.source = !origin.setProperties.empty() ? SettingSource::Set
               : hasValue                    ? SettingSource::Host
                                             : SettingSource::None;
}

void readInterfaces(Session& session, HostView& view, const Origins* origins) {
  for (const broker::Instance& instance : askedFor(session, kEndpointClass, view)) {
    view.interfaces.push_back(rowOfEndpoint(instance));
  }
  RowsByName rows(view.interfaces);
  for (const broker::Instance& instance : askedFor(session, kSettingClass, view)) {
    const std::string name = interfaceOfSetting(instance);
    const bool isServiceProcessor = propertyText(instance, "InstanceID").starts_with("BMC%");
    placeSettings(rows.take(name, isServiceProcessor),
                  settingsOf(kInterfaceSettings, instance, name, origins, isServiceProcessor));
  }
  for (InterfaceRow& row : view.interfaces) {
    if (const Origin* origin = originOf(origins, row.name, row.isServiceProcessor)) placeOrigin(row, *origin);
  }
  std::stable_sort(view.interfaces.begin(), view.interfaces.end(),
                   [](const InterfaceRow& a, const InterfaceRow& b) { return a.name < b.name; });
}

void readHost(Session& session, HostView& view, const Origins* origins) {
  HostRow& host = view.host;
  if (origins != nullptr) {
    host = origins->host;
    view.bmc = origins->bmc;
  }
  for (const broker::Instance& instance : askedFor(session, kGeneralSettingClass, view)) {
    host.settings = settingsOf(kHostSettings, instance, host.interface, origins, false);
    host.suffixes = propertyTexts(instance, "DNSSuffixesToAppend");
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
  return session.server().shown();
}

}  // namespace

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

HostView readHostView(Session& session, Progress& progress) {
  const Session::Quiet quiet(session);
  HostView view;
  progress.step("reading the interfaces");
  const std::optional<Origins> known = readOrigins(session, view.problems);
  view.hasSources = known.has_value();
  const Origins* origins = known ? &*known : nullptr;
  view.systemName = systemNameOf(session, view);
  readInterfaces(session, view, origins);
  progress.step("reading the settings of the host");
  readHost(session, view, origins);
  return view;
}

void keepOnly(HostView& view, const std::vector<std::string>& names) {
  const std::unordered_set<std::string> wanted(names.begin(), names.end());
  std::unordered_set<std::string> found;
  std::vector<std::string> known;
  std::vector<InterfaceRow> kept;
  for (InterfaceRow& row : view.interfaces) {
    known.push_back(row.name);
    if (!wanted.contains(row.name)) continue;
    found.insert(row.name);
    kept.push_back(std::move(row));
  }
  for (const std::string& name : names) {
    if (found.contains(name)) continue;
    throw Failure(ExitCode::Failed, "this host has no interface " + printable(name),
                  known.empty() ? "it has none at all" : nearestOr(name, known, kAllInterfaces));
  }
  view.interfaces = std::move(kept);
}

}  // namespace zorva::cli
