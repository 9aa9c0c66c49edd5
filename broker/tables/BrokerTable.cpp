// CMPIBrokerFT: properties of the broker, threads, and the up-calls of providers. An up-call is a request of its own,
// nested in that of its caller; its results are copied into the caller's scope.
//
// The invocation flags in the context belong to the client's own request and are not applied to up-calls: a client that
// asks for local properties only must not remove keys that the provider needs.

#include <string>
#include <utility>

#include "broker/core/BrokerCore.h"
#include "broker/objects/Data.h"
#include "broker/objects/TableSupport.h"
#include "broker/requests/Request.h"

namespace zorva::broker {

namespace {

/// Copies results into an enumeration of the caller's. Every instance gets its keys, so that it has a name.
class Collector : public Taker {
 public:
  Collector(Arena& arena, CMPIType type) : enumeration_(*arena.make<EnumerationObject>(arena, type)) {}

  bool takeInstance(const InstanceObject& instance, const PropertyMask& wanted) override {
    Arena& arena = *enumeration_.arena;
    CMPIData data = nullData(CMPI_instance, CMPI_goodValue);
    InstanceObject* copy = copyInstance(arena, instance);
    copy->filter = nullptr;
    std::uint32_t kept = 0;
    for (std::uint32_t i = 0; i < copy->count; ++i) {
      const PropertyInfo& property = *copy->slots[i].property;
      if (property.isKey || wanted.has(property)) copy->slots[kept++] = copy->slots[i];
    }
    copy->count = kept;
    data.value.inst = copy;
    enumeration_.append(data);
    return true;
  }

  bool takePath(const PathObject& path) override {
    CMPIData data = nullData(CMPI_ref, CMPI_goodValue);
    data.value.ref = copyPath(*enumeration_.arena, path);
    enumeration_.append(data);
    return true;
  }

  EnumerationObject& enumeration() noexcept { return enumeration_; }
  const CMPIData* first() const noexcept { return enumeration_.count != 0 ? enumeration_.elements : nullptr; }

 private:
  EnumerationObject& enumeration_;
};

void copyContextEntries(Arena& arena, const CMPIContext* given, ContextObject& context) {
  if (const ContextObject* known = own<ContextObject>(given)) {
    copyEntries(arena, known->list, context.list);
  } else {
    CMPIStatus status{CMPI_RC_OK, nullptr};
    const CMPICount count = given->ft->getEntryCount(given, &status);
    for (CMPICount i = 0; i < count && status.rc == CMPI_RC_OK; ++i) {
      CMPIString* name = nullptr;
      const CMPIData entry = given->ft->getEntryAt(given, i, &name, &status);
      if (status.rc == CMPI_RC_OK && entry.type == CMPI_string && (entry.state & CMPI_nullValue) == 0) {
        context.list.set(arena, StringObject::make(arena, textOf(name)),
                         stringData(StringObject::make(arena, textOf(entry.value.string))));
      }
    }
  }
  context.setFlags(CMPI_FLAG_DeepInheritance);
}

/// The beginning of every up-call: the caller's arena, the checked handles, and the nested request.
class UpCall {
 public:
  UpCall(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path)
      : core_(BrokerCore::of(broker)), callers_(currentArena()) {
    const bool goodContext = own<ContextObject>(context) != nullptr || isForeign(context);
    if (core_ == nullptr || callers_ == nullptr || !goodContext) return;
    path_ = readPath(*callers_, path);
    if (path_ == nullptr) return;
    request_.emplace(*core_);
    copyContextEntries(request_->arena(), context, request_->context());
  }

  bool good() const noexcept { return request_.has_value(); }
  Arena& callersArena() noexcept { return *callers_; }
  const PathObject& path() const noexcept { return *path_; }
  Request& request() noexcept { return *request_; }

