#include "agent/Agent.h"

#include <set>

#include "agent/Runtime.h"
#include "agent/config/CurrentConfig.h"
#include "agent/log/LogOutput.h"
#include "agent/tree/TreeJson.h"

namespace zorva::agent {
namespace {

using ZV::NodeLexicon::PROP_NAME;

// The paths of the nodes whose interface has that name.
std::set<std::string> pathsOfInterface(const std::string& name) {
  std::set<std::string> paths;
  try {
    const auto tree = currentTree();
    for (const Node& node : tree->nodes()) {
      const std::string* nodeName = node.text(PROP_NAME);
      if (nodeName != nullptr && *nodeName == name) paths.insert(node.path());
    }
  } catch (const std::exception&) {
    // Without a tree the names in the paths are used.
  }
  return paths;
}

// The second-last name: the port's, in the path of a port's configuration.
std::string portOfPath(const std::string& path) {
  const std::size_t end = path.rfind('/');
  if (end == std::string::npos || end == 0) return {};
  return path.substr(path.rfind('/', end - 1) + 1, end - path.rfind('/', end - 1) - 1);
}

}  // namespace

void loadConfig(const std::string& path) {
  Runtime::instance().useConfig(path.empty() ? readDefaultConfig() : readConfig(path));
}

void askForExceptions() { Runtime::instance().askForExceptions(); }

const Config& currentConfig() {
  CurrentConfig::instance().check();
  return CurrentConfig::instance().get();
}

std::shared_ptr<const TreeSnapshot> currentTree() { return Runtime::instance().look(); }

std::string treeToJson(const TreeSnapshot& tree) { return formatJson(treeToJsonValue(tree)); }

void setLogLevel(LogStream stream, int level) { setStreamLevel(stream, level); }

void setLogTarget(LogStream stream, const std::string& target) { setStreamTarget(stream, target); }

std::string dataDirectory() { return CurrentConfig::instance().get().dataDir; }

std::vector<OverlayEntry> overlayEntries() {
  std::vector<OverlayEntry> entries;
  for (const auto& [path, properties] : Runtime::instance().overlay().read()) {
    for (const auto& [number, value] : properties) entries.push_back({path, number, propertyName(number), value});
  }
  return entries;
}

std::size_t clearOverlay(const std::optional<std::string>& interface) {
  const Overlay overlay = Runtime::instance().overlay();
  std::size_t cleared = 0;
  if (interface.has_value()) {
    const std::set<std::string> paths = pathsOfInterface(*interface);
    cleared = overlay.clear([&](const std::string& path) {
      return path == *interface || portOfPath(path) == *interface || paths.contains(path);
    });
  } else {
    cleared = overlay.clearAll();
  }
  Runtime::instance().overlayHasChanged();
  return cleared;
}

}  // namespace zorva::agent
