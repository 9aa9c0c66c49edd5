#pragma once

// Which system a network interface belongs to.

#include <Instrumentation.h>

#include <string>

namespace ZV {

/// The description of the node's grandparent: the product or "Computer" for the host, exactly "BMC" for the service
/// processor. The cursor itself does not move. Throws what the instrumentation throws.
inline std::string owningSystemDescription(Instrumentation& cursor) {
  Instrumentation ancestor;
  ancestor.selectNode(cursor.getPathToParentNode());
  ancestor.selectNode(ancestor.getPathToParentNode());
  return ancestor.getNodeDescription();
}

inline constexpr const char* kServiceProcessorDescription = "BMC";

}  // namespace ZV
