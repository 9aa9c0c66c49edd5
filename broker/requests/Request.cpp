#include "broker/requests/Request.h"

#include <cxxabi.h>

#include <algorithm>
#include <exception>

#include "broker/objects/Data.h"
#include "broker/objects/PathText.h"
#include "broker/requests/Modification.h"
#include "util/NotCopied.h"

namespace zorva::broker {

namespace {

// Without a limit, providers that call each other in a circle would use up the stack and end the process.
constexpr unsigned kDeepest = 32;

/// How an operation that asks several providers ends.
class Outcome {
 public:
  /// `passedOver`: the answer counts only if all answers are passed over.
  void add(Status status, bool passedOver) {
    ++asked_;
    if (status.ok()) return;
    if (passedOver) ++passedOver_;
    Status& slot = passedOver ? firstPassedOver_ : firstFailure_;
    if (slot.ok()) slot = std::move(status);
  }

  Status status() && {
    if (!firstFailure_.ok()) return std::move(firstFailure_);
    return asked_ != 0 && asked_ == passedOver_ ? std::move(firstPassedOver_) : Status();
  }

 private:
  unsigned asked_ = 0;
  unsigned passedOver_ = 0;
  Status firstFailure_;
  Status firstPassedOver_;
};

/// Frees what a provider made for one of several classes before the next one is asked.
class MarkGuard : util::NotCopied {
 public:
  explicit MarkGuard(Scope& scope) : scope_(scope), mark_(scope.mark()) {}
  ~MarkGuard() { scope_.release(mark_); }

