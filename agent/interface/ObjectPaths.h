#pragma once

// Comparison of CMPI object paths.

#include <cmpidt.h>

#include "AgentApi.h"

namespace ZV {

/// Whether two paths name the same object: the same class, the same namespace, and the same set of keys in any order.
/// Class, namespace and key names match without regard to case; key values match exactly. CMPI's two text types count
/// as the same. The host is ignored. With comparesReferences, reference values are compared as paths by the same rules;
/// an absent namespace means that of the enclosing path. Without it a reference equals no value. False if a path is
/// null or cannot be read. Thread-safe if the two paths are.
ZORVA_AGENT_API bool isObjPathsEqual(const CMPIObjectPath* left, const CMPIObjectPath* right, bool comparesReferences);

}  // namespace ZV