 private:
  BrokerCore* core_;
  Arena* callers_;
  const PathObject* path_ = nullptr;
  std::optional<Request> request_;
};

/// A status with its message in the scope that is innermost now. Call it after the nested request has ended.
void setResult(CMPIStatus* status, const Status& result) noexcept {
  setStatus(status, static_cast<CMPIrc>(result.rc), result.message);
}

Shape shapeOf(const char** properties) {
  Shape shape;
  if (properties == nullptr) return shape;
  shape.properties.emplace();
  for (; *properties != nullptr; ++properties) shape.properties->emplace_back(*properties);
  return shape;
}

std::string_view orEmpty(const char* text) noexcept { return text != nullptr ? text : std::string_view(); }

/// Runs `ask(Request&, const PathObject&, Taker&)` and returns what it collected; null on a failure.
template <typename Ask>
CMPIEnumeration* collected(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                           CMPIType type, CMPIStatus* status, Ask&& ask) {
  Status result;
  EnumerationObject* enumeration = nullptr;
  {
    UpCall call(broker, context, path);
    if (!call.good()) return badHandle<CMPIEnumeration*>(status);
    Collector collector(call.callersArena(), type);
    result = ask(call.request(), call.path(), collector);
    enumeration = &collector.enumeration();
  }
  setResult(status, result);
  return result.ok() ? enumeration : nullptr;
}

CMPIEnumeration* enumerateInstanceNames(const CMPIBroker* broker, const CMPIContext* context,
                                        const CMPIObjectPath* path, CMPIStatus* status) {
  return collected(broker, context, path, CMPI_ref, status, [](Request& request, const PathObject& of, Taker& taker) {
    return request.enumerate(of, Form::Paths, Shape(), taker);
  });
}

CMPIEnumeration* enumerateInstances(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                                    const char** properties, CMPIStatus* status) {
  const Shape shape = shapeOf(properties);
  return collected(broker, context, path, CMPI_instance, status,
                   [&](Request& request, const PathObject& of, Taker& taker) {
                     return request.enumerate(of, Form::Instances, shape, taker);
                   });
}

CMPIEnumeration* associators(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                             const char* associationClass, const char* resultClass, const char* role,
                             const char* resultRole, const char** properties, CMPIStatus* status) {
  const FarEnd filter{orEmpty(associationClass), orEmpty(resultClass), orEmpty(role), orEmpty(resultRole)};
  const Shape shape = shapeOf(properties);
  return collected(broker, context, path, CMPI_instance, status,
                   [&](Request& request, const PathObject& of, Taker& taker) {
                     return request.associated(of, Form::Instances, filter, shape, taker);
                   });
}

CMPIEnumeration* associatorNames(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                                 const char* associationClass, const char* resultClass, const char* role,
                                 const char* resultRole, CMPIStatus* status) {
  const FarEnd filter{orEmpty(associationClass), orEmpty(resultClass), orEmpty(role), orEmpty(resultRole)};
  return collected(broker, context, path, CMPI_ref, status, [&](Request& request, const PathObject& of, Taker& taker) {
    return request.associated(of, Form::Paths, filter, Shape(), taker);
  });
}

CMPIEnumeration* references(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                            const char* associationClass, const char* role, const char** properties,
                            CMPIStatus* status) {
  const FarEnd filter{orEmpty(associationClass), {}, orEmpty(role), {}};
  const Shape shape = shapeOf(properties);
  return collected(broker, context, path, CMPI_instance, status,
                   [&](Request& request, const PathObject& of, Taker& taker) {
                     return request.referring(of, Form::Instances, filter, shape, taker);
                   });
}

CMPIEnumeration* referenceNames(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                                const char* associationClass, const char* role, CMPIStatus* status) {
  const FarEnd filter{orEmpty(associationClass), {}, orEmpty(role), {}};
  return collected(broker, context, path, CMPI_ref, status, [&](Request& request, const PathObject& of, Taker& taker) {
    return request.referring(of, Form::Paths, filter, Shape(), taker);
  });
}

/// The instance that a path names, in the caller's scope.
InstanceObject* fetch(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                      const Shape& shape, CMPIStatus* status) {
  Status result;
  InstanceObject* instance = nullptr;
  {
    UpCall call(broker, context, path);
    if (!call.good()) return badHandle<InstanceObject*>(status);
    Collector collector(call.callersArena(), CMPI_instance);
    result = call.request().get(call.path(), shape, collector);
    if (result.ok()) instance = own<InstanceObject>(collector.first()->value.inst);
  }
  setResult(status, result);
  return instance;
}

CMPIInstance* getInstance(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                          const char** properties, CMPIStatus* status) {
  return fetch(broker, context, path, shapeOf(properties), status);
}

CMPIObjectPath* createInstance(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                               const CMPIInstance* instance, CMPIStatus* status) {
  Status result;
  PathObject* created = nullptr;
  {
    UpCall call(broker, context, path);
    const InstanceObject* given = call.good() ? readInstance(call.request().arena(), instance) : nullptr;
    if (given == nullptr) return badHandle<CMPIObjectPath*>(status);
    Collector collector(call.callersArena(), CMPI_ref);
    result = call.request().create(call.path(), *given, collector);
    if (result.ok()) created = own<PathObject>(collector.first()->value.ref);
  }
  setResult(status, result);
  return created;
}

CMPIStatus modifyInstance(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                          const CMPIInstance* instance, const char** properties) {
  Status result;
  {
    UpCall call(broker, context, path);
    const InstanceObject* given = call.good() ? readInstance(call.request().arena(), instance) : nullptr;
    if (given == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
    result = call.request().modify(call.path(), *given, shapeOf(properties));
  }
  return statusOf(static_cast<CMPIrc>(result.rc), result.message);
}

CMPIStatus deleteInstance(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path) {
  Status result;
  {
    UpCall call(broker, context, path);
    if (!call.good()) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
    result = call.request().remove(call.path());
  }
  return statusOf(static_cast<CMPIrc>(result.rc), result.message);
}

CMPIEnumeration* execQuery(const CMPIBroker* broker, const CMPIContext* /*context*/, const CMPIObjectPath* /*path*/,
                           const char* /*query*/, const char* /*language*/, CMPIStatus* status) {
  const bool good = BrokerCore::of(broker) != nullptr;
  return failed<CMPIEnumeration*>(status, good ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE);
}

CMPIStatus deliverIndication(const CMPIBroker* broker, const CMPIContext* /*context*/, const char* /*nameSpace*/,
                             const CMPIInstance* /*indication*/) {
  const bool good = BrokerCore::of(broker) != nullptr;
  return {good ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_HANDLE, nullptr};
}

/// Adds a method's output to the arguments of the caller, ours or another broker's.
void addOutput(const EntryList& output, CMPIArgs* arguments) {
  ArgsObject* known = own<ArgsObject>(arguments);
  for (const EntryList::Entry& entry : output) {
    if (known != nullptr) {
      known->list.set(*known->arena, copyString(*known->arena, *entry.name), copyData(*known->arena, entry.data));
    } else {
      const bool good = entry.data.state == CMPI_goodValue;
      arguments->ft->addArg(arguments, entry.name->chars, good ? &entry.data.value : nullptr, entry.data.type);
    }
  }
}

/// The arguments of a handle, ours or another broker's; null if it is neither.
const EntryList* readArguments(Arena& arena, const CMPIArgs* handle) {
  if (const ArgsObject* known = own<ArgsObject>(handle)) return &known->list;
  if (!isForeign(handle)) return nullptr;
  auto* list = arena.make<EntryList>();
  CMPIStatus status{CMPI_RC_OK, nullptr};
  const CMPICount count = handle->ft->getArgCount(handle, &status);
  for (CMPICount i = 0; i < count && status.rc == CMPI_RC_OK; ++i) {
    CMPIString* name = nullptr;
    const CMPIData given = handle->ft->getArgAt(handle, i, &name, &status);
    CMPIData data;
    const bool good = (given.state & CMPI_nullValue) == 0;
    if (importData(arena, good ? &given.value : nullptr, given.type, data) == CMPI_RC_OK) {
      list->set(arena, StringObject::make(arena, textOf(name)), data);
    }
  }
  return list;
}

CMPIData invokeMethod(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                      const char* method, const CMPIArgs* in, CMPIArgs* out, CMPIStatus* status) {
  Status result;
  CMPIData value = nullData(CMPI_null);
  {
    UpCall call(broker, context, path);
    const EntryList* input = call.good() ? readArguments(call.request().arena(), in) : nullptr;
    const bool goodOutput = own<ArgsObject>(out) != nullptr || isForeign(out);
    if (input == nullptr || !goodOutput) return badHandle<CMPIData>(status);
    EntryList output;
    result = call.request().invoke(call.path(), orEmpty(method), *input, value, output);
    value = copyData(call.callersArena(), value);
    if (result.ok()) addOutput(output, out);
  }
  setResult(status, result);
  return value;
}

CMPIStatus setProperty(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path,
                       const char* name, const CMPIValue* value, CMPIType type) {
  Status result;
  {
    UpCall call(broker, context, path);
    if (!call.good()) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
    const Expected<PathObject*, Status> resolved = call.request().resolve(call.path());
    if (!resolved) {
      result = resolved.error();
    } else {
      InstanceObject* instance = InstanceObject::make(call.request().arena(), **resolved);
      const CMPIStatus set = instance->ft->setProperty(instance, name, value, type);
      result = {set.rc, std::string(textOf(set.msg))};
      Shape shape;
      shape.properties.emplace().push_back(orEmpty(name));
      if (result.ok()) result = call.request().modify(**resolved, *instance, shape);
    }
  }
  return statusOf(static_cast<CMPIrc>(result.rc), result.message);
}

CMPIData getProperty(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* path, const char* name,
                     CMPIStatus* status) {
  CMPIStatus fetched{CMPI_RC_OK, nullptr};
  Shape shape;
  shape.properties.emplace().push_back(orEmpty(name));
  InstanceObject* instance = fetch(broker, context, path, shape, &fetched);
  if (instance != nullptr) return instance->ft->getProperty(instance, name, status);
  if (status != nullptr) *status = fetched;
  return nullData(CMPI_null, CMPI_badValue | CMPI_nullValue);
}

CMPIContext* prepareAttachThread(const CMPIBroker* broker, const CMPIContext* context) {
  BrokerCore* core = BrokerCore::of(broker);
  const ContextObject* given = own<ContextObject>(context);
  if (core == nullptr || given == nullptr) return nullptr;
  // The new thread may get objects of the request, and make others part of them.
  for (Scope* scope = Scope::current(); scope != nullptr; scope = scope->parent()) scope->share();
  return core->prepareThread(*given);
}

CMPIStatus attachThread(const CMPIBroker* broker, const CMPIContext* context) {
  BrokerCore* core = BrokerCore::of(broker);
  if (core == nullptr || own<ContextObject>(context) == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  return {core->attachThread() ? CMPI_RC_OK : CMPI_RC_ERR_FAILED, nullptr};
}

CMPIStatus detachThread(const CMPIBroker* broker, const CMPIContext* context) {
  BrokerCore* core = BrokerCore::of(broker);
  const ContextObject* given = own<ContextObject>(context);
  if (core == nullptr || given == nullptr) return {CMPI_RC_ERR_INVALID_HANDLE, nullptr};
  return {core->detachThread(given) ? CMPI_RC_OK : CMPI_RC_ERR_FAILED, nullptr};
}

constexpr unsigned kCapabilities = CMPI_MB_BasicRead | CMPI_MB_BasicWrite | CMPI_MB_InstanceManipulation |
                                   CMPI_MB_AssociationTraversal | CMPI_MB_BasicQualifierSupport |
                                   CMPI_MB_OSEncapsulationSupport | CMPI_MB_Supports_MemEnhancements |
                                   CMPI_MB_Supports_Extended_Error;

}  // namespace

CMPIBrokerFT brokerTable = {
    kCapabilities,
    CMPIVersion200,
    "zorva in-process broker",
    guarded<prepareAttachThread>,
    guarded<attachThread>,
    guarded<detachThread>,
    guarded<deliverIndication>,
    guarded<enumerateInstanceNames>,
    guarded<getInstance>,
    guarded<createInstance>,
    guarded<modifyInstance>,
    guarded<deleteInstance>,
    guarded<execQuery>,
    guarded<enumerateInstances>,
    guarded<associators>,
    guarded<associatorNames>,
    guarded<references>,
    guarded<referenceNames>,
    guarded<invokeMethod>,
    guarded<setProperty>,
    guarded<getProperty>,
};

}  // namespace zorva::broker