 private:
  Scope& scope_;
  const void* mark_;
};

Status failure(CMPIrc rc, std::string message) { return {rc, std::move(message)}; }

std::string quoted(std::string_view name) { return quotedText(name.substr(0, 200)); }

}  // namespace

/// An association class to be asked, and the names to ask with.
struct Request::Association {
  const ClassInfo* info;
  const ProviderEntry* entry;
  const ClassInfo* farClass;  ///< of the first far end that fits
  const char* role;           ///< null where the client gave none
  const char* resultRole;
};

Request::Request(BrokerCore& core)
    : core_(core),
      scope_(core.classes(), core.blocks()),
      context_(*scope_.arena().make<ContextObject>(scope_.arena())) {}

Status Request::tooDeep() const {
  if (scope_.depth() <= kDeepest) return {};
  return failure(CMPI_RC_ERR_FAILED, "providers call one another more than " + std::to_string(kDeepest) + " deep");
}

Status Request::claim(Access access, std::string_view className, const ObjectPath* changed,
                      std::unique_ptr<HeldClaim>& held) {
  if (scope_.isClaimed()) return {};
  try {
    std::unique_ptr<Claim> claim = core_.claim(access, className, changed);
    if (claim != nullptr) held = std::make_unique<HeldClaim>(scope_, std::move(claim));
    return {};
  } catch (const std::exception& problem) {
    return failure(CMPI_RC_ERR_FAILED, problem.what());
  }
}

Expected<PathObject*, Status> Request::resolve(const PathObject& path) {
  if (Status status = tooDeep(); !status.ok()) return unexpected(std::move(status));
  const ProviderRegistry& registry = core_.registry();
  const std::string_view nameSpace =
      path.nameSpace->length == 0 ? registry.defaultNameSpace() : registry.nameSpace(path.nameSpace->view());
  if (nameSpace.empty()) {
    return unexpected(
        failure(CMPI_RC_ERR_INVALID_NAMESPACE, "there is no namespace " + quoted(path.nameSpace->view())));
  }
  if (path.info == nullptr) {
    return unexpected(failure(CMPI_RC_ERR_INVALID_CLASS, "there is no class " + quoted(path.className->view())));
  }
  PathObject* resolved = copyPath(arena(), path);
  resolved->setNameSpace(nameSpace);
  return resolved;
}

const ProviderEntry* Request::entryOf(const PathObject& path, const ClassInfo& info, MiKind kind) const {
  const ProviderEntry* entry = core_.registry().find(path.nameSpace->view(), info.name());
  return entry != nullptr && (entry->kinds & kind) != 0 ? entry : nullptr;
}

std::vector<const ClassInfo*> Request::servedBelow(const PathObject& path, const ClassInfo& info) const {
  std::vector<const ClassInfo*> served;
  if (entryOf(path, info, InstanceMi) != nullptr) served.push_back(&info);
  for (const schema::Class* below : core_.classes().repository().subclasses(&info.declared(), true)) {
    const ClassInfo& candidate = core_.classes().of(*below);
    if (entryOf(path, candidate, InstanceMi) != nullptr) served.push_back(&candidate);
  }
  return served;
}

const char** Request::providerList(const Shape& shape, const std::vector<const ClassInfo*>& classes) {
  if (!shape.properties) return nullptr;
  const auto** list = arena().makeArray<const char*>(shape.properties->size() + 1);
  std::size_t count = 0;
  for (const std::string_view name : *shape.properties) {
    const PropertyInfo* known = nullptr;
    for (std::size_t i = 0; i < classes.size() && known == nullptr; ++i) known = classes[i]->find(name);
    if (known == nullptr) continue;
    const char* spelling = known->name->chars;
    const bool listed = std::any_of(list, list + count,
                                    [&](const char* other) { return std::string_view(other) == known->name->view(); });
    if (!listed) list[count++] = spelling;
  }
  return list;
}

template <typename Function, typename... Args>
Status Request::call(ResultObject& result, const ProviderEntry& entry, std::string_view operation, Function function,
                     Args... args) {
  Status status;
  const std::string what = entry.prefix + " (" + std::string(operation) + " of " + entry.className + ")";
  if (function == nullptr) return failure(CMPI_RC_ERR_NOT_SUPPORTED, what + " is not supported by the provider");
  if ((result.accepts & (ResultObject::Instances | ResultObject::Paths)) != 0) {
    status = claim(Access::Read, entry.className, nullptr, result.claim);
    if (!status.ok()) return status;
  }
  try {
    const CMPIStatus answer = function(args...);
    status.rc = answer.rc;
    if (answer.rc != CMPI_RC_OK) status.message = textOf(answer.msg);
  } catch (const abi::__forced_unwind&) {
    throw;
  } catch (const std::exception& problem) {
    status = failure(CMPI_RC_ERR_FAILED, what + " threw an exception: " + problem.what());
    core_.log(LogLevel::Error, status.message);
  } catch (...) {
    status = failure(CMPI_RC_ERR_FAILED, what + " threw an exception that tells nothing of itself");
    core_.log(LogLevel::Error, status.message);
  }
  const std::lock_guard lock(result.mutex);
  if (result.errorCode != CMPI_RC_OK) {
    if (status.ok()) status.rc = result.errorCode;
    if (status.message.empty()) status.message = result.errorMessage;
  } else if (result.full) {
    return {};  // the provider may have reported a failure only because no more results were needed
  }
  if (!status.ok() && status.message.empty()) {
    status.message = status.rc == CMPI_RC_ERR_NOT_SUPPORTED ? what + " is not supported by the provider"
                                                            : what + " failed: " + std::string(statusName(status.rc));
  }
  return status;
}

Status Request::enumerateOne(const PathObject& path, const ClassInfo& info, Form form, const Shape& shape,
                             ResultFilter& filter, bool& unavailable) {
  const ProviderEntry& entry = *entryOf(path, info, InstanceMi);
  Status status;
  const CMPIInstanceMI* mi = core_.loader().instanceMi(entry, status);
  unavailable = mi == nullptr;
  if (unavailable) return status;
  filter.servedAs = &info;
  PathObject* asked = PathObject::make(arena(), path.nameSpace->view(), "");
  asked->setClass(info);
  auto* provider = const_cast<CMPIInstanceMI*>(mi);
  if (form == Form::Paths) {
    ResultObject result(core_, ResultObject::Paths, &filter, entry.prefix);
    return call(result, entry, "EnumerateInstanceNames", mi->ft->enumerateInstanceNames, provider, &context_, &result,
                asked);
  }
  ResultObject result(core_, ResultObject::Instances, &filter, entry.prefix);
  const char** list = providerList(shape, {&info});
  return call(result, entry, "EnumerateInstances", mi->ft->enumerateInstances, provider, &context_, &result, asked,
              list);
}

Status Request::enumerate(const PathObject& path, Form form, const Shape& shape, Taker& taker) {
  const Expected<PathObject*, Status> found = resolve(path);
  if (!found) return found.error();
  PathObject* resolved = *found;
  const ClassInfo& info = *resolved->info;
  const std::vector<const ClassInfo*> served = servedBelow(*resolved, info);
  if (served.empty()) {
    return failure(CMPI_RC_ERR_NOT_SUPPORTED, "no provider serves " + info.name() + " or a class below it");
  }
  ResultFilter filter(core_, scope_, shape, &info, resolved->nameSpace->view(), taker);
  Outcome outcome;
  for (const ClassInfo* one : served) {
    const MarkGuard guard(scope_);
    bool unavailable = false;
    Status status = enumerateOne(*resolved, *one, form, shape, filter, unavailable);
    const bool passedOver = one != &info && (unavailable || status.rc == CMPI_RC_ERR_NOT_SUPPORTED);
    if (passedOver && unavailable) core_.log(LogLevel::Warning, one->name() + " is left out: " + status.message);
    outcome.add(std::move(status), passedOver);
    if (filter.full()) break;
  }
  return std::move(outcome).status();
}

namespace {

/// Passes only the first instance on.
class FirstTaker : public Taker {
 public:
  explicit FirstTaker(Taker& taker) : taker_(taker) {}
  bool takeInstance(const InstanceObject& instance, const PropertyMask& wanted) override {
    found_ = true;
    taker_.takeInstance(instance, wanted);
    return false;
  }
  bool takePath(const PathObject& path) override {
    found_ = true;
    taker_.takePath(path);
    return false;
  }
  bool found() const noexcept { return found_; }

