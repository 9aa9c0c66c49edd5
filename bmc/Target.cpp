#include "bmc/Target.h"

namespace zorva::bmc {

std::optional<Target> findTarget(const agent::BmcConfig& config) {
  if (config.url.empty()) return std::nullopt;
  return Target{config.url, {config.caFile, config.fingerprint}, loginFromFile(config.user, config.passwordFile)};
}

}  // namespace zorva::bmc
