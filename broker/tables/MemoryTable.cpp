// CMPIBrokerMemFT: memory that is freed with the request.

#include <cstring>

#include "broker/core/BrokerCore.h"
#include "broker/objects/Scope.h"
#include "broker/objects/TableSupport.h"

namespace zorva::broker {

namespace {

/// The scope of a call: the innermost of this thread, if the broker is ours.
Scope* scopeOf(const CMPIBroker* broker) noexcept {
  return BrokerCore::of(broker) != nullptr ? Scope::current() : nullptr;
}

CMPIGcStat* mark(const CMPIBroker* broker, CMPIStatus* status) {
  Scope* scope = scopeOf(broker);
  if (scope == nullptr) return badHandle<CMPIGcStat*>(status);
  setStatus(status, CMPI_RC_OK);
  return const_cast<void*>(scope->mark());
}

CMPIStatus release(const CMPIBroker* broker, const CMPIGcStat* mark) {
  Scope* scope = scopeOf(broker);
  return {scope != nullptr && scope->release(mark) ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE, nullptr};
}

void* cmpiMalloc(const CMPIBroker* broker, std::size_t size) {
  Scope* scope = scopeOf(broker);
  return scope != nullptr ? scope->allocate(size) : nullptr;
}

void* cmpiCalloc(const CMPIBroker* broker, std::size_t count, std::size_t size) {
  std::size_t total = 0;
  if (__builtin_mul_overflow(count, size, &total)) return nullptr;
  void* memory = cmpiMalloc(broker, total);
  if (memory != nullptr) std::memset(memory, 0, total);
  return memory;
}

void* cmpiRealloc(const CMPIBroker* broker, void* block, std::size_t size) {
  if (block == nullptr) return cmpiMalloc(broker, size);
  Scope* scope = scopeOf(broker);
  return scope != nullptr ? scope->reallocate(block, size) : nullptr;
}

char* cmpiStrDup(const CMPIBroker* broker, const char* text) {
  if (text == nullptr) return nullptr;
  const std::size_t size = std::strlen(text) + 1;
  void* copy = cmpiMalloc(broker, size);
  return copy != nullptr ? static_cast<char*>(std::memcpy(copy, text, size)) : nullptr;
}

void cmpiFree(const CMPIBroker* broker, void* block) {
  if (Scope* scope = scopeOf(broker)) scope->free(block);
}

/// freeInstance and its siblings: the object's own release.
template <typename Object>
void freeObject(const CMPIBroker* broker, typename Object::Handle* object) {
  if (BrokerCore::of(broker) == nullptr) return;
  if (isForeign(object)) {
    object->ft->release(object);
  } else {
    releaseObject<Object>(object);
  }
}

// This broker makes no such objects.
void freeSelectExp(const CMPIBroker* /*broker*/, CMPISelectExp* /*expression*/) {}

}  // namespace

CMPIBrokerMemFT memoryTable = {
    kTableVersion,
    guarded<mark>,
    guarded<release>,
    guarded<cmpiMalloc>,
    guarded<cmpiCalloc>,
    guarded<cmpiRealloc>,
    guarded<cmpiStrDup>,
    guarded<cmpiFree>,
    guarded<freeObject<InstanceObject>>,
    guarded<freeObject<PathObject>>,
    guarded<freeObject<ArgsObject>>,
    guarded<freeObject<StringObject>>,
    guarded<freeObject<ArrayObject>>,
    guarded<freeObject<DateTimeObject>>,
    guarded<freeSelectExp>,
};

}  // namespace zorva::broker
