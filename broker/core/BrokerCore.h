#pragma once

#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include "broker/core/BrokerOptions.h"
#include "broker/core/ProviderLoader.h"
#include "broker/core/ProviderRegistry.h"
#include "broker/objects/BlockCache.h"
#include "broker/objects/ClassTable.h"
#include "cmpift.h"

// What a broker is made of, behind the class that users see and the tables that providers see. Safe on any thread.

namespace zorva::broker {

class Scope;
struct ContextObject;

class BrokerCore {
 public:
  BrokerCore(std::shared_ptr<const schema::ClassRepository> classes, BrokerOptions options);
  ~BrokerCore();
  BrokerCore(const BrokerCore&) = delete;
  BrokerCore& operator=(const BrokerCore&) = delete;

  /// The core behind a broker handle that a provider gives back; null where it is none of ours.
  static BrokerCore* of(const CMPIBroker* handle) noexcept;

  const CMPIBroker* handle() const noexcept { return &handle_; }
  const ClassTable& classes() const noexcept { return classes_; }
  const ProviderRegistry& registry() const noexcept { return registry_; }
  ProviderLoader& loader() noexcept { return loader_; }
  BlockCache& blocks() noexcept { return blocks_; }

  /// Hands a line to the log hook. What the hook throws is lost.
  void log(LogLevel level, std::string_view text) const noexcept;

  /// What the claim hook gives; null where there is none. Throws what the hook throws.
  std::unique_ptr<Claim> claim(Access access, std::string_view className, const ObjectPath* changed) const {
    return claim_ ? claim_(access, className, changed) : nullptr;
  }

  /// A copy of a request's context for a thread that a provider is about to start. It lives until that thread detaches,
  /// or as long as the broker.
  ContextObject* prepareThread(const ContextObject& context);

  /// Opens a scope on this thread until detachThread. False where one is open already.
  bool attachThread();
  /// Closes it. False where this thread was not attached. `context` is freed where prepareThread made it.
  bool detachThread(const ContextObject* context);

 private:
  struct Attached;

  CMPIBroker handle_;
  ClassTable classes_;
  BlockCache blocks_;
  ProviderRegistry registry_;
  LogHook log_;
  ClaimHook claim_;
  std::mutex threadsMutex_;  // guards the two that follow
  std::vector<std::unique_ptr<Arena>> prepared_;
  std::vector<std::unique_ptr<Attached>> attached_;
  ProviderLoader loader_;  // last: its end calls providers, which may need all that stands above
};

/// Where the function tables of a broker stand.
extern CMPIBrokerFT brokerTable;
extern CMPIBrokerEncFT encapsulationTable;
extern CMPIBrokerExtFT extensionTable;
extern CMPIBrokerMemFT memoryTable;

}  // namespace zorva::broker
