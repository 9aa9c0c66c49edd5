// The computer systems, IP endpoints and IP assignment settings that a tree of the host holds.
#pragma once

#include <vector>

#include "agent/tree/TreeSnapshot.h"
#include "host/HostObject.h"

namespace zorva::host {

// ZORVA_ComputerSystem, one: the host, known by its system name. ZORVA_SPComputerSystem, one where the tree has a
// service processor: it is known as "BMC:-1". Reads the serial number and the machine's id, where the host lets it.
std::vector<HostObject> computerSystems(const zorva::agent::TreeSnapshot& tree);

// ZORVA_IPProtocolEndpoint, one for each IP address: the first of an interface is named as the interface, each further
// one as the interface, "_" and its ordinal, or the next ordinal that makes a name that nobody has.
std::vector<HostObject> ipEndpoints(const zorva::agent::TreeSnapshot& tree);

// ZORVA_IPAssignmentSettingData, one for each interface and each IP version that it has an address of. The InstanceID
// is that of the interface's DNS settings, "%" and "ipv4" or "ipv6".
std::vector<HostObject> ipAssignments(const zorva::agent::TreeSnapshot& tree);

}  // namespace zorva::host
