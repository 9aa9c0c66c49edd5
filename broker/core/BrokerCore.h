#pragma once

// The inside of a broker: users see the class Broker, providers see the function tables. Safe on any thread.

#include <cmpift.h>

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
#include "util/NotCopied.h"

namespace zorva::broker {

class Scope;
struct ContextObject;

class BrokerCore : util::NotCopied {
 public:
  BrokerCore(std::shared_ptr<const schema::ClassRepository> classes, BrokerOptions options);
  ~BrokerCore();

  /// The core of a broker handle that a provider passes; null if the handle is not one of this program.
  static BrokerCore* of(const CMPIBroker* handle) noexcept;

  const CMPIBroker* handle() const noexcept { return &handle_; }
  const ClassTable& classes() const noexcept { return classes_; }
  const ProviderRegistry& registry() const noexcept { return registry_; }
  ProviderLoader& loader() noexcept { return loader_; }
  BlockCache& blocks() noexcept { return blocks_; }

  /// Passes a line to the log hook. Exceptions of the hook are ignored.
  void log(LogLevel level, std::string_view text) const noexcept;

  /// The result of the claim hook; null without a hook. Throws what the hook throws.
  std::unique_ptr<Claim> claim(Access access, std::string_view className, const ObjectPath* changed) const {
    return claim_ ? claim_(access, className, changed) : nullptr;
  }

  /// A copy of a request's context for a thread that a provider is about to start. It lives until that thread detaches,
  /// or as long as the broker.
  ContextObject* prepareThread(const ContextObject& context);

  /// Opens a scope on this thread until detachThread. False where one is open already.
  bool attachThread();
  /// Closes that scope. False if this thread was not attached. Frees `context` if prepareThread made it.
  bool detachThread(const ContextObject* context);

 private:
  struct Attached;

  CMPIBroker handle_;
  ClassTable classes_;
  BlockCache blocks_;
  ProviderRegistry registry_;
  LogHook log_;
  ClaimHook claim_;
  std::mutex threadsMutex_;  ///< guards the next two members
  std::vector<std::unique_ptr<Arena>> prepared_;
  std::vector<std::unique_ptr<Attached>> attached_;
  ProviderLoader loader_;  ///< last: its destructor calls providers, which may need all members above
};

/// The function tables of every broker.
extern CMPIBrokerFT brokerTable;
extern CMPIBrokerEncFT encapsulationTable;
extern CMPIBrokerExtFT extensionTable;
extern CMPIBrokerMemFT memoryTable;

}  // namespace zorva::broker
