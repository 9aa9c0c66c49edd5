#pragma once

#include <memory>
#include <mutex>
#include <string>

#include "broker/objects/Objects.h"
#include "broker/requests/HeldClaim.h"

// Where a provider puts its results: a CMPIResult that hands each of them on at once to a receiver.

namespace zorva::broker {

class BrokerCore;

/// Takes a provider's results, one at a time. What is referred to lives as long as the call. false: no more are wanted.
/// What is not overridden drops what it is given.
class Receiver {
 public:
  virtual ~Receiver() = default;
  virtual bool takeInstance(const InstanceObject& instance);
  virtual bool takePath(const PathObject& path);
  virtual bool takeData(const CMPIData& data);
};

/// Lives on the stack of the request. Providers may fill it from several threads, one call at a time gets through.
struct ResultObject : CMPIResult {
  using Handle = CMPIResult;
  static constexpr CMPIResultFT& table = resultTable;

  /// What an operation's provider may return.
  enum Accepts : unsigned { Nothing = 0, Instances = 1, Paths = 2, Values = 4 };

  /// `receiver` may be null where nothing is accepted. `provider` names it in log lines.
  ResultObject(BrokerCore& broker, unsigned accepted, Receiver* taker, std::string provider)
      : CMPIResult{this, &table}, core(broker), accepts(accepted), receiver(taker), who(std::move(provider)) {}
  ResultObject(const ResultObject&) = delete;
  ResultObject& operator=(const ResultObject&) = delete;

  /// Logs that something was dropped.
  void drop(std::string_view what) const;

  BrokerCore& core;
  const unsigned accepts;
  Receiver* const receiver;
  const std::string who;
  Arena* arena = nullptr;  ///< it is in none: release() is harmless

  std::mutex mutex;                  // guards what follows
  std::unique_ptr<HeldClaim> claim;  ///< goes with the first result
  bool full = false;                 ///< the receiver wants no more
  CMPIrc errorCode = CMPI_RC_OK;
  std::string errorMessage;
};

}  // namespace zorva::broker
