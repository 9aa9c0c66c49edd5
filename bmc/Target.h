#pragma once

// Which service is asked: the configured one, or the one that the firmware names.

#include <memory>
#include <string>

#include "agent/config/Config.h"
#include "bmc/Ipmi.h"
#include "bmc/Service.h"

namespace zorva::bmc {

/// Throws NotOffered if there is no service, or no login for it. The service that the firmware names is asked over IPMI
/// for what the configuration does not say: its certificate, and an account.
Target findTarget(const agent::BmcConfig& config, const std::string& smbiosTable, std::shared_ptr<Ipmi> ipmi);

}  // namespace zorva::bmc
