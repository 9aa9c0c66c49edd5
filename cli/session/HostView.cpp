#include "cli/session/HostView.h"

#include <algorithm>
#include <chrono>
#include <map>
#include <memory>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <utility>

#include "agent/Agent.h"
#include "agent/tree/BmcJson.h"
#include "cli/output/Failure.h"
#include "cli/output/Text.h"
#include "cli/output/ValueText.h"
#include "cli/session/SettingFiles.h"

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

std::vector<std::string> textsOf(const broker::Value& value) {
  std::vector<std::string> texts;
  if (value.isNull) return texts;
  if (!value.isArray) return {scalarText(value.scalar)};
  for (const broker::Scalar& element : value.elements) texts.push_back(scalarText(element));
  return texts;
}

std::vector<std::string> textsOf(const broker::Instance& instance, std::string_view property) {
  const broker::Value* value = instance.property(property);
  return value == nullptr ? std::vector<std::string>() : textsOf(*value);
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
  row.suffixes = textsOf(instance, "DNSSuffixesToAppend");
  readState(instance, row);
  return row;
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

/// The configurations of a tree by the names of their interfaces; the first of several with one name.
class Configurations {
 public:
  explicit Configurations(const zorva::agent::TreeSnapshot& tree) {
    for (const zorva::agent::Node& node : tree.nodes()) {
      const std::string* name = node.text(ZV::NodeLexicon::PROP_NAME);
      if (node.type() != zorva::agent::NodeType::NetworkIPConfig || name == nullptr) continue;
      const bool isServiceProcessor = tree.systemOf(node).isServiceProcessor();
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

/// The tree and the files of this host.
class LocalFacts {
 public:
  explicit LocalFacts(const Session& session)
      : tree_(session.tree()), configurations_(*tree_), files_(findSettingFiles(zorva::agent::dataDirectory())) {}

  const zorva::agent::TreeSnapshot& tree() const { return *tree_; }
  const zorva::agent::Node* find(const std::string& interface, bool isServiceProcessor) const {
    return configurations_.find(interface, isServiceProcessor);
  }
  bool hasFile(const std::string& interface) const { return files_.has(interface); }

  /// Only the file counts if it exists: a key that it lacks is an empty value and not the host's. `node` may be null.
  SettingSource sourceOf(const std::string& interface, const zorva::agent::Node* node,
                         zorva::agent::PropertyNumber number, bool hasValue) const {
    if (hasFile(interface)) return SettingSource::File;
    if (number == kNoNumber || !hasValue) return SettingSource::None;
    const zorva::agent::Property* property = node == nullptr ? nullptr : node->find(number);
    return property != nullptr && property->overlaid ? SettingSource::Set : SettingSource::Host;
  }

 private:
  std::shared_ptr<const zorva::agent::TreeSnapshot> tree_;
  Configurations configurations_;
  SettingFiles files_;
};

template <std::size_t Size>
std::vector<SettingRow> settingsOf(const SettingName (&names)[Size], const broker::Instance& instance,
                                   const std::string& interface, const LocalFacts* local, bool isServiceProcessor) {
  const zorva::agent::Node* node = local == nullptr ? nullptr : local->find(interface, isServiceProcessor);
  std::vector<SettingRow> rows;
  for (const SettingName& name : names) {
    SettingRow row{interface, name.property, name.isList, textsOf(instance, name.property), SettingSource::None};
    const broker::Value* value = instance.property(name.property);
    const bool hasValue = value != nullptr && !value->isNull;
    if (local != nullptr) row.source = local->sourceOf(interface, node, name.number, hasValue);
    rows.push_back(std::move(row));
  }
  return rows;
}

std::uint64_t secondsNow() {
  const auto now = std::chrono::system_clock::now().time_since_epoch();
  return static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::seconds>(now).count());
}

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

/// What only the tree says.
void placeFacts(InterfaceRow& row, const LocalFacts& local) {
  const zorva::agent::Node* node = local.find(row.name, row.isServiceProcessor);
  if (local.hasFile(row.name)) row.source = SettingSource::File;
  if (node == nullptr) return;
  row.facts = ownerFacts(*node);
  if (row.source == SettingSource::File) {
    row.hostServers = node->listOrEmpty(ZV::NodeLexicon::PROP_DNS_SERVER_ADDRESSES);
    return;
  }
  const auto& properties = node->properties();
  const bool isSet = std::any_of(properties.begin(), properties.end(), [](const auto& each) { return each.overlaid; });
  const bool hasValue = row.hasDns() || !row.domainName.empty();
  row.source = isSet ? SettingSource::Set : hasValue ? SettingSource::Host : SettingSource::None;
}

void readInterfaces(Session& session, HostView& view, const LocalFacts* local) {
  for (const broker::Instance& instance : askedFor(session, kEndpointClass, view)) {
    view.interfaces.push_back(rowOfEndpoint(instance));
  }
  RowsByName rows(view.interfaces);
  for (const broker::Instance& instance : askedFor(session, kSettingClass, view)) {
    const std::string name = interfaceOfSetting(instance);
    const bool isServiceProcessor = propertyText(instance, "InstanceID").starts_with("BMC%");
    placeSettings(rows.take(name, isServiceProcessor),
                  settingsOf(kInterfaceSettings, instance, name, local, isServiceProcessor));
  }
  if (local != nullptr) {
    for (InterfaceRow& row : view.interfaces) placeFacts(row, *local);
  }
  std::stable_sort(view.interfaces.begin(), view.interfaces.end(),
                   [](const InterfaceRow& a, const InterfaceRow& b) { return a.name < b.name; });
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

void readHost(Session& session, HostView& view, const LocalFacts* local) {
  HostRow& host = view.host;
  host.interface = interfaceOfHostSettings(session).value_or("");
  if (local != nullptr) {
    host.hasFile = local->hasFile(host.interface);
    readSystemNode(local->tree(), host);
    view.bmc = readingOfBmc(local->tree());
  }
  for (const broker::Instance& instance : askedFor(session, kGeneralSettingClass, view)) {
    host.settings = settingsOf(kHostSettings, instance, host.interface, local, false);
    host.suffixes = textsOf(instance, "DNSSuffixesToAppend");
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

std::string BmcReading::text() const {
  constexpr std::uint64_t kMinute = 60;
  constexpr std::uint64_t kHour = 60 * kMinute;
  constexpr std::uint64_t kDay = 24 * kHour;
  std::string text;
  if (age < 2 * kMinute) {
    text = std::to_string(age) + " s ago";
  } else if (age < 2 * kHour) {
    text = std::to_string(age / kMinute) + " min ago";
  } else {
    text = age < 2 * kDay ? std::to_string(age / kHour) + " h ago" : std::to_string(age / kDay) + " days ago";
  }
  return text + (isUnknown ? "; what it has now is not known" : "");
}

bool InterfaceRow::hasDns() const {
  return !servers.empty() || !suffixes.empty() || !facts.routingDomains.empty() || source == SettingSource::File ||
         source == SettingSource::Set;
}

std::string InterfaceRow::from() const {
  if (source == SettingSource::File) return zorva::agent::settingFileName(name);
  if (source == SettingSource::Set) return "overlay.json";
  if (source == SettingSource::None && facts.owner.empty()) return {};
  if (facts.owner.empty()) return sourceName(SettingSource::Host);
  if (facts.profile.empty()) return facts.owner;
  // A file is named without its folder, a profile as what it is.
  const std::size_t slash = facts.profile.rfind('/');
  const bool isPath = facts.profile.starts_with('/');
  return facts.owner + ", " + (isPath ? facts.profile.substr(slash + 1) : "profile " + facts.profile);
}

std::string placeOfHostSettings(const std::string& interface, bool hasFile) {
  if (interface.empty()) return {};
  const std::string file = zorva::agent::settingFileName(interface);
  constexpr const char* kWhy = "the settings of the host are in the file of the first interface";
  if (hasFile) return "kept in " + file + ": " + kWhy;
  return std::string("from the host; ") + file + ", which does not exist, would replace them: " + kWhy;
}

std::string HostRow::place() const { return placeOfHostSettings(interface, hasFile); }

HostView readHostView(Session& session, Progress& progress) {
  const Session::Quiet quiet(session);
  HostView view;
  view.hasSources = !session.isRemote();
  std::optional<LocalFacts> local;
  if (!session.isRemote()) local.emplace(session);
  const LocalFacts* facts = local ? &*local : nullptr;
  progress.step("reading the interfaces");
  view.systemName = systemNameOf(session, view);
  readInterfaces(session, view, facts);
  progress.step("reading the settings of the host");
  readHost(session, view, facts);
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
