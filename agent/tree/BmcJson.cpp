#include "agent/tree/BmcJson.h"

#include <algorithm>
#include <utility>

#include "agent/config/Config.h"
#include "agent/tree/TreeJson.h"
#include "util/ReadFile.h"

namespace zorva::agent {
namespace {

using Kind = JsonValue::Kind;

constexpr std::size_t kMostValues = 100000;
constexpr std::uint64_t kLatest = std::uint64_t{1} << 32U;  // the tree has times as 32 bits
constexpr std::uint64_t kLongestInterval = 86400;

std::uint64_t takeNumber(const JsonValue& document, const char* key, std::uint64_t largest, const std::string& name) {
  const JsonValue* value = document.find(key);
  if (value == nullptr || value->kind != Kind::Number || value->number >= largest) {
    throw ConfigError(name, value == nullptr ? document.line : value->line, key, "expected a whole number");
  }
  return value->number;
}

std::string takeText(const JsonValue& document, const char* key, const std::string& name) {
  const JsonValue* value = document.find(key);
  if (value == nullptr) return {};
  if (value->kind != Kind::Text) throw ConfigError(name, value->line, key, "expected a text");
  return value->text;
}

// A service processor, its ports, and one configuration for each of them that has the interface's name.
bool isInItsPlace(const TreeSnapshot& tree, const Node& node) {
  const Node& parent = tree.parent(node);
  switch (node.type()) {
    case NodeType::Root:
      return true;
    case NodeType::System:
      return parent.type() == NodeType::Root && node.isServiceProcessor() && node.name().starts_with(kBmcNodePrefix);
    case NodeType::Port:
      return parent.type() == NodeType::System;
    case NodeType::NetworkIPConfig:
      return parent.type() == NodeType::Port && node.text(ZV::NodeLexicon::PROP_NAME) != nullptr;
  }
  return false;
}

void requireServiceProcessors(const TreeSnapshot& tree, const std::string& name) {
  std::size_t interfaces = 0;
  for (const Node& node : tree.nodes()) {
    if (!isInItsPlace(tree, node)) throw ConfigError(name, 0, node.path(), "is no node of a service processor");
    interfaces += node.type() == NodeType::NetworkIPConfig ? 1 : 0;
  }
  if (interfaces > kMostBmcInterfaces) {
    throw ConfigError(name, 0, "nodes", "has more than " + std::to_string(kMostBmcInterfaces) + " interfaces");
  }
}

}  // namespace

std::string bmcSocketBeside(const std::string& file) { return file.substr(0, file.rfind('/') + 1) + "bmc.sock"; }

std::string formatBmcState(const BmcState& state) {
  JsonValue document = JsonValue::object();
  document.add("read_at", JsonValue::ofNumber(state.readAt));
  document.add("interval", JsonValue::ofNumber(state.interval));
  document.add("problem", JsonValue::ofText(state.problem));
  const JsonValue tree = treeToJsonValue(*state.tree);
  document.add("nodes", *tree.find("nodes"));
  return formatJson(document);
}

BmcState parseBmcState(const std::string& text, const std::string& name) {
  const JsonValue document = parseJson(text, name, kMostValues);
  if (document.kind != Kind::Object) throw ConfigError(name, document.line, {}, "expected an object");
  BmcState state;
  state.readAt = takeNumber(document, "read_at", kLatest, name);
  state.interval = takeNumber(document, "interval", kLongestInterval + 1, name);
  state.problem = takeText(document, "problem", name);
  JsonValue tree = JsonValue::object();
  if (const JsonValue* nodes = document.find("nodes")) tree.add("nodes", *nodes);
  state.tree = treeFromJsonValue(tree, name);
  requireServiceProcessors(*state.tree, name);
  return state;
}

BmcState readBmcState(const std::string& path) {
  const util::FileText file = util::readFile(path, kLargestBmcJson);
  if (file.error != 0) throw ConfigError(path, 0, {}, "cannot be read: " + util::fileErrorText(file.error));
  if (file.truncated) throw ConfigError(path, 0, {}, "is larger than 4 MiB");
  return parseBmcState(file.text, path);
}

}  // namespace zorva::agent