 private:
  Taker& taker_;
  bool found_ = false;
};

}  // namespace

Expected<Request::Target, Status> Request::findInstanceMi(const PathObject& resolved, std::string_view operation) {
  const ProviderEntry* entry = entryOf(resolved, *resolved.info, InstanceMi);
  if (entry == nullptr) {
    return unexpected(failure(CMPI_RC_ERR_NOT_SUPPORTED, "no provider serves " + resolved.info->name() + ", so " +
                                                             std::string(operation) + " cannot be done"));
  }
  Status status;
  const CMPIInstanceMI* mi = core_.loader().instanceMi(*entry, status);
  if (!status.ok()) return unexpected(std::move(status));
  return Target{entry, const_cast<CMPIInstanceMI*>(mi)};
}

Status Request::get(const PathObject& path, const Shape& shape, Taker& taker) {
  const Expected<PathObject*, Status> found = resolve(path);
  if (!found) return found.error();
  PathObject* resolved = *found;
  const Expected<Target, Status> target = findInstanceMi(*resolved, "GetInstance");
  if (!target && target.error().rc == CMPI_RC_ERR_NOT_SUPPORTED && !servedBelow(*resolved, *resolved->info).empty()) {
    // The class in an instance's name is the class that it was made of, never a superclass.
    return failure(CMPI_RC_ERR_NOT_FOUND, "no instance has " + resolved->info->name() + " itself as its class");
  }
  if (!target) return target.error();
  const auto [entry, mi] = *target;
  FirstTaker first(taker);
  ResultFilter filter(core_, scope_, shape, resolved->info, resolved->nameSpace->view(), first);
  filter.within = resolved->info;
  ResultObject result(core_, ResultObject::Instances, &filter, entry->prefix);
  const char** list = providerList(shape, {resolved->info});
  Status status = call(result, *entry, "GetInstance", mi->ft->getInstance, mi, &context_, &result, resolved, list);
  if (status.ok() && !first.found()) {
    ObjectPath named;
    fillPath(*resolved, named);
    return failure(CMPI_RC_ERR_NOT_FOUND, "there is no instance " + pathText(named).substr(0, 500));
  }
  return status;
}

Status Request::create(const PathObject& path, const InstanceObject& instance, Taker& taker) {
  const Expected<PathObject*, Status> found = resolve(path);
  if (!found) return found.error();
  PathObject* resolved = *found;
  const Expected<Target, Status> target = findInstanceMi(*resolved, "CreateInstance");
  if (!target) return target.error();
  const auto [entry, mi] = *target;
  InstanceObject* given = copyInstance(arena(), instance);
  given->nameSpace = resolved->nameSpace;
  FirstTaker first(taker);
  const Shape all;
  ResultFilter filter(core_, scope_, all, nullptr, resolved->nameSpace->view(), first);
  ResultObject result(core_, ResultObject::Paths, &filter, entry->prefix);
  Status status =
      call(result, *entry, "CreateInstance", mi->ft->createInstance, mi, &context_, &result, resolved, given);
  // If a provider returns no name, it made the given instance under the given name.
  if (status.ok() && !first.found()) taker.takePath(*given->path(arena()));
  return status;
}

namespace {

/// Keeps the instance.
class CurrentTaker : public Taker {
 public:
  explicit CurrentTaker(Arena& arena) : arena_(arena) {}
  bool takeInstance(const InstanceObject& instance, const PropertyMask& /*wanted*/) override {
    current_ = copyInstance(arena_, instance);
    return true;
  }
  bool takePath(const PathObject& /*path*/) override { return true; }
  const InstanceObject* current() const noexcept { return current_; }

