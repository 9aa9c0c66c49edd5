#pragma once

// Trees for tests: a source with a fixed one, one from a JSON document, and which values of a node were set.

#include <memory>
#include <string>
#include <utility>

#include "agent/tree/TreeJson.h"
#include "agent/tree/TreeSource.h"

namespace zorva::agent::testing {

class FixedSource : public TreeSource {
 public:
  explicit FixedSource(std::shared_ptr<const TreeSnapshot> tree) : tree_(std::move(tree)) {}
  bool changed() override { return false; }
  std::shared_ptr<const TreeSnapshot> read() override { return tree_; }

 private:
  std::shared_ptr<const TreeSnapshot> tree_;
};

/// Throws ConfigError, with the document's name.
inline std::shared_ptr<const TreeSnapshot> treeFromJson(const std::string& text, const std::string& name = "tree") {
  return treeFromJsonValue(parseJson(text, name), name);
}

/// True if the node has the property and its value was set through the agent.
inline bool isOverlaid(const Node& node, PropertyNumber number) {
  const Property* property = node.find(number);
  return property != nullptr && property->overlaid;
}

}  // namespace zorva::agent::testing
