#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "broker/Broker.h"

// Success is success: providers say that a modification was done also where nothing was stored, so what was changed is
// read again. Safe on any thread.

namespace zorva::frontend {

/// A change that came to nothing.
struct LostChange {
  std::string property;
  std::string reason;
};

/// Success where there are none; else CIM_ERR_FAILED with "NAME was not stored: REASON" for each.
broker::Status statusOf(const std::vector<LostChange>& lost);

/// Why a change did not stick; `now` is the instance as it was read again.
using ReasonOf = std::function<std::string(const broker::Instance& now, const broker::Property& change)>;

/// statusOf those changes whose values `now` has not. Values that a setting cannot tell apart (broker::hasSameEffect)
/// are the same here too.
broker::Status checkChanges(const broker::Instance& now, const std::vector<broker::Property>& wanted,
                            const ReasonOf& reasonOf);

/// The reason as far as this host shows it.
std::string reasonOnThisHost(const broker::Instance& now, const broker::Property& change);

/// Broker::modifyInstance, then a look whether what it changed is so. A failure of the provider's own stays as it is.
/// `changed`, where it is not null, gets the properties that it changed, none where all were as asked for.
broker::Status modifyInstance(broker::Broker& broker, const broker::Instance& instance,
                              const std::optional<std::vector<std::string>>& propertyList,
                              const broker::Caller& caller = {}, std::vector<broker::Property>* changed = nullptr);

}  // namespace zorva::frontend
