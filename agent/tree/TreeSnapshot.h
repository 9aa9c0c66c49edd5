#pragma once

// An immutable snapshot of the instrumentation tree, and its builder.

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "agent/interface/AgentApi.h"
#include "agent/tree/Node.h"

namespace zorva::agent {

/// The tree at one moment. It never changes, so any number of threads may read it; it lives as long as it has an owner.
class ZORVA_AGENT_API TreeSnapshot {
 public:
  TreeSnapshot(const TreeSnapshot&) = delete;
  TreeSnapshot& operator=(const TreeSnapshot&) = delete;

  /// The managed system's name in the source.
  const std::string& systemName() const { return systemName_; }

  /// All nodes in tree order: each node before its children, these in the order in which they were added.
  const std::vector<Node>& nodes() const { return nodes_; }

  const Node& root() const { return nodes_.front(); }

  /// The parent of a node of this snapshot; the root is its own.
  const Node& parent(const Node& node) const { return nodes_[node.parentIndex()]; }

  /// The first system that is no service processor: this host itself. Null if there is none.
  const Node* ownSystem() const;

  /// The system that an interface, a node of type NetworkIPConfig, belongs to.
  const Node& systemOf(const Node& interface) const { return parent(parent(interface)); }

  /// The children of a node of this snapshot, in order.
  std::vector<const Node*> children(const Node& node) const;

  /// The node at that path, or null.
  const Node* find(std::string_view path) const;

  /// The first node of that type at or after that index in nodes(), or null.
  const Node* nextOfType(NodeType type, std::size_t from) const;

 private:
  friend class TreeBuilder;
  TreeSnapshot() = default;

  std::string systemName_;
  std::vector<Node> nodes_;
  std::unordered_map<std::string_view, std::size_t> indexOfPath_;  ///< the keys are the nodes' own paths
};

/// Builds a snapshot. Belongs to one thread.
class ZORVA_AGENT_API TreeBuilder {
 public:
  /// A tree that has only the root.
  explicit TreeBuilder(std::string systemName);

  /// A copy of a tree, to be changed by set and add.
  explicit TreeBuilder(const TreeSnapshot& base);

  TreeBuilder(const TreeBuilder&) = delete;
  TreeBuilder& operator=(const TreeBuilder&) = delete;
  ~TreeBuilder();

  /// Makes room for that many nodes.
  void reserve(std::size_t nodes);

  /// Adds a child of the node with index parent (the root's is 0) and returns its own index. The parent must be the
  /// node added last or an ancestor of it, so that nodes stay in tree order. Throws std::invalid_argument if the name
  /// is empty or contains "/" or NUL, or the parent is not such a node.
  std::size_t add(std::size_t parent, NodeType type, const std::string& name, const std::string& description = {});

  /// Sets a property of the node with that index; it replaces one with the same number. Lists may not be null.
  void set(std::size_t node, PropertyNumber number, PropertyValue value, bool overlaid = false);

  /// The snapshot; the builder must not be used afterwards. Throws std::invalid_argument if two siblings have one name.
  std::shared_ptr<const TreeSnapshot> finish();

 private:
  std::shared_ptr<TreeSnapshot> tree_;
};

}  // namespace zorva::agent
