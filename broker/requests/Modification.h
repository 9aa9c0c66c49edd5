#pragma once

// Works out a modification (DSP0200 5.3.2.8): which properties it changes, and what the provider gets so that all
// others keep their values.

#include <vector>

#include "broker/core/ProviderRegistry.h"
#include "broker/objects/Objects.h"
#include "broker/objects/Value.h"
#include "broker/requests/ResultFilter.h"

namespace zorva::broker {

/// A modification as requested. All that it refers to outlives it.
struct ModificationRequest {
  const PathObject& path;         ///< of the instance to change, in the schema's spelling
  const InstanceObject& given;    ///< of the same class
  const InstanceObject* current;  ///< the current instance; null if its provider cannot read it
  const Shape& shape;             ///< its property list; absent: all that `given` has
  const ProviderEntry& provider;
};

struct Modification {
  InstanceObject* handed = nullptr;          ///< the instance that the provider gets
  std::vector<const PropertyInfo*> changed;  ///< empty: nothing to do
};

/// Works a modification out, in `arena`. A property is changed if the client names it with a value that is not the
/// current one. CIM_ERR_INVALID_PARAMETER for a listed name that the class lacks and for a key with another value;
/// CIM_ERR_NOT_SUPPORTED for a change of a property without the qualifier Write.
///
/// The provider gets the changed properties and the current values of all others, except those that it leaves unchanged
/// when they are missing (ProviderEntry::keeps): writing those again could still change the text around them.
Status planModification(Arena& arena, const ModificationRequest& request, Modification& modification);

}  // namespace zorva::broker
