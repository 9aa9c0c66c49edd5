#pragma once

#include <string>

#include "agent/tree/TreeSnapshot.h"
#include "cli/Table.h"

namespace zorva::cli {

/// The instrumentation tree as lines: each node under its parent, a property of a node a line of its own under it. A
/// value that was set and stands in for the host's own is marked.
std::string treeText(const zorvagent::TreeSnapshot& tree, const Layout& layout);

}  // namespace zorva::cli
