#pragma once

// The objects and associations that a CIM client can reach, found with CIM operations only.

#include <cstddef>
#include <map>
#include <string>
#include <vector>

#include "broker/objects/Value.h"
#include "cli/output/Progress.h"
#include "cli/session/Session.h"

namespace zorva::cli {

/// One end of an association.
struct GraphEnd {
  std::string role;
  std::size_t object = 0;  ///< its index in Graph::objects
};

struct GraphAssociation {
  std::string className;
  GraphEnd from;
  GraphEnd to;
};

struct GraphObject {
  broker::ObjectPath path;
  std::string problem;  ///< why it cannot be fetched; empty if it can
};

struct Graph {
  std::vector<GraphObject> objects;  ///< in the order in which they were found
  std::vector<GraphAssociation> associations;
  bool isWhole = true;  ///< false: the associations of some objects could not be queried, or were not
  std::size_t notFollowed =
      0;  ///< how many objects were not queried for their associations, because that would take too long
};

/// Follows the references from these objects to all objects that they reach. Every object that a reference names is
/// fetched once, to check that it exists. Prints on stderr the objects whose associations cannot be queried.
///
/// The time to query one object grows with the number of all. If there are very many, only the first few are queried,
/// unless `followsAll`, and an object in the list of its class counts as existing.
Graph walkGraph(Session& session, Progress& progress, const std::vector<broker::ObjectPath>& roots, bool followsAll);

/// The names of all instances of all classes that are no associations, computer systems first. A class whose provider
/// cannot be queried is skipped with a warning; throws Failure if that is true of all.
std::vector<broker::ObjectPath> allObjects(Session& session, Progress& progress);

/// A line for each association with an end that cannot be fetched: the association, the role, the path and the reason.
std::vector<std::string> danglingReferences(const Graph& graph);

/// "ZORVA_DNSProtocolEndPoint eth0": the class and the key that identifies the instance.
std::string objectLabel(const broker::ObjectPath& path);

/// An indented tree: each object once in full, with its associations and their far ends below it, and the dangling
/// references at the end.
std::string graphText(const Graph& graph, const Layout& layout);

/// The graph in Graphviz's language. Dangling ends are dashed.
std::string graphDot(const Graph& graph);

}  // namespace zorva::cli
