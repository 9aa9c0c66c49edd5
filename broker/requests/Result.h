#pragma once

// A CMPIResult for a provider's results: it passes each one to a receiver at once.

#include <memory>
#include <mutex>
#include <string>

#include "broker/objects/Objects.h"
#include "broker/requests/HeldClaim.h"

namespace zorva::broker {

class BrokerCore;

/// Takes a provider's results, one at a time. The arguments are valid during the call. False means that no more are
/// needed. Results are dropped unless the function is overridden.
class Receiver {
 public:
  virtual ~Receiver() = default;
  virtual bool takeInstance(const InstanceObject& instance);
  virtual bool takePath(const PathObject& path);
  virtual bool takeData(const CMPIData& data);
};

/// Lives on the stack of the request. Providers may fill it from several threads; calls are serialized.
struct ResultObject : CMPIResult, private util::NotCopied {
  using Handle = CMPIResult;
  static constexpr CMPIResultFT& table = resultTable;

  /// What an operation's provider may return.
  enum Accepts : unsigned { Nothing = 0, Instances = 1, Paths = 2, Values = 4 };

  /// `taker` may be null if nothing is accepted. `provider` names it in log lines.
  ResultObject(BrokerCore& broker, unsigned accepted, Receiver* taker, std::string provider)
      : CMPIResult{this, &table}, core(broker), accepts(accepted), receiver(taker), who(std::move(provider)) {}

  /// Logs that something was dropped.
  void drop(std::string_view what) const;

  BrokerCore& core;
  const unsigned accepts;
  Receiver* const receiver;
  const std::string who;
  Arena* arena = nullptr;  ///< null: release() does nothing

  std::mutex mutex;                  ///< guards the next members
  std::unique_ptr<HeldClaim> claim;  ///< dropped with the first result
  bool full = false;                 ///< the receiver needs no more
  CMPIrc errorCode = CMPI_RC_OK;
  std::string errorMessage;
};

}  // namespace zorva::broker
