#include "agent/Runtime.h"
#include "agent/apply/Applier.h"
#include "agent/apply/Apply.h"
#include "agent/config/CurrentConfig.h"

namespace zorva::agent {
namespace {

const Config& configOfHost() {
  CurrentConfig::instance().check();
  const Config& config = CurrentConfig::instance().get();
  if (config.source == "host") return config;
  throw ConfigError(config.file, 0, "tree.source", "is a file and no host: nothing can be applied to it");
}

Applier makeApplier() {
  return {configOfHost().dataDir, [] { return Runtime::instance().lookAtSource(); }};
}

}  // namespace

std::vector<ApplyResult> applySettings(const std::vector<std::string>& interfaces, const ApplyOptions& options) {
  return makeApplier().apply(interfaces, Runtime::instance().overlay().read(), options);
}

std::vector<ApplyResult> revertSettings(const std::vector<std::string>& interfaces, const ApplyOptions& options) {
  return makeApplier().revert(interfaces, options);
}

std::vector<ApplyResult> endTrial() { return makeApplier().endTrial(); }

std::optional<std::chrono::system_clock::time_point> pendingTrial() { return pendingTrialIn(configOfHost().dataDir); }

void confirmTrial() { confirmTrialIn(configOfHost().dataDir); }

}  // namespace zorva::agent
