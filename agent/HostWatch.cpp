#include "agent/HostWatch.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <map>
#include <string_view>
#include <utility>

#include "agent/TreeWatch.h"
#include "agent/config/CurrentConfig.h"
#include "agent/files/DirectoryWatch.h"
#include "agent/files/KeyValues.h"
#include "agent/files/SettingFiles.h"
#include "agent/tree/TreeJson.h"
#include "util/TimeText.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;

constexpr const char* kInterface = "interface";
constexpr const char* kKernel = "kernel";
constexpr const char* kOverlayFile = "overlay.json";
constexpr const char* kResolvConf = "/etc/resolv.conf";
constexpr std::array<std::string_view, 5> kFileKeys{"HOSTNAME", "DOMAINNAME", "DNSSERVERS", "DNSSUFFIXES",
                                                    "CONFIG_NAME"};
// Of a directory with more, the rest is not watched.
constexpr std::size_t kMostFiles = 16384;

// The time of a reading is no setting, and the name is that of the interface.
bool isWatched(PropertyNumber number) { return number != PROP_NAME && number != kReadAt && number != kReadInterval; }

bool isOfDns(PropertyNumber number) {
  return number == PROP_DNS_SERVER_ADDRESSES || number == PROP_DNS_SUFFIXES || number == PROP_DOMAIN_NAME ||
         (number >= kDnsOwner && number <= kMulticastDns);
}

// Who has set a value, as far as the tree says it.
std::string setterOf(const TreeSnapshot& tree, const Node& node, PropertyNumber number) {
  const Property* property = node.find(number);
  if (property != nullptr && property->overlaid) return kOverlayFile;
  if (node.isServiceProcessor() || tree.parent(node).isServiceProcessor() || tree.systemOf(node).isServiceProcessor()) {
    return kBmcOwner;
  }
  if (number >= kResolverServers && number <= kResolverOptions) return kResolvConf;
  if (!isOfDns(number)) return kKernel;
  return node.textOrEmpty(kDnsOwner);
}

/// The settings in a file of an interface, by key.
using FileSettings = std::map<std::string, std::string>;
/// By the name of the interface.
using SettingsOfFiles = std::map<std::string, FileSettings>;

FileSettings settingsIn(const std::string& path) {
  FileSettings settings;
  readKeyValues(path, [&](std::string_view key, std::string_view value) {
    const bool isKnown = std::find(kFileKeys.begin(), kFileKeys.end(), key) != kFileKeys.end();
    if (isKnown) settings.try_emplace(std::string(key), value);
  });
  return settings;
}

SettingsOfFiles filesIn(const std::string& directory) {
  SettingsOfFiles files;
  for (const std::string& interface : findSettingFiles(directory).interfaces) {
    if (files.size() >= kMostFiles) break;
    files.emplace(interface, settingsIn(directory + settingFileName(interface)));
  }
  return files;
}

/// Compares two states of the host.
class Comparison {
 public:
  explicit Comparison(std::vector<HostChange>& changes) : changes_(changes) {}

  void compare(const TreeSnapshot& before, const TreeSnapshot& after) {
    for (const Node& node : after.nodes()) {
      const Node* old = before.find(node.path());
      if (old == nullptr && isInterface(node)) add(after, node, kInterface, {}, nameOf(after, node), kKernel);
      compareNode(old == nullptr ? nullptr : &before, old, after, node);
    }
    for (const Node& node : before.nodes()) {
      if (!isInterface(node) || after.find(node.path()) != nullptr) continue;
      add(before, node, kInterface, nameOf(before, node), {}, kKernel);
    }
  }

  void compare(const std::string& system, const SettingsOfFiles& before, const SettingsOfFiles& after) {
    for (const auto& [interface, settings] : after) {
      const auto old = before.find(interface);
      compareFile(system, interface, old == before.end() ? FileSettings() : old->second, settings);
    }
    for (const auto& [interface, settings] : before) {
      if (!after.contains(interface)) compareFile(system, interface, settings, {});
    }
  }

 private:
  using Value = std::optional<PropertyValue>;

  static bool isInterface(const Node& node) { return node.type() == NodeType::NetworkIPConfig; }

  static Value nameOf(const TreeSnapshot& tree, const Node& node) {
    const std::string* name = node.text(PROP_NAME);
    return name != nullptr ? *name : tree.parent(node).name();
  }

  static std::string systemOf(const TreeSnapshot& tree, const Node& node) {
    const Node& system = isInterface(node) ? tree.systemOf(node) : node;
    return system.isServiceProcessor() ? system.name() : tree.systemName();
  }

