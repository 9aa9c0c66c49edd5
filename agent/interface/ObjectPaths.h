// Comparison of CMPI object paths.
#pragma once

#include <cmpidt.h>

#include "AgentApi.h"

namespace ZV {

// Whether two paths name the same object: the same class, the same namespace, and the same set of keys in any order.
// Class, namespace and key names match without regard to case; key values match exactly, a text being a text whichever
// of CMPI's two text types carries it. The host is ignored. With comparesReferences, reference values are compared as
// paths by these same rules, an absent namespace standing for that of the enclosing path; without it a reference equals
// no value. False where a path is null or cannot be read. Thread-safe as far as the two paths are.
ZORVA_AGENT_API bool isObjPathsEqual(const CMPIObjectPath* left, const CMPIObjectPath* right, bool comparesReferences);

}  // namespace ZV
