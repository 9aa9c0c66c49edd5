#pragma once

// Reads an instance again after a modification: a provider may report success and store nothing. Safe on any thread.

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "broker/Broker.h"

namespace zorva::frontend {

/// A change that was not stored.
struct LostChange {
  std::string property;
  std::string reason;
};

/// Success if there are none; else CIM_ERR_FAILED with "NAME was not stored: REASON" for each.
broker::Status statusOf(const std::vector<LostChange>& lost);

/// Why a change was not stored; `now` is the instance as it was read again.
using ReasonOf = std::function<std::string(const broker::Instance& now, const broker::Property& change)>;

/// statusOf() the changes whose values are not in `now`. Values that a setting cannot tell apart
/// (broker::hasSameEffect) count as equal.
broker::Status checkChanges(const broker::Instance& now, const std::vector<broker::Property>& wanted,
                            const ReasonOf& reasonOf);

/// The reason, as far as it can be found on this host.
std::string reasonOnThisHost(const broker::Instance& now, const broker::Property& change);

/// Broker::modifyInstance, then a check that the changes were stored. A failure of the provider itself is returned
/// unchanged. `effect`, if not null, gets the changed properties; none if all had the requested values already.
broker::Status modifyInstance(broker::Broker& broker, const broker::Instance& instance,
                              const std::optional<std::vector<std::string>>& propertyList,
                              const broker::Caller& caller = {}, broker::ModificationEffect* effect = nullptr);

}  // namespace zorva::frontend
