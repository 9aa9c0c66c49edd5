#include "broker/core/BrokerCore.h"

#include <algorithm>
#include <thread>

#include "broker/objects/Data.h"
#include "broker/objects/Scope.h"

namespace zorva::broker {

struct BrokerCore::Attached {
  explicit Attached(BrokerCore& core) : thread(std::this_thread::get_id()), scope(core.classes(), core.blocks()) {}
  std::thread::id thread;
  Scope scope;
};

BrokerCore::BrokerCore(std::shared_ptr<const schema::ClassRepository> classes, BrokerOptions options)
    : handle_{this, &brokerTable, &encapsulationTable, &extensionTable, &memoryTable},
      classes_(std::move(classes)),
      registry_(std::move(options.registry)),
      log_(std::move(options.log)),
      claim_(std::move(options.claim)),
      loader_({&handle_, classes_, blocks_, [this](const std::string& warning) { log(LogLevel::Warning, warning); }},
              registry_, std::move(options.providerDirectory), std::move(options.linked)) {}

BrokerCore::~BrokerCore() = default;

BrokerCore* BrokerCore::of(const CMPIBroker* handle) noexcept {
  if (handle == nullptr || handle->hdl == nullptr) return nullptr;
  // Another program layer may replace some of the broker's tables with its own and pass the other calls on.
  const bool ours = handle->bft == &brokerTable || handle->eft == &encapsulationTable || handle->mft == &memoryTable;
  return ours ? static_cast<BrokerCore*>(handle->hdl) : nullptr;
}

void BrokerCore::log(LogLevel level, std::string_view text) const noexcept {
  if (!log_) return;
  try {
    log_(level, text);
  } catch (...) {
    // A log that fails must not fail the request.
  }
}

ContextObject* BrokerCore::prepareThread(const ContextObject& context) {
  auto arena = std::make_unique<Arena>(&classes_, 512);
  auto* copy = arena->make<ContextObject>(*arena);
  copyEntries(*arena, context.list, copy->list);
  const std::lock_guard lock(threadsMutex_);
  prepared_.push_back(std::move(arena));
  return copy;
}

bool BrokerCore::attachThread() {
  if (Scope::current() != nullptr) return false;
  auto attached = std::make_unique<Attached>(*this);
  const std::lock_guard lock(threadsMutex_);
  attached_.push_back(std::move(attached));
  return true;
}

bool BrokerCore::detachThread(const ContextObject* context) {
  const std::lock_guard lock(threadsMutex_);
  const auto attached = std::find_if(attached_.begin(), attached_.end(), [](const auto& candidate) {
    return candidate->thread == std::this_thread::get_id() && &candidate->scope == Scope::current();
  });
  if (attached == attached_.end()) return false;
  attached_.erase(attached);
  if (context == nullptr) return true;
  const auto prepared = std::find_if(prepared_.begin(), prepared_.end(),
                                     [&](const auto& arena) { return arena.get() == context->arena; });
  if (prepared != prepared_.end()) prepared_.erase(prepared);
  return true;
}

}  // namespace zorva::broker
