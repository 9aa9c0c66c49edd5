#pragma once

// The class ZORVA_DNSSettingOrigin: where the DNS settings come from, for clients that know the host only through CIM.

#include <vector>

#include "agent/tree/TreeSnapshot.h"
#include "broker/Broker.h"
#include "host/HostObject.h"

namespace zorva::server {

/// One for each interface, in tree order, and one for the host. Of several interfaces with one name the first.
std::vector<host::HostObject> settingOrigins(const agent::TreeSnapshot& tree);

/// Adds the class's provider, which is linked into the program. The broker that is made with `options` must have the
/// classes of schema::ClassSet::Interop.
void serveSettingOrigins(broker::BrokerOptions& options);

}  // namespace zorva::server
