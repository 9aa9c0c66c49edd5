#pragma once

#include <vector>

#include "broker/core/ProviderRegistry.h"
#include "broker/objects/Objects.h"
#include "broker/objects/Value.h"
#include "broker/requests/ResultFilter.h"

// What a modification comes to (DSP0200 5.3.2.8): which properties it changes, and what the provider is handed so that
// all others stay as they are.

namespace zorva::broker {

/// A modification as it was asked for. All that it refers to outlives it.
struct ModificationRequest {
  const PathObject& path;         ///< of what is to be changed, in the schema's spelling
  const InstanceObject& given;    ///< of the same class
  const InstanceObject* current;  ///< the instance as it is; null where its provider cannot read it
  const Shape& shape;             ///< its property list; absent: all that `given` has
  const ProviderEntry& provider;
};

struct Modification {
  InstanceObject* handed = nullptr;          ///< what the provider is to get
  std::vector<const PropertyInfo*> changed;  ///< empty: there is nothing to do
};

/// Works a modification out, in `arena`. A property is changed where the client names it with another value than it
/// has. CIM_ERR_INVALID_PARAMETER for a listed name that the class lacks and for a key with another value;
/// CIM_ERR_NOT_SUPPORTED for a change of a property without the qualifier Write.
///
/// The provider gets the changed properties, and the current values of all others, save of those that it leaves alone
/// when they are missing (ProviderEntry::keeps): writing those again could still change what lies around them.
Status planModification(Arena& arena, const ModificationRequest& request, Modification& modification);

}  // namespace zorva::broker
