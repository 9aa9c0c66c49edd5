#pragma once

#include <cstddef>
#include <map>
#include <string>
#include <vector>

#include "broker/objects/Value.h"
#include "cli/output/Progress.h"
#include "cli/session/Session.h"

// The objects and associations that a CIM client can reach, found by walking the CIM operations alone.

namespace zorva::cli {

/// One end of an association.
struct GraphEnd {
  std::string role;
  std::size_t object = 0;  ///< its place in Graph::objects
};

struct GraphAssociation {
  std::string className;
  GraphEnd from;
  GraphEnd to;
};

struct GraphObject {
  broker::ObjectPath path;
  std::string problem;  ///< why it cannot be fetched; empty: it can
};

struct Graph {
  std::vector<GraphObject> objects;  ///< in the order in which they were found
  std::vector<GraphAssociation> associations;
  bool isWhole = true;          ///< false: some object's associations could not be asked for, or were not
  std::size_t notFollowed = 0;  ///< how many objects were not asked for their associations, as that would take too long
};

/// Walks from these objects along references to all that they lead to. Every object that a reference names is fetched
/// once, to see whether it is there. Tells on stderr whose associations cannot be asked for.
///
/// To ask one object takes a time that grows with the number of all. Where they are very many, only the first few are
/// asked, unless `followsAll`, and an object that its class lists counts as there.
Graph walkGraph(Session& session, Progress& progress, const std::vector<broker::ObjectPath>& roots, bool followsAll);

/// The names of all instances of all classes that are no associations, computer systems first. A class whose provider
/// cannot be asked is passed over with a warning; throws Failure where that is so of all.
std::vector<broker::ObjectPath> allObjects(Session& session, Progress& progress);

/// A line for each association with an end that cannot be fetched: the association, the role, the path and why.
std::vector<std::string> danglingReferences(const Graph& graph);

/// "ZORVA_DNSProtocolEndPoint eth0": the class and the key that tells instances apart.
std::string objectLabel(const broker::ObjectPath& path);

/// An indented tree: each object once in full, with its associations and what they lead to under it, and the dangling
/// references at the end.
std::string graphText(const Graph& graph, const Layout& layout);

/// The graph in Graphviz's language. Dangling ends are dashed.
std::string graphDot(const Graph& graph);

}  // namespace zorva::cli
