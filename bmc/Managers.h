#pragma once

// Reads the managers of a service and their Ethernet interfaces.

#include <string>
#include <vector>

#include "bmc/Ethernet.h"
#include "bmc/Redfish.h"

namespace zorva::bmc {

/// What is read of one service.
inline constexpr std::size_t kMostManagers = 16;
inline constexpr std::size_t kMostInterfaces = 64;

/// All managers that have Ethernet interfaces. `remark` says what was left out. Throws Failed.
std::vector<Manager> readManagers(Redfish& redfish, std::string& remark);

}  // namespace zorva::bmc
