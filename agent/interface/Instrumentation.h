// A forward cursor over the agent's instrumentation tree: the live state of the host as nodes with properties.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "AgentApi.h"
#include "NodeLexicon.h"

namespace ZV {

// A cursor stands on one node of one immutable snapshot of the tree, or on none. A copy stands on the same node of the
// same snapshot and moves on its own. One cursor belongs to one thread; different cursors may be used from different
// threads at the same time.
//
// Texts are bytes as the host gives them, UTF-8 by convention. Every operation may throw std::bad_alloc. Where the tree
// cannot be read, selectNode places the cursor on no node and the agent's log has the reason; in a program that has
// asked for exceptions it throws one derived from std::exception, and the cursor stays where it was.
class ZORVA_AGENT_API Instrumentation {
 public:
  // A cursor that stands on no node.
  Instrumentation();
  Instrumentation(const Instrumentation& other);
  Instrumentation& operator=(const Instrumentation& other);
  ~Instrumentation();

  // Places the cursor on the first node of that type, in tree order, or on none where the tree has no such node. Looks,
  // without blocking, whether the host has changed since the tree was last read, and reads it again only then.
  void selectNode(NodeLexicon::NodeType type);

  // Places the cursor on the node at that path, or on none where the tree has no such path. Does not look at the host:
  // a cursor that already stands in a snapshot stays in it, any other uses the latest one.
  void selectNode(const std::string& path);

  // True while the cursor stands on a node.
  explicit operator bool() const;

  // Moves to the next node of the type that was selected last, in tree order, and to none after the last one. A cursor
  // that was placed by path, or that stands on no node, comes to stand on none.
  Instrumentation& operator++();

  // Give a property of the current node: true and the value, or false where the node has no such property, where it is
  // of another type, or where the cursor stands on no node; the output stays as it was then. A list is put in the place
  // of what the vector held.
  bool getProperty(NodeLexicon::Properties property, std::string& value) const;
  bool getProperty(NodeLexicon::Properties property, unsigned int& value) const;
  bool getProperty(NodeLexicon::Properties property, std::vector<std::string>& value) const;

  // Store a property of the current node, so that every cursor placed by type from now on sees it, in this process and
  // in others. True when the value is stored; false, with the reason in the agent's log, where it could not be, where
  // the property is not one that can be set, or where the cursor stands on no node. What this cursor itself sees stays
  // as it is.
  bool setProperty(NodeLexicon::Properties property, std::string& value);
  bool setProperty(NodeLexicon::Properties property, std::vector<std::string> value);

  // The path of the parent of the current node, which selectNode takes; empty for the root or where the cursor stands
  // on no node. A path stays the same while the node exists.
  std::string getPathToParentNode() const;

  // The description of the current node, empty where it has none: the product or "Computer" for the host, exactly "BMC"
  // for the node of a service processor.
  std::string getNodeDescription() const;

 private:
  struct Position;
  std::unique_ptr<Position> position_;  // null: no node, no snapshot
};

}  // namespace ZV
