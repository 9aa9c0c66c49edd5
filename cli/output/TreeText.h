#pragma once

#include <string>
#include <vector>

#include "agent/tree/TreeSnapshot.h"
#include "cli/output/Table.h"

namespace zorva::cli {

/// The instrumentation tree as lines: each node below its parent, and each property of a node on a line below it. A
/// value that was set and replaces the host's own is marked.
std::string treeText(const zorva::agent::TreeSnapshot& tree, const Layout& layout);

/// A value that was set through the agent, for display.
struct OverlayRow {
  std::string path;
  std::string property;
  std::vector<std::string> values;
  bool isList = false;
};

/// The value of a property as texts: one, or one for each element of a list.
std::vector<std::string> valueTexts(const zorva::agent::PropertyValue& value);

}  // namespace zorva::cli
