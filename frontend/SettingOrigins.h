#pragma once

// What tells where the DNS settings of an interface come from.

#include <string>
#include <vector>

#include "agent/tree/Node.h"

namespace zorva::frontend {

/// The class with which zorvacimd tells it to clients that know the host only through CIM.
inline constexpr const char* kSettingOriginClass = "ZORVA_DNSSettingOrigin";

/// The properties of the interface's endpoint whose values were set, and so replace what the owner of the settings
/// says.
std::vector<std::string> setPropertiesOf(const zorva::agent::Node& node);

}  // namespace zorva::frontend
