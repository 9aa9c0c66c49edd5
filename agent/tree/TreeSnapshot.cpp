#include "agent/tree/TreeSnapshot.h"

#include <stdexcept>
#include <utility>

namespace zorva::agent {

std::vector<const Node*> TreeSnapshot::children(const Node& node) const {
  std::vector<const Node*> result;
  // Tree order: the subtree of a node ends before the first node whose parent precedes the node.
  for (std::size_t i = node.index() + 1; i < nodes_.size() && nodes_[i].parentIndex() >= node.index(); ++i) {
    if (nodes_[i].parentIndex() == node.index()) result.push_back(&nodes_[i]);
  }
  return result;
}

const Node* TreeSnapshot::find(std::string_view path) const {
  const auto found = indexOfPath_.find(path);
  return found == indexOfPath_.end() ? nullptr : &nodes_[found->second];
}

const Node* TreeSnapshot::nextOfType(NodeType type, std::size_t from) const {
  for (std::size_t i = from; i < nodes_.size(); ++i) {
    if (nodes_[i].type() == type) return &nodes_[i];
  }
  return nullptr;
}

const Node* TreeSnapshot::ownSystem() const {
  const Node* node = nextOfType(NodeType::System, 0);
  while (node != nullptr && node->isServiceProcessor()) node = nextOfType(NodeType::System, node->index() + 1);
  return node;
}

TreeBuilder::TreeBuilder(std::string systemName) : tree_(new TreeSnapshot) {
  tree_->systemName_ = std::move(systemName);
  tree_->nodes_.emplace_back().path_ = "/";
}

TreeBuilder::TreeBuilder(const TreeSnapshot& base) : tree_(new TreeSnapshot) {
  tree_->systemName_ = base.systemName_;
  tree_->nodes_ = base.nodes_;
}

TreeBuilder::~TreeBuilder() = default;

void TreeBuilder::reserve(std::size_t nodes) { tree_->nodes_.reserve(nodes); }

std::size_t TreeBuilder::add(std::size_t parent, NodeType type, const std::string& name,
                             const std::string& description) {
  if (name.empty() || name.find('/') != std::string::npos || name.find('\0') != std::string::npos) {
    throw std::invalid_argument("a node's name must not be empty nor hold \"/\" or NUL");
  }
  std::vector<Node>& nodes = tree_->nodes_;
  std::size_t ancestor = nodes.size() - 1;
  while (ancestor != parent && ancestor != 0) ancestor = nodes[ancestor].parentIndex_;
  if (ancestor != parent) throw std::invalid_argument("a node's parent must be the last node or an ancestor of it");

  Node node;
  node.type_ = type;
  node.index_ = nodes.size();
  node.parentIndex_ = parent;
  node.name_ = name;
  if (parent != 0) node.path_ = nodes[parent].path_;
  node.path_ += '/';
  node.path_ += name;
  node.description_ = description;
  nodes.push_back(std::move(node));
  return nodes.size() - 1;
}

void TreeBuilder::set(std::size_t node, PropertyNumber number, PropertyValue value, bool overlaid) {
  std::vector<Property>& properties = tree_->nodes_.at(node).properties_;
  for (Property& property : properties) {
    if (property.number != number) continue;
    property.value = std::move(value);
    property.overlaid = overlaid;
    return;
  }
  if (properties.capacity() == 0) properties.reserve(8);  // the properties of a NetworkIPConfig node
  properties.push_back(Property{number, std::move(value), overlaid});
}

std::shared_ptr<const TreeSnapshot> TreeBuilder::finish() {
  tree_->indexOfPath_.reserve(tree_->nodes_.size());
  for (const Node& node : tree_->nodes_) {
    if (!tree_->indexOfPath_.emplace(node.path_, node.index_).second) {
      throw std::invalid_argument("two nodes have the path " + node.path_);
    }
  }
  return std::move(tree_);
}

}  // namespace zorva::agent
