#include "frontend/HostApply.h"

#include <cmpidt.h>
#include <unistd.h>

#include <chrono>
#include <exception>
#include <optional>
#include <thread>

#include "agent/Agent.h"
#include "agent/SettingsLock.h"
#include "agent/apply/Apply.h"
#include "frontend/SettingsClaims.h"
#include "util/Names.h"

namespace zorva::frontend {

namespace {

using agent::ApplyResult;
using Clock = std::chrono::steady_clock;

/// Of the service processor's keys.
constexpr const char* kBmcPrefix = "BMC%";
constexpr const char* kBmcSystem = "BMC:-1";

/// Empty for a class whose instances are not applied.
std::string interfaceOf(const broker::ObjectPath& path) {
  if (util::sameName(path.className, kGeneralSettingClass)) {
    return interfaceOfHostSettings(*agent::currentTree()).value_or("");
  }
  const bool isSetting = util::sameName(path.className, kSettingClass);
  if (!isSetting && !util::sameName(path.className, kEndpointClass)) return {};
  const broker::Value* key = path.key(isSetting ? "InstanceID" : "Name");
  if (key == nullptr) return {};
  const std::string text(key->asText());
  if (isSetting) return text.starts_with(kBmcPrefix) ? text : interfaceOfId(text);
  const broker::Value* system = path.key("SystemName");
  const bool isOfBmc = system != nullptr && system->asText() == kBmcSystem;
  return (isOfBmc ? kBmcPrefix : "") + text;
}

ApplyResult resultFor(const std::string& interface, bool isDryRun, SettingsLockIs lock) {
  std::optional<agent::SettingsLock> own;
  if (lock == SettingsLockIs::Free) own.emplace(agent::dataDirectory(), agent::Access::Read);
  const std::vector<ApplyResult> results = agent::applySettings({interface}, {isDryRun, false, std::nullopt});
  return results.empty() ? ApplyResult() : results.front();
}

/// What is left to do after the service had its time; as resultFor otherwise.
ApplyResult resultOfService(const std::string& interface, SettingsLockIs lock) {
  constexpr std::chrono::seconds kLongest{15};
  constexpr std::chrono::milliseconds kBetweenLooks{100};
  const Clock::time_point end = Clock::now() + kLongest;
  for (;;) {
    ApplyResult result = resultFor(interface, true, lock);
    if (!result.problem.empty() || result.changes.empty()) return result;
    if (lock == SettingsLockIs::Held || Clock::now() >= end) {
      result.problem = lock == SettingsLockIs::Held
                           ? "this process has not the rights; zorva-apply.service does it after this command, as root"
                           : "zorva-apply.service has not done it in 15 s; 'journalctl -u zorva-apply' says why, and "
                             "'systemctl status zorva-apply.path' whether it waits for changes";
      return result;
    }
    std::this_thread::sleep_for(kBetweenLooks);
  }
}

broker::Status failure(const std::string& reason) {
  return {CMPI_RC_ERR_FAILED, "the change was stored and is not in effect on the host: " + reason};
}

HostEffect effectOf(const std::string& interface, const ApplyResult& result) {
  if (!result.problem.empty()) return {failure(interface + ": " + result.problem), {}};
  if (result.changes.empty()) return {};
  return {{}, interface + ": applied by " + ownerText(result) + (result.note.empty() ? "" : "; " + result.note)};
}

}  // namespace

HostEffect applyToHost(const broker::ObjectPath& changed, SettingsLockIs lock) {
  try {
    if (!agent::currentConfig().appliesToHost) return {};
    const std::string interface = interfaceOf(changed);
    if (interface.empty()) return {};
    const bool isRoot = ::geteuid() == 0;
    return effectOf(interface, isRoot ? resultFor(interface, false, lock) : resultOfService(interface, lock));
  } catch (const std::exception& error) {
    return {failure(error.what()), {}};
  }
}

std::string ownerText(const ApplyResult& result) {
  if (result.profile.empty()) return result.owner;
  return result.owner + ", " + (result.owner == "NetworkManager" ? "profile " : "") + result.profile;
}

}  // namespace zorva::frontend
