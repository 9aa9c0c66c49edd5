#pragma once

// The classes ZORVA_DNSServerCheck and ZORVA_DNSSuffixCheck: what DNS servers answer, for clients that know the host
// only through CIM. The servers are asked when a client reads an instance.

#include "broker/Broker.h"

namespace zorva::server {

/// Of one reading more servers are left out, and more suffixes. All questions about them go out at once.
inline constexpr std::size_t kMostServersAsked = 64;
inline constexpr std::size_t kMostSuffixesAsked = 64;

/// Adds the provider of both classes, which is linked into the program. The broker that is made with `options` must
/// have the classes of schema::ClassSet::Interop.
void serveServerChecks(broker::BrokerOptions& options);

}  // namespace zorva::server
