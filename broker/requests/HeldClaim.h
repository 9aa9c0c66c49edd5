#pragma once

#include <memory>
#include <utility>

#include "broker/core/BrokerOptions.h"
#include "broker/objects/Scope.h"
#include "util/NotCopied.h"

namespace zorva::broker {

/// A claim of a request, and its mark in the request's scope. The scope outlives it.
class HeldClaim : util::NotCopied {
 public:
  HeldClaim(Scope& scope, std::unique_ptr<Claim> claim) : scope_(scope), claim_(std::move(claim)) {
    scope_.setClaimed(true);
  }
  ~HeldClaim() { scope_.setClaimed(false); }

  /// The final status of a request that ended with this one: a failure that its provider did not notice takes
  /// precedence.
  Status finish(Status status) {
    Status unnoticed = claim_->finish();
    return unnoticed.ok() ? std::move(status) : std::move(unnoticed);
  }

 private:
  Scope& scope_;
  const std::unique_ptr<Claim> claim_;
};

}  // namespace zorva::broker