 private:
  Arena& arena_;
  const InstanceObject* current_ = nullptr;
};

void listChanges(const Modification& modification, const InstanceObject* current, ModificationEffect& effect) {
  for (const PropertyInfo* property : modification.changed) {
    Property& change = effect.changes.emplace_back();
    change.name = property->declared->name;
    change.declaration = property->declared;
    fillValue(modification.handed->find(*property)->data, change.value);
    const InstanceObject::Slot* slot = current != nullptr ? current->find(*property) : nullptr;
    Value& before = effect.before.emplace_back(Value::null(change.value.type, change.value.isArray));
    if (slot != nullptr) fillValue(slot->data, before);
  }
}

}  // namespace

Status Request::modify(const PathObject& path, const InstanceObject& instance, const Shape& shape,
                       ModificationEffect* effect) {
  const Expected<PathObject*, Status> found = resolve(path);
  if (!found) return found.error();
  PathObject* resolved = *found;
  const Expected<Target, Status> target = findInstanceMi(*resolved, "ModifyInstance");
  if (!target) return target.error();
  const auto [entry, mi] = *target;
  CurrentTaker taker(arena());
  Status status = get(*resolved, Shape(), taker);
  // If the provider cannot be read, it gets the instance as the client gave it.
  if (!status.ok() && status.rc != CMPI_RC_ERR_NOT_SUPPORTED) return status;
  Modification modification;
  status = planModification(arena(), {*resolved, instance, taker.current(), shape, *entry}, modification);
  if (!status.ok() || modification.changed.empty()) return status;
  if (effect != nullptr) listChanges(modification, taker.current(), *effect);
  const char** list = providerList(shape, {resolved->info});
  ResultObject result(core_, ResultObject::Nothing, nullptr, entry->prefix);
  return call(result, *entry, "ModifyInstance", mi->ft->modifyInstance, mi, &context_, &result, resolved,
              modification.handed, list);
}

Status Request::remove(const PathObject& path) {
  const Expected<PathObject*, Status> found = resolve(path);
  if (!found) return found.error();
  PathObject* resolved = *found;
  const Expected<Target, Status> target = findInstanceMi(*resolved, "DeleteInstance");
  if (!target) return target.error();
  const auto [entry, mi] = *target;
  ResultObject result(core_, ResultObject::Nothing, nullptr, entry->prefix);
  return call(result, *entry, "DeleteInstance", mi->ft->deleteInstance, mi, &context_, &result, resolved);
}

namespace {

/// Where an association can hold the source and what the filter asks for.
struct Ends {
  const schema::ClassProperty* nearEnd = nullptr;
  const schema::ClassProperty* farEnd = nullptr;
};

bool canBeOf(const schema::ClassProperty& end, const schema::Class& wanted) {
  return end.reference != nullptr && (end.reference->isA(wanted) || wanted.isA(*end.reference));
}

bool named(const schema::ClassProperty& end, std::string_view role) {
  return role.empty() || util::sameName(end.name, role);
}

/// The first pair of ends that fits; without a far end if the filter does not restrict it.
Ends fittingEnds(const schema::Class& association, const schema::Class& source, const FarEnd& filter,
                 bool farEndMatters, const schema::Class* resultClass) {
  for (const schema::ClassProperty* nearEnd : association.references()) {
    if (nearEnd->reference == nullptr || !source.isA(*nearEnd->reference) || !named(*nearEnd, filter.role)) continue;
    if (!farEndMatters) return {nearEnd, nullptr};
    for (const schema::ClassProperty* farEnd : association.references()) {
      if (farEnd == nearEnd || !named(*farEnd, filter.resultRole)) continue;
      if (resultClass == nullptr || canBeOf(*farEnd, *resultClass)) return {nearEnd, farEnd};
    }
  }
  return {};
}

}  // namespace

Status Request::findAssociations(const PathObject& path, const FarEnd& filter, bool farEndMatters,
                                 std::vector<Association>& found, const ClassInfo*& resultClass) const {
  const auto known = [this](std::string_view name, std::string_view what, const ClassInfo*& info) -> Status {
    if (name.empty()) return {};
    info = core_.classes().find(name);
    if (info != nullptr) return {};
    return failure(CMPI_RC_ERR_INVALID_PARAMETER, std::string(what) + ": there is no class " + quoted(name));
  };
  const ClassInfo* ancestor = nullptr;
  Status status = known(filter.associationClass, farEndMatters ? "AssocClass" : "ResultClass", ancestor);
  if (status.ok() && farEndMatters) status = known(filter.resultClass, "ResultClass", resultClass);
  if (!status.ok()) return status;
  const schema::Class& source = path.info->declared();
  for (const schema::Class* candidate :
       core_.classes().repository().associationsOf(source, ancestor != nullptr ? &ancestor->declared() : nullptr)) {
    const ClassInfo& info = core_.classes().of(*candidate);
    const ProviderEntry* entry = entryOf(path, info, AssociationMi);
    if (entry == nullptr) continue;
    const Ends ends = fittingEnds(*candidate, source, filter, farEndMatters,
                                  resultClass != nullptr ? &resultClass->declared() : nullptr);
    if (ends.nearEnd == nullptr) continue;
    const bool farNamed = ends.farEnd != nullptr && !filter.resultRole.empty();
    found.push_back({&info, entry, ends.farEnd != nullptr ? &core_.classes().of(*ends.farEnd->reference) : nullptr,
                     filter.role.empty() ? nullptr : ends.nearEnd->name.c_str(),
                     farNamed ? ends.farEnd->name.c_str() : nullptr});
  }
  return {};
}

template <typename Ask>
Status Request::askEach(const std::vector<Association>& associations, const ResultFilter& results, Ask&& ask) {
  Outcome outcome;
  for (const Association& one : associations) {
    const MarkGuard guard(scope_);
    Status status;
    const CMPIAssociationMI* mi = core_.loader().associationMi(*one.entry, status);
    if (mi != nullptr) {
      status = ask(one, const_cast<CMPIAssociationMI*>(mi));
    } else if (associations.size() > 1) {
      core_.log(LogLevel::Warning, one.info->name() + " is left out: " + status.message);
    }
    const bool passedOver = mi == nullptr || status.rc == CMPI_RC_ERR_NOT_SUPPORTED;
    outcome.add(std::move(status), passedOver);
    if (results.full()) break;
  }
  return std::move(outcome).status();
}

Status Request::associated(const PathObject& path, Form form, const FarEnd& filter, const Shape& shape, Taker& taker) {
  const Expected<PathObject*, Status> found = resolve(path);
  if (!found) return found.error();
  PathObject* resolved = *found;
  std::vector<Association> associations;
  const ClassInfo* resultClass = nullptr;
  Status status = findAssociations(*resolved, filter, true, associations, resultClass);
  if (!status.ok()) return status;
  ResultFilter results(core_, scope_, shape, nullptr, resolved->nameSpace->view(), taker);
  results.within = resultClass;
  // The provider is asked without a result class: it may not know the superclasses of its own classes.
  return askEach(associations, results, [&](const Association& one, CMPIAssociationMI* mi) {
    const char* name = one.info->name().c_str();
    if (form == Form::Paths) {
      ResultObject result(core_, ResultObject::Paths, &results, one.entry->prefix);
      return call(result, *one.entry, "AssociatorNames", mi->ft->associatorNames, mi, &context_, &result, resolved,
                  name, nullptr, one.role, one.resultRole);
    }
    std::vector<const ClassInfo*> farClasses = servedBelow(*resolved, *one.farClass);
    farClasses.insert(farClasses.begin(), one.farClass);
    const char** list = providerList(shape, farClasses);
    ResultObject result(core_, ResultObject::Instances, &results, one.entry->prefix);
    return call(result, *one.entry, "Associators", mi->ft->associators, mi, &context_, &result, resolved, name, nullptr,
                one.role, one.resultRole, list);
  });
}

Status Request::referring(const PathObject& path, Form form, const FarEnd& filter, const Shape& shape, Taker& taker) {
  const Expected<PathObject*, Status> found = resolve(path);
  if (!found) return found.error();
  PathObject* resolved = *found;
  std::vector<Association> associations;
  const ClassInfo* unused = nullptr;
  Status status = findAssociations(*resolved, filter, false, associations, unused);
  if (!status.ok()) return status;
  ResultFilter results(core_, scope_, shape, nullptr, resolved->nameSpace->view(), taker);
  // Not the class that the provider is asked for: a provider may name its associations by the class of a sibling
  // association.
  if (!filter.associationClass.empty()) results.within = core_.classes().find(filter.associationClass);
  return askEach(associations, results, [&](const Association& one, CMPIAssociationMI* mi) {
    const char* name = one.info->name().c_str();
    if (form == Form::Paths) {
      ResultObject result(core_, ResultObject::Paths, &results, one.entry->prefix);
      return call(result, *one.entry, "ReferenceNames", mi->ft->referenceNames, mi, &context_, &result, resolved, name,
                  one.role);
    }
    const char** list = providerList(shape, {one.info});
    ResultObject result(core_, ResultObject::Instances, &results, one.entry->prefix);
    return call(result, *one.entry, "References", mi->ft->references, mi, &context_, &result, resolved, name, one.role,
                list);
  });
}

namespace {

class ValueReceiver : public Receiver {
 public:
  explicit ValueReceiver(CMPIData& value) : value_(value) {}
  bool takeData(const CMPIData& data) override {
    value_ = data;
    return true;
  }
  bool takePath(const PathObject& path) override {
    value_ = nullData(CMPI_ref, CMPI_goodValue);
    value_.value.ref = const_cast<PathObject*>(&path);
    return true;
  }

