#include "frontend/SettingsClaims.h"

#include <algorithm>
#include <iterator>
#include <utility>

#include "agent/Agent.h"
#include "util/Names.h"

namespace zorva::frontend {

namespace {

using broker::Access;

// The classes whose providers read interface files: the settings, and the associations that read them.
constexpr const char* kReadsFiles[] = {kSettingClass,
                                       kGeneralSettingClass,
                                       "ZORVA_DNSGeneralElementSettingData",
                                       "ZORVA_DNSGenEndPointElementSettingData",
                                       "ZORVA_DNSEndPointElementSettingData",
                                       "ZORVA_DNSGenOrderedComponent",
                                       "ZORVA_DNSOrderedComponent"};
constexpr const char* kChanges[] = {kSettingClass, kGeneralSettingClass, kEndpointClass};

bool isNamed(std::string_view className, const char* const* first, const char* const* last) {
  return std::any_of(first, last, [className](const char* each) { return util::sameName(each, className); });
}

bool needsClaim(Access access, std::string_view className) {
  if (access == Access::Read) return isNamed(className, std::begin(kReadsFiles), std::end(kReadsFiles));
  return isNamed(className, std::begin(kChanges), std::end(kChanges));
}

/// Empty if the change does not write to a file.
std::string interfaceOfFile(const broker::ObjectPath& changed) {
  if (util::sameName(changed.className, kGeneralSettingClass)) {
    return interfaceOfHostSettings(*zorva::agent::currentTree()).value_or("");
  }
  if (!util::sameName(changed.className, kSettingClass)) return {};
  const broker::Value* id = changed.key("InstanceID");
  return id == nullptr ? std::string() : interfaceOfId(id->asText());
}

using LockPointer = std::shared_ptr<zorva::agent::SettingsLock>;

LockPointer takeLock(Access access) {
  return std::make_shared<zorva::agent::SettingsLock>(zorva::agent::dataDirectory(), access == Access::Change
                                                                                         ? zorva::agent::Access::Change
                                                                                         : zorva::agent::Access::Read);
}

class LockClaim : public broker::Claim {
 public:
  explicit LockClaim(LockPointer lock) : lock_(std::move(lock)) {}

  broker::Status finish() override {
    const std::string problem = lock_->finish();
    return problem.empty() ? broker::Status() : broker::Status{1, problem};  // CIM_ERR_FAILED
  }

 private:
  const LockPointer lock_;
};

}  // namespace

struct SettingsClaims::State {
  LockPointer held;  // of a program that holds the lock itself
};

SettingsClaims::SettingsClaims() : state_(std::make_shared<State>()) {}

broker::ClaimHook SettingsClaims::hook() const {
  return [state = state_](Access access, std::string_view className, const broker::ObjectPath* changed) {
    std::unique_ptr<broker::Claim> claim;
    const bool changes = access == Access::Change;
    if (!needsClaim(access, className) || (state->held != nullptr && !changes)) return claim;
    const LockPointer lock = state->held != nullptr ? state->held : takeLock(access);
    const std::string interface = changed == nullptr ? std::string() : interfaceOfFile(*changed);
    if (!interface.empty()) lock->keepAside(interface);
    claim = std::make_unique<LockClaim>(lock);
    return claim;
  };
}

SettingsClaims::Hold::Hold(const SettingsClaims& claims) {
  if (claims.state_->held != nullptr) return;
  claims.state_->held = takeLock(Access::Change);
  state_ = claims.state_;
}

SettingsClaims::Hold::~Hold() {
  if (state_ != nullptr) state_->held = nullptr;
}

std::string interfaceOfId(std::string_view instanceId) {
  const std::size_t percent = instanceId.find('%');
  return percent == std::string_view::npos ? std::string() : std::string(instanceId.substr(percent + 1));
}

std::string settingIdOf(std::string_view interface, bool isServiceProcessor) {
  return std::string(isServiceProcessor ? "BMC%" : "Computer%").append(interface);
}

std::optional<std::string> interfaceOfHostSettings(const zorva::agent::TreeSnapshot& tree) {
  for (const zorva::agent::Node& node : tree.nodes()) {
    if (node.type() != zorva::agent::NodeType::NetworkIPConfig) continue;
    if (tree.systemOf(node).isServiceProcessor()) continue;
    return node.textOrEmpty(ZV::NodeLexicon::PROP_NAME);
  }
  return std::nullopt;
}

}  // namespace zorva::frontend
