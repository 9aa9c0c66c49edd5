#include "bmc/Target.h"

#include "bmc/HostInterface.h"

namespace zorva::bmc {

std::optional<Target> findTarget(const agent::BmcConfig& config, const std::string& smbiosTable) {
  std::string url = config.url;
  if (url.empty()) {
    const std::optional<std::string> named = readHostInterface(smbiosTable);
    if (!named) return std::nullopt;
    if (config.user.empty()) {
      throw Failed("the firmware names a Redfish service, " + *named +
                   "; [bmc] user and password_file are needed to ask it");
    }
    url = *named;
  }
  return Target{url, {config.caFile, config.fingerprint}, loginFromFile(config.user, config.passwordFile)};
}

}  // namespace zorva::bmc
