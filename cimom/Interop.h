#pragma once

// The server's description of itself, in the namespaces "interop" and "root/interop": its namespaces, itself as
// CIM_ObjectManager, its protocol, and the registration (DSP1033) of its DNS client profile. The endpoints that conform
// to it are the profile's central instances. The association from an endpoint to the profile is in the endpoint's own
// namespace as well.

#include "broker/Broker.h"

namespace zorva::cimom {

/// Adds the two namespaces and the provider of their classes, which is linked into the program. The broker that is made
/// with `options` must have the classes of schema::ClassSet::Interop.
void serveInterop(broker::BrokerOptions& options);

}  // namespace zorva::cimom
