#include "frontend/ReadBack.h"

#include <cmpidt.h>

#include "frontend/SettingPlace.h"

namespace zorva::frontend {

broker::Status statusOf(const std::vector<LostChange>& lost) {
  broker::Status status;
  for (const LostChange& change : lost) {
    status.rc = CMPI_RC_ERR_FAILED;
    status.message += (status.message.empty() ? "" : "; ") + change.property + " was not stored: " + change.reason;
  }
  return status;
}

broker::Status checkChanges(const broker::Instance& now, const std::vector<broker::Property>& wanted,
                            const ReasonOf& reasonOf) {
  std::vector<LostChange> lost;
  for (const broker::Property& change : wanted) {
    const broker::Value* value = now.property(change.name);
    const broker::Value none = broker::Value::null(change.value.type, change.value.isArray);
    if (broker::hasSameEffect(change.value, value != nullptr ? *value : none)) continue;
    lost.push_back({change.name, reasonOf(now, change)});
  }
  return statusOf(lost);
}

std::string reasonOnThisHost(const broker::Instance& now, const broker::Property& change) {
  if (change.value.isNull) return "null leaves the value as it is; an empty value empties it";
  return missingPlace(now, change.name).value_or("the provider took it and still says otherwise");
}

namespace {

broker::Status checkEffect(const broker::ModificationEffect& effect) {
  if (effect.reading.ok()) return checkChanges(effect.now, effect.changes, reasonOnThisHost);
  if (effect.reading.rc == CMPI_RC_ERR_NOT_SUPPORTED) return {};  // its provider reads nothing
  return {CMPI_RC_ERR_FAILED, "it was changed, and then could not be read again: " + effect.reading.message};
}

}  // namespace

broker::Status modifyInstance(broker::Broker& broker, const broker::Instance& instance,
                              const std::optional<std::vector<std::string>>& propertyList, const broker::Caller& caller,
                              broker::ModificationEffect* effect) {
  broker::ModificationEffect own;
  broker::ModificationEffect& made = effect != nullptr ? *effect : own;
  broker::Status status = broker.modifyInstance(instance, propertyList, caller, &made);
  if (status.ok() && !made.changes.empty()) status = checkEffect(made);
  return status;
}

}  // namespace zorva::frontend