  void compareNode(const TreeSnapshot* before, const Node* old, const TreeSnapshot& after, const Node& node) {
    for (const Property& property : node.properties()) {
      const Property* had = old == nullptr ? nullptr : old->find(property.number);
      if (had != nullptr && equalValues(had->value, property.value)) continue;
      addProperty(after, node, property.number, had == nullptr ? Value() : had->value, property.value,
                  setterOf(after, node, property.number));
    }
    if (old == nullptr) return;
    for (const Property& property : old->properties()) {
      if (node.find(property.number) != nullptr) continue;
      addProperty(after, node, property.number, property.value, {}, setterOf(*before, *old, property.number));
    }
  }

  void addProperty(const TreeSnapshot& tree, const Node& node, PropertyNumber number, Value before, Value after,
                   std::string by) {
    const char* name = propertyName(number);
    if (name == nullptr || !isWatched(number)) return;
    add(tree, node, name, std::move(before), std::move(after), std::move(by));
  }

  void add(const TreeSnapshot& tree, const Node& node, const char* property, Value before, Value after,
           std::string by) {
    std::string interface = isInterface(node) ? std::get<std::string>(*nameOf(tree, node)) : std::string();
    changes_.push_back({now_, systemOf(tree, node), std::move(interface), property, std::move(before), std::move(after),
                        std::move(by)});
  }

  void compareFile(const std::string& system, const std::string& interface, const FileSettings& before,
                   const FileSettings& after) {
    const auto valueOf = [](const FileSettings& settings, const std::string& key) {
      const auto found = settings.find(key);
      return found == settings.end() ? Value() : Value(found->second);
    };
    for (const std::string_view each : kFileKeys) {
      const std::string key(each);
      const Value had = valueOf(before, key);
      const Value has = valueOf(after, key);
      if (had == has) continue;
      changes_.push_back({now_, system, interface, "ifcfg." + key, had, has, settingFileName(interface)});
    }
  }

  std::vector<HostChange>& changes_;
  const std::chrono::system_clock::time_point now_ = std::chrono::system_clock::now();
};

JsonValue textOrNull(const std::string& text) { return text.empty() ? JsonValue() : JsonValue::ofText(text); }

JsonValue valueOrNull(const std::optional<PropertyValue>& value) {
  return value.has_value() ? propertyToJson(*value) : JsonValue();
}

}  // namespace

std::string jsonLine(const HostChange& change) {
  JsonValue line = JsonValue::object();
  line.add("version", JsonValue::ofNumber(1));
  line.add("time", JsonValue::ofText(util::utcText(change.time)));
  line.add("system", JsonValue::ofText(change.system));
  line.add("interface", textOrNull(change.interface));
  line.add("property", JsonValue::ofText(change.property));
  line.add("old", valueOrNull(change.before));
  line.add("new", valueOrNull(change.after));
  line.add("by", textOrNull(change.by));
  return formatJsonLine(line) + '\n';
}

struct HostWatch::State {
  TreeWatch watch;
  DirectoryWatch directory;
  std::string dataDir = CurrentConfig::instance().get().dataDir;
  std::shared_ptr<const TreeSnapshot> tree;
  SettingsOfFiles files;

  bool filesMayHaveChanged() {
    const bool changed = directory.changed();
    // Watched before it is read; one that does not exist yet is tried again at each change of the host.
    const bool wasWatched = directory.descriptor() >= 0;
    return (directory.watch(dataDir) && !wasWatched) || changed;
  }
};

HostWatch::HostWatch() : state_(std::make_unique<State>()) { changes(); }

HostWatch::~HostWatch() = default;

std::vector<HostChange> HostWatch::changes() {
  std::vector<HostChange> changes;
  Comparison comparison(changes);
  const std::shared_ptr<const TreeSnapshot> tree = state_->watch.tree();
  const std::shared_ptr<const TreeSnapshot> before = std::exchange(state_->tree, tree);
  if (before != nullptr && before != tree) comparison.compare(*before, *tree);
  if (!state_->filesMayHaveChanged()) return changes;
  const SettingsOfFiles filesBefore = std::exchange(state_->files, filesIn(state_->dataDir));
  if (before != nullptr) comparison.compare(tree->systemName(), filesBefore, state_->files);
  return changes;
}

void HostWatch::wait(std::vector<pollfd>& others, std::optional<std::chrono::milliseconds> longest) {
  const std::size_t own = others.size();
  others.push_back({state_->directory.descriptor(), POLLIN, 0});  // -1 is passed over
  state_->watch.wait(others, longest);
  others.resize(own);
}

}  // namespace zorva::agent
