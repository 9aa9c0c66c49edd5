#include "agent/tree/Overlay.h"

#include <unistd.h>

#include <cerrno>
#include <stdexcept>
#include <utility>

#include "agent/files/FileLock.h"
#include "agent/log/LogOutput.h"
#include "agent/tree/TreeJson.h"
#include "util/ReadFile.h"
#include "util/ReplaceFile.h"

namespace zorva::agent {
namespace {

using namespace ZV::NodeLexicon;

constexpr const char* kFileName = "overlay.json";
constexpr const char* kLockName = "overlay.lock";

std::map<PropertyNumber, PropertyValue> nodeFromJson(const JsonValue& value, const std::string& document,
                                                     const std::string& path) {
  if (value.kind != JsonValue::Kind::Object) throw ConfigError(document, value.line, path, "expected an object");
  std::map<PropertyNumber, PropertyValue> properties;
  for (std::size_t i = 0; i < value.keys.size(); ++i) {
    const std::string key = path + '.' + value.keys[i];
    const PropertyNumber number = propertyNumber(value.keys[i]);
    if (number == 0) throw ConfigError(document, value.items[i].line, key, "is not a known property");
    PropertyValue property = propertyFromJson(number, value.items[i], document, key);
    if (!canBeSet(number, property)) {
      throw ConfigError(document, value.items[i].line, key, "is not a property that can be set");
    }
    properties.emplace(number, std::move(property));
  }
  return properties;
}

OverlayValues valuesFromJson(const JsonValue& value, const std::string& document) {
  if (value.kind != JsonValue::Kind::Object) throw ConfigError(document, value.line, {}, "expected an object");
  OverlayValues values;
  for (std::size_t i = 0; i < value.keys.size(); ++i) {
    values.emplace(value.keys[i], nodeFromJson(value.items[i], document, value.keys[i]));
  }
  return values;
}

JsonValue valuesToJson(const OverlayValues& values) {
  JsonValue document = JsonValue::object();
  for (const auto& [path, properties] : values) {
    JsonValue node = JsonValue::object();
    for (const auto& [number, value] : properties) node.add(propertyName(number), propertyToJson(value));
    document.add(path, std::move(node));
  }
  return document;
}

std::size_t countValues(const OverlayValues& values) {
  std::size_t count = 0;
  for (const auto& [path, properties] : values) count += properties.size();
  return count;
}

}  // namespace

bool canBeSet(PropertyNumber property, const PropertyValue& value) {
  switch (property) {
    case PROP_HOST_NAME:
    case PROP_DOMAIN_NAME:
      return std::holds_alternative<std::string>(value);
    case PROP_DNS_SERVER_ADDRESSES:
    case PROP_DNS_SUFFIXES:
      return std::holds_alternative<SharedStrings>(value);
    default:
      return false;
  }
}

Overlay::Overlay(const std::string& dataDir) : directory_(dataDir), file_(dataDir + kFileName) {}

OverlayValues Overlay::read() const {
  const util::FileText file = util::readFile(file_, kLargestJson);
  if (file.error == ENOENT) return {};
  if (file.error != 0) {
    const std::string problem = "cannot be read: " + util::fileErrorText(file.error);
    if (util::mayPass(file.error)) throw OverlayUnreadable(file_, 0, {}, problem);
    throw ConfigError(file_, 0, {}, problem);
  }
  if (file.truncated) throw ConfigError(file_, 0, {}, "is larger than 64 MiB");
  return valuesFromJson(parseJson(file.text, file_), file_);
}

OverlayValues Overlay::readIfGood() const {
  try {
    return read();
  } catch (const ConfigError&) {
    return {};
  }
}

void Overlay::set(const std::string& path, PropertyNumber property, const std::optional<PropertyValue>& value) const {
  const FileLock lock(directory_ + kLockName);
  OverlayValues values = read();
  auto& properties = values[path];
  if (value.has_value()) {
    const auto old = properties.find(property);
    if (old != properties.end() && equalValues(old->second, *value)) return;
    properties[property] = *value;
  } else if (properties.erase(property) == 0) {
    return;
  }
  if (properties.empty()) values.erase(path);
  write(values);
}

// If no value was ever set, the directory for the lock may not exist either.
bool Overlay::isThere() const { return ::access(file_.c_str(), F_OK) == 0 || errno != ENOENT; }

std::size_t Overlay::clear(const std::function<bool(const std::string& path)>& chosen) const {
  if (!isThere()) return 0;
  const FileLock lock(directory_ + kLockName);
  OverlayValues values = read();
  const std::size_t before = countValues(values);
  std::erase_if(values, [&](const auto& node) { return chosen(node.first); });
  const std::size_t cleared = before - countValues(values);
  if (cleared != 0) write(values);
  return cleared;
}

std::size_t Overlay::clearAll() const {
  if (!isThere()) return 0;
  const FileLock lock(directory_ + kLockName);
  std::size_t cleared = 0;
  try {
    cleared = countValues(read());
    if (cleared == 0) return 0;
  } catch (const ConfigError&) {
    // Unreadable values are removed with the rest.
  }
  write({});
  return cleared;
}

void Overlay::write(const OverlayValues& values) const {
  const std::string text = formatJson(valuesToJson(values));
  if (text.size() > kLargestJson) throw std::runtime_error(file_ + ": would become larger than 64 MiB");
  const std::string unsynced = util::replaceFile(directory_, kFileName, text);
  if (!unsynced.empty()) ZORVAGENT_LOG_ERROR(unsynced);
}

void OverlayReader::read() {
  watch_.watch({overlay_.file()});
  const bool wasUnreadable = std::exchange(unreadable_, false);
  try {
    values_ = overlay_.read();
  } catch (const OverlayUnreadable& error) {
    unreadable_ = true;
    if (!wasUnreadable) ZORVAGENT_LOG_ERROR(std::string("the values that were set stay as they were: ") + error.what());
  } catch (const ConfigError& error) {
    values_.clear();
    ZORVAGENT_LOG_ERROR(std::string("the values that were set are not used: ") + error.what());
  }
}

std::shared_ptr<const TreeSnapshot> OverlayReader::applyTo(const std::shared_ptr<const TreeSnapshot>& tree) const {
  std::unique_ptr<TreeBuilder> builder;
  for (const auto& [path, properties] : values_) {
    const Node* node = tree->find(path);
    if (node == nullptr || node->type() != NodeType::NetworkIPConfig) continue;
    if (builder == nullptr) builder = std::make_unique<TreeBuilder>(*tree);
    for (const auto& [number, value] : properties) builder->set(node->index(), number, value, true);
  }
  return builder == nullptr ? tree : builder->finish();
}

}  // namespace zorva::agent
