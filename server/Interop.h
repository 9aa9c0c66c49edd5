#pragma once

#include "broker/Broker.h"

// What the server tells of itself, in the namespaces "interop" and "root/interop": its namespaces, itself as
// CIM_ObjectManager, how it is talked to, and DMTF's registration (DSP1033) of its DNS Client profile (DSP1038) with
// the endpoints and computer systems that conform to it.

namespace zorva::server {

/// Adds the two namespaces, and the provider of their classes, which is part of the program. The broker that is made
/// with `options` has to have the classes of schema::ClassSet::Interop.
void serveInterop(broker::BrokerOptions& options);

}  // namespace zorva::server
