#include "agent/interface/Instrumentation.h"

#include <atomic>

#include "agent/Runtime.h"
#include "agent/Seams.h"

namespace zorva::agent {
namespace {

constinit std::atomic<TreeCallHook*> treeCallHook{nullptr};

void announce(TreeCall call) {
  TreeCallHook* hook = treeCallHook.load(std::memory_order_acquire);
  if (hook != nullptr) hook->before(call);
}

}  // namespace

void setTreeCallHook(TreeCallHook* hook) { treeCallHook.store(hook, std::memory_order_release); }

}  // namespace zorva::agent

namespace ZV {

using zorva::agent::announce;
using zorva::agent::Node;
using zorva::agent::NodeType;
using zorva::agent::Runtime;
using zorva::agent::TreeCall;
using zorva::agent::TreeSnapshot;

struct Instrumentation::Position {
  std::shared_ptr<const TreeSnapshot> snapshot;
  const Node* node = nullptr;  // of the snapshot; null if the cursor is on none
  bool walksByType = false;    // operator++ has a next node to go to
};

Instrumentation::Instrumentation() { announce(TreeCall::Construct); }

Instrumentation::Instrumentation(const Instrumentation& other) {
  announce(TreeCall::Copy);
  if (other.position_ != nullptr) position_ = std::make_unique<Position>(*other.position_);
}

Instrumentation& Instrumentation::operator=(const Instrumentation& other) {
  announce(TreeCall::Copy);
  if (this != &other) {
    position_ = other.position_ == nullptr ? nullptr : std::make_unique<Position>(*other.position_);
  }
  return *this;
}

Instrumentation::~Instrumentation() = default;

void Instrumentation::selectNode(NodeLexicon::NodeType type) {
  announce(TreeCall::SelectByType);
  auto snapshot = Runtime::instance().lookForCursor();
  if (snapshot == nullptr) {
    position_ = nullptr;
    return;
  }
  auto position = std::make_unique<Position>();
  position->snapshot = std::move(snapshot);
  // The agent's own node types have numbers that are not in this enumeration.
  if (type == NodeLexicon::NODE_NETWORK_IP_CONFIG) {
    position->node = position->snapshot->nextOfType(NodeType::NetworkIPConfig, 0);
    position->walksByType = true;
  }
  position_ = std::move(position);
}

void Instrumentation::selectNode(const std::string& path) {
  announce(TreeCall::SelectByPath);
  if (position_ == nullptr) {
    auto snapshot = Runtime::instance().latestForCursor();
    if (snapshot == nullptr) return;
    position_ = std::make_unique<Position>();
    position_->snapshot = std::move(snapshot);
  }
  position_->node = position_->snapshot->find(path);
  position_->walksByType = false;
}

Instrumentation::operator bool() const {
  announce(TreeCall::Test);
  return position_ != nullptr && position_->node != nullptr;
}

Instrumentation& Instrumentation::operator++() {
  announce(TreeCall::Advance);
  if (position_ == nullptr || position_->node == nullptr) return *this;
  position_->node = position_->walksByType
                        ? position_->snapshot->nextOfType(position_->node->type(), position_->node->index() + 1)
                        : nullptr;
  return *this;
}

bool Instrumentation::getProperty(NodeLexicon::Properties property, std::string& value) const {
  announce(TreeCall::GetText);
  if (position_ == nullptr || position_->node == nullptr) return false;
  const std::string* text = position_->node->text(property);
  if (text != nullptr) value = *text;
  return text != nullptr;
}

bool Instrumentation::getProperty(NodeLexicon::Properties property, unsigned int& value) const {
  announce(TreeCall::GetNumber);
  if (position_ == nullptr || position_->node == nullptr) return false;
  const unsigned int* number = position_->node->number(property);
  if (number != nullptr) value = *number;
  return number != nullptr;
}

bool Instrumentation::getProperty(NodeLexicon::Properties property, std::vector<std::string>& value) const {
  announce(TreeCall::GetList);
  if (position_ == nullptr || position_->node == nullptr) return false;
  const zorva::agent::StringList* list = position_->node->list(property);
  if (list != nullptr) value = *list;
  return list != nullptr;
}

bool Instrumentation::setProperty(NodeLexicon::Properties property, std::string& value) {
  announce(TreeCall::SetText);
  if (position_ == nullptr || position_->node == nullptr) return false;
  return Runtime::instance().store(position_->node->path(), property, value);
}

bool Instrumentation::setProperty(NodeLexicon::Properties property, std::vector<std::string> value) {
  announce(TreeCall::SetList);
  if (position_ == nullptr || position_->node == nullptr) return false;
  const auto list = std::make_shared<const zorva::agent::StringList>(std::move(value));
  return Runtime::instance().store(position_->node->path(), property, list);
}

std::string Instrumentation::getPathToParentNode() const {
  announce(TreeCall::GetPathToParent);
  if (position_ == nullptr || position_->node == nullptr || position_->node->index() == 0) return {};
  return position_->snapshot->parent(*position_->node).path();
}

std::string Instrumentation::getNodeDescription() const {
  announce(TreeCall::GetDescription);
  if (position_ == nullptr || position_->node == nullptr) return {};
  return position_->node->description();
}

}  // namespace ZV
