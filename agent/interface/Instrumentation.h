#pragma once

// A forward cursor over the agent's instrumentation tree: the live state of the host as nodes with properties.

#include <memory>
#include <string>
#include <vector>

#include "AgentApi.h"
#include "NodeLexicon.h"

namespace ZV {

/// A cursor is on one node of one immutable snapshot of the tree, or on none. A copy is on the same node of the same
/// snapshot and moves independently. One cursor belongs to one thread; different cursors may be used from different
/// threads at the same time.
///
/// Texts are bytes as the host gives them, UTF-8 by convention. Every operation may throw std::bad_alloc. If the tree
/// cannot be read, selectNode places the cursor on no node and the agent's log has the reason. In a program that has
/// asked for exceptions it throws one derived from std::exception, and the cursor does not move.
class ZORVA_AGENT_API Instrumentation {
 public:
  /// A cursor on no node.
  Instrumentation();
  Instrumentation(const Instrumentation& other);
  Instrumentation& operator=(const Instrumentation& other);
  ~Instrumentation();

  /// Places the cursor on the first node of that type, in tree order, or on none if the tree has no such node. Checks,
  /// without blocking, whether the host has changed since the tree was last read, and reads it again only then.
  void selectNode(NodeLexicon::NodeType type);

  /// Places the cursor on the node at that path, or on none if the tree has no such path. Does not check the host: a
  /// cursor in a snapshot stays in it, any other uses the latest one.
  void selectNode(const std::string& path);

  /// True if the cursor is on a node.
  explicit operator bool() const;

  /// Moves to the next node of the last selected type, in tree order, and to none after the last one. A cursor that was
  /// placed by path, or that is on no node, moves to none.
  Instrumentation& operator++();

  /// Return a property of the current node: true and the value; or false if the node has no such property, if it is of
  /// another type, or if the cursor is on no node. Then the output is unchanged. A list replaces the contents of the
  /// vector.
  bool getProperty(NodeLexicon::Properties property, std::string& value) const;
  bool getProperty(NodeLexicon::Properties property, unsigned int& value) const;
  bool getProperty(NodeLexicon::Properties property, std::vector<std::string>& value) const;

  /// Store a property of the current node. Every cursor that is placed by type from now on sees it, in this process and
  /// in others. True if the value is stored. False, with the reason in the agent's log, if it could not be stored, if
  /// the property cannot be set, or if the cursor is on no node. This cursor itself still sees the old value.
  bool setProperty(NodeLexicon::Properties property, std::string& value);
  bool setProperty(NodeLexicon::Properties property, std::vector<std::string> value);

  /// The path of the parent of the current node, in the form that selectNode takes; empty for the root or if the cursor
  /// is on no node. A path is constant while the node exists.
  std::string getPathToParentNode() const;

  /// The description of the current node, empty if it has none: the product or "Computer" for the host, exactly "BMC"
  /// for the node of a service processor.
  std::string getNodeDescription() const;

 private:
  struct Position;
  std::unique_ptr<Position> position_;  ///< null: no node, no snapshot
};

}  // namespace ZV
