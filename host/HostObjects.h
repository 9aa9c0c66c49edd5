#pragma once

// The computer systems, IP endpoints and IP assignment settings in a tree of the host.

#include <vector>

#include "agent/tree/TreeSnapshot.h"
#include "host/HostObject.h"

namespace zorva::host {

/// ZORVA_ComputerSystem, one: the host, known by its system name. ZORVA_SPComputerSystem, one if the tree has a service
/// processor: its name is "BMC:-1". Reads the serial number and the machine's id, if the host permits it.
std::vector<HostObject> computerSystems(const zorva::agent::TreeSnapshot& tree);

/// ZORVA_IPProtocolEndpoint, one for each IP address. The first of an interface has the interface's name. Each further
/// one has the interface's name, "_" and its ordinal, or the next ordinal that makes an unused name.
std::vector<HostObject> ipEndpoints(const zorva::agent::TreeSnapshot& tree);

/// ZORVA_IPAssignmentSettingData, one for each interface and each IP version of its addresses. The InstanceID is that
/// of the interface's DNS settings, "%" and "ipv4" or "ipv6".
std::vector<HostObject> ipAssignments(const zorva::agent::TreeSnapshot& tree);

}  // namespace zorva::host
