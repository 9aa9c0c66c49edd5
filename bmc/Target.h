#pragma once

// Which service is asked: the configured one, or the one that the firmware names.

#include <optional>
#include <string>

#include "agent/config/Config.h"
#include "bmc/Service.h"

namespace zorva::bmc {

/// Nothing if there is none. Throws Failed if the firmware names one, and there is no login for it.
std::optional<Target> findTarget(const agent::BmcConfig& config, const std::string& smbiosTable);

}  // namespace zorva::bmc