 private:
  CMPIData& value_;
};

/// The arguments of a call under the schema's names, checked against the schema's types.
Status checkedArguments(const schema::ClassMethod& method, const EntryList& input, ArgsObject& arguments) {
  for (const EntryList::Entry& entry : input) {
    const auto parameter = std::find_if(
        method.parameters.begin(), method.parameters.end(),
        [&entry](const schema::Parameter& candidate) { return util::sameName(candidate.name, entry.name->view()); });
    if (parameter == method.parameters.end()) {
      return failure(CMPI_RC_ERR_INVALID_PARAMETER, method.name + " has no parameter " + quoted(entry.name->view()));
    }
    const DeclaredType declared = declaredType(*parameter);
    const CMPIType type = cmpiType(declared.type, declared.isArray);
    CMPIData data = copyData(*arguments.arena, entry.data);
    if (data.state != CMPI_goodValue) data.type = type;
    if (!typeFits(type, declared.takesInstance, data.type)) {
      return failure(CMPI_RC_ERR_TYPE_MISMATCH,
                     method.name + ": the parameter " + parameter->name + " is declared with another type");
    }
    arguments.list.set(*arguments.arena, intern(*arguments.arena, parameter->name), data);
  }
  return {};
}

}  // namespace

Status Request::invoke(const PathObject& path, std::string_view method, const EntryList& input, CMPIData& value,
                       EntryList& output) {
  const Expected<PathObject*, Status> found = resolve(path);
  if (!found) return found.error();
  PathObject* resolved = *found;
  const schema::ClassMethod* declared = resolved->info->declared().findMethod(method);
  if (declared == nullptr) {
    return failure(CMPI_RC_ERR_METHOD_NOT_FOUND, resolved->info->name() + " has no method " + quoted(method));
  }
  const ProviderEntry* entry = entryOf(*resolved, *resolved->info, MethodMi);
  if (entry == nullptr) {
    return failure(CMPI_RC_ERR_METHOD_NOT_AVAILABLE, "no provider runs the methods of " + resolved->info->name());
  }
  auto* in = arena().make<ArgsObject>(arena());
  auto* out = arena().make<ArgsObject>(arena());
  Status status = checkedArguments(*declared, input, *in);
  const CMPIMethodMI* mi = status.ok() ? core_.loader().methodMi(*entry, status) : nullptr;
  if (mi == nullptr) return status;
  value = nullData(cmpiType(declared->returnType, false));
  ValueReceiver receiver(value);
  ResultObject result(core_, ResultObject::Values | ResultObject::Paths, &receiver, entry->prefix);
  status = call(result, *entry, declared->name, mi->ft->invokeMethod, const_cast<CMPIMethodMI*>(mi), &context_, &result,
                resolved, declared->name.c_str(), in, out);
  output = out->list;
  return status;
}

}  // namespace zorva::broker
