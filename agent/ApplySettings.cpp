#include <utility>

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

Applier makeApplier(OverlayValues overlay) {
  const Config& config = configOfHost();
  return {config.dataDir, [] { return Runtime::instance().lookAtSource(); }, std::move(overlay), config.bmc.file};
}

}  // namespace

std::vector<ApplyResult> applySettings(const std::vector<std::string>& interfaces, const ApplyOptions& options) {
  return makeApplier(Runtime::instance().overlay().read()).apply(interfaces, options);
}

std::vector<ApplyResult> revertSettings(const std::vector<std::string>& interfaces, const ApplyOptions& options) {
  // A wrong overlay must not keep anybody from taking changes back.
  return makeApplier(Runtime::instance().overlay().readIfGood()).revert(interfaces, options);
}

std::vector<ApplyResult> endTrial() { return makeApplier(Runtime::instance().overlay().readIfGood()).endTrial(); }

std::optional<std::chrono::system_clock::time_point> pendingTrial() { return pendingTrialIn(configOfHost().dataDir); }

void confirmTrial() { confirmTrialIn(configOfHost().dataDir); }

}  // namespace zorva::agent
