#pragma once

#include "broker/Broker.h"

// What the server tells of itself, in the namespaces "interop" and "root/interop": its namespaces, itself as
// CIM_ObjectManager, how it is talked to, and the registration (DSP1033) of its DNS client profile with the endpoints
// that conform to it, which are the profile's central instances. The association from an endpoint to the profile is in
// the endpoint's own namespace as well.

namespace zorva::cimom {

/// Adds the two namespaces and the provider of their classes, which is part of the program. The broker that is made
/// with `options` has to have the classes of schema::ClassSet::Interop.
void serveInterop(broker::BrokerOptions& options);

}  // namespace zorva::cimom
