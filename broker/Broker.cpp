#include "broker/Broker.h"

#include <algorithm>
#include <exception>
#include <utility>

#include "broker/core/BrokerCore.h"
#include "broker/objects/Convert.h"
#include "broker/objects/Data.h"
#include "broker/requests/ControlCharacters.h"
#include "broker/requests/Request.h"

namespace zorva::broker {

namespace {

/// Fills one plain value again and again and gives it to the client's sinks.
class SinkTaker : public Taker {
 public:
  SinkTaker(const InstanceSink* instances, const PathSink* paths) : instances_(instances), paths_(paths) {}

  bool takeInstance(const InstanceObject& object, const PropertyMask& wanted) override {
    fillInstance(object, wanted, instance_);
    return (*instances_)(instance_);
  }

  bool takePath(const PathObject& object) override {
    fillPath(object, instance_.path);
    return (*paths_)(instance_.path);
  }

 private:
  const InstanceSink* instances_;
  const PathSink* paths_;
  Instance instance_;
};

class ObjectTaker : public Taker {
 public:
  explicit ObjectTaker(const ObjectSink& sink) : sink_(sink) {}

  bool takeInstance(const InstanceObject& object, const PropertyMask& wanted) override { return sink_(object, wanted); }
  bool takePath(const PathObject& /*object*/) override { return true; }

 private:
  const ObjectSink& sink_;
};

/// Takes the only result.
class OneTaker : public Taker {
 public:
  OneTaker(Instance* instance, ObjectPath* path) : instance_(instance), path_(path) {}
  bool takeInstance(const InstanceObject& object, const PropertyMask& wanted) override {
    fillInstance(object, wanted, *instance_);
    return true;
  }
  bool takePath(const PathObject& object) override {
    fillPath(object, *path_);
    return true;
  }

 private:
  Instance* instance_;
  ObjectPath* path_;
};

CMPIFlags flagsOf(const Selection& selection) noexcept {
  return (selection.localOnly ? CMPI_FLAG_LocalOnly : 0U) |
         (selection.deepInheritance ? CMPI_FLAG_DeepInheritance : 0U) |
         (selection.includeQualifiers ? CMPI_FLAG_IncludeQualifiers : 0U) |
         (selection.includeClassOrigin ? CMPI_FLAG_IncludeClassOrigin : 0U);
}

void describe(ContextObject& context, const Caller& caller, CMPIFlags flags) {
  context.setFlags(flags);
  if (!caller.principal.empty()) context.setText(CMPIPrincipal, caller.principal);
  if (!caller.role.empty()) context.setText(CMPIRole, caller.role);
  if (!caller.acceptLanguage.empty()) context.setText(CMPIAcceptLanguage, caller.acceptLanguage);
  if (!caller.contentLanguage.empty()) context.setText(CMPIContentLanguage, caller.contentLanguage);
}

std::optional<std::vector<std::string_view>> viewsOf(const std::optional<std::vector<std::string>>& names) {
  if (!names) return std::nullopt;
  return std::vector<std::string_view>(names->begin(), names->end());
}

/// For associators and references: there, inheritance is always deep and properties are never local only.
Shape listOnly(const Selection& selection) {
  Shape shape;
  shape.properties = viewsOf(selection.propertyList);
  return shape;
}

Shape shapeOf(const Selection& selection) {
  Shape shape = listOnly(selection);
  shape.localOnly = selection.localOnly;
  shape.deepInheritance = selection.deepInheritance;
  return shape;
}

FarEnd farEndOf(const AssociationFilter& filter) noexcept {
  return {filter.associationClass, filter.resultClass, filter.role, filter.resultRole};
}

/// The path of an operation with a status of its own for a class that does not exist (DSP0200 5.3.2.14 to .17, 5.4.1).
Status makeSource(Arena& arena, const ObjectPath& path, int unknownClass, PathObject*& object) {
  Status status = makePath(arena, path, true, object);
  if (status.rc == CMPI_RC_ERR_INVALID_CLASS) status.rc = unknownClass;
  return status;
}

/// Opens a request and runs `operation(Request&)` in it. Throws only std::bad_alloc and what a sink throws.
template <typename Operation>
Status inRequest(BrokerCore& core, const Caller& caller, CMPIFlags flags, Operation&& operation) {
  try {
    Request request(core);
    describe(request.context(), caller, flags);
    return operation(request);
  } catch (const std::exception& problem) {
    return {CMPI_RC_ERR_FAILED, problem.what()};
  }
}

/// The result that `ask` fills, unless its status is a failure.
template <typename Result, typename Ask>
Expected<Result, Status> resultOf(Ask ask) {
  Result result;
  Status status = ask(result);
  if (!status.ok()) return unexpected(std::move(status));
  return result;
}

}  // namespace

Broker::Broker(std::shared_ptr<const schema::ClassRepository> classes, BrokerOptions options)
    : core_(std::make_unique<BrokerCore>(std::move(classes), std::move(options))) {}

Broker::~Broker() = default;

Status Broker::enumerateInstances(std::string_view nameSpace, std::string_view className, const Selection& selection,
                                  const InstanceSink& sink, const Caller& caller) {
  Instance instance;
  const auto take = [&](const InstanceObject& object, const PropertyMask& wanted) {
    fillInstance(object, wanted, instance);
    return sink(instance);
  };
  return enumerateObjects(nameSpace, className, selection, take, caller);
}

Status Broker::enumerateObjects(std::string_view nameSpace, std::string_view className, const Selection& selection,
                                const ObjectSink& sink, const Caller& caller) {
  return inRequest(*core_, caller, flagsOf(selection), [&](Request& request) {
    ObjectTaker taker(sink);
    return request.enumerate(*PathObject::make(request.arena(), nameSpace, className), Form::Instances,
                             shapeOf(selection), taker);
  });
}

Status Broker::enumerateInstanceNames(std::string_view nameSpace, std::string_view className, const PathSink& sink,
                                      const Caller& caller) {
  return inRequest(*core_, caller, 0, [&](Request& request) {
    SinkTaker taker(nullptr, &sink);
    return request.enumerate(*PathObject::make(request.arena(), nameSpace, className), Form::Paths, Shape(), taker);
  });
}

Expected<Instance, Status> Broker::getInstance(const ObjectPath& path, const Selection& selection,
                                               const Caller& caller) {
  return resultOf<Instance>([&](Instance& instance) {
    return inRequest(*core_, caller, flagsOf(selection), [&](Request& request) {
      PathObject* name = nullptr;
      Status status = makePath(request.arena(), path, true, name);
      if (!status.ok()) return status;
      OneTaker taker(&instance, nullptr);
      Shape shape = shapeOf(selection);
      shape.deepInheritance = true;
      return request.get(*name, shape, taker);
    });
  });
}

Expected<ObjectPath, Status> Broker::createInstance(const Instance& instance, const Caller& caller) {
  return resultOf<ObjectPath>([&](ObjectPath& created) {
    return inRequest(*core_, caller, 0, [&](Request& request) {
      PathObject* name = nullptr;
      InstanceObject* object = nullptr;
      Status status = makePath(request.arena(), instance.path, true, name);
      if (status.ok()) status = makeInstance(request.arena(), *name, instance, object);
      if (!status.ok()) return status;
      OneTaker taker(nullptr, &created);
      return request.create(*object->path(request.arena()), *object, taker);
    });
  });
}

Status Broker::modifyInstance(const Instance& instance, const std::optional<std::vector<std::string>>& propertyList,
                              const Caller& caller, ModificationEffect* effect) {
  return inRequest(*core_, caller, 0, [&](Request& request) {
    PathObject* name = nullptr;
    InstanceObject* object = nullptr;
    Status status = makePath(request.arena(), instance.path, true, name);
    if (status.ok()) status = refuseControlCharacters(instance, propertyList);
    if (status.ok()) status = makeInstance(request.arena(), *name, instance, object);
    std::unique_ptr<HeldClaim> claim;
    if (status.ok()) status = request.claim(Access::Change, instance.path.className, &instance.path, claim);
    if (!status.ok()) return status;
    Shape shape;
    shape.properties = viewsOf(propertyList);
    status = request.modify(*name, *object, shape, effect);
    if (status.ok() && effect != nullptr && !effect->changes.empty()) {
      OneTaker taker(&effect->now, nullptr);
      effect->reading = request.get(*name, Shape(), taker);
    }
    return claim == nullptr ? status : claim->finish(std::move(status));
  });
}

Status Broker::deleteInstance(const ObjectPath& path, const Caller& caller) {
  return inRequest(*core_, caller, 0, [&](Request& request) {
    PathObject* name = nullptr;
    const Status status = makePath(request.arena(), path, true, name);
    return status.ok() ? request.remove(*name) : status;
  });
}

namespace {

/// Opens a request and runs `ask(Request&, source)` in it with the object that `path` names.
template <typename Ask>
Status inRequestFrom(BrokerCore& core, const Caller& caller, CMPIFlags flags, const ObjectPath& path, Ask ask) {
  return inRequest(core, caller, flags, [&](Request& request) {
    PathObject* source = nullptr;
    Status status = makeSource(request.arena(), path, CMPI_RC_ERR_INVALID_PARAMETER, source);
    return status.ok() ? ask(request, *source) : status;
  });
}

}  // namespace

Status Broker::associators(const ObjectPath& path, const AssociationFilter& filter, const Selection& selection,
                           const InstanceSink& sink, const Caller& caller) {
  SinkTaker taker(&sink, nullptr);
  return inRequestFrom(*core_, caller, flagsOf(selection), path, [&](Request& request, const PathObject& source) {
    return request.associated(source, Form::Instances, farEndOf(filter), listOnly(selection), taker);
  });
}

Status Broker::associatorNames(const ObjectPath& path, const AssociationFilter& filter, const PathSink& sink,
                               const Caller& caller) {
  SinkTaker taker(nullptr, &sink);
  return inRequestFrom(*core_, caller, 0, path, [&](Request& request, const PathObject& source) {
    return request.associated(source, Form::Paths, farEndOf(filter), Shape(), taker);
  });
}

Status Broker::references(const ObjectPath& path, const AssociationFilter& filter, const Selection& selection,
                          const InstanceSink& sink, const Caller& caller) {
  SinkTaker taker(&sink, nullptr);
  return inRequestFrom(*core_, caller, flagsOf(selection), path, [&](Request& request, const PathObject& source) {
    return request.referring(source, Form::Instances, farEndOf(filter), listOnly(selection), taker);
  });
}

Status Broker::referenceNames(const ObjectPath& path, const AssociationFilter& filter, const PathSink& sink,
                              const Caller& caller) {
  SinkTaker taker(nullptr, &sink);
  return inRequestFrom(*core_, caller, 0, path, [&](Request& request, const PathObject& source) {
    return request.referring(source, Form::Paths, farEndOf(filter), Shape(), taker);
  });
}

namespace {

bool isInput(const schema::Parameter& parameter) {
  return schema::findQualifier(parameter.qualifiers, "In") == nullptr ||
         schema::hasQualifier(parameter.qualifiers, "In");
}

/// An instance method is not called on a class, and no required parameter may be missing (DSP0200 5.4.1).
Status checkCall(const ObjectPath& path, const PathObject& name, const schema::ClassMethod& method,
                 const std::vector<NamedValue>& input) {
  const std::string& className = name.info->name();
  if (path.keys.empty() && !name.info->keys().empty() && !schema::hasQualifier(method.qualifiers, "Static")) {
    return {CMPI_RC_ERR_INVALID_PARAMETER,
            method.name + " is a method of the instances of " + className + "; the class itself does not have it"};
  }
  for (const schema::Parameter& parameter : method.parameters) {
    if (!isInput(parameter) || !schema::hasQualifier(parameter.qualifiers, "Required")) continue;
    const bool isGiven = std::any_of(input.begin(), input.end(), [&parameter](const NamedValue& argument) {
      return util::sameName(argument.name, parameter.name) && !argument.value.isNull;
    });
    if (!isGiven) {
      return {CMPI_RC_ERR_INVALID_PARAMETER, method.name + ": the parameter " + parameter.name + " is missing"};
    }
  }
  return {};
}

/// The input of a method as data of the declared types.
Status makeArguments(Arena& arena, const schema::ClassMethod& method, const std::vector<NamedValue>& input,
                     EntryList& arguments) {
  for (const NamedValue& argument : input) {
    if (arguments.find(argument.name) != nullptr) {
      return {CMPI_RC_ERR_INVALID_PARAMETER, method.name + ": the parameter " + argument.name + " is there twice"};
    }
    for (const schema::Parameter& parameter : method.parameters) {
      if (!util::sameName(parameter.name, argument.name)) continue;
      CMPIData data;
      Status status =
          makeData(arena, declaredType(parameter), argument.value, method.name + "." + parameter.name, data);
      if (!status.ok()) return {CMPI_RC_ERR_INVALID_PARAMETER, std::move(status.message)};
      arguments.set(arena, intern(arena, parameter.name), data);
    }
    if (arguments.find(argument.name) == nullptr) {
      return {CMPI_RC_ERR_INVALID_PARAMETER, method.name + " has no parameter " + argument.name};
    }
  }
  return {};
}

}  // namespace

Expected<MethodResult, Status> Broker::invokeMethod(const ObjectPath& path, std::string_view method,
                                                    const std::vector<NamedValue>& input, const Caller& caller) {
  return resultOf<MethodResult>([&](MethodResult& result) {
    return inRequest(*core_, caller, 0, [&](Request& request) {
      PathObject* name = nullptr;
      Status status = makeSource(request.arena(), path, CMPI_RC_ERR_NOT_FOUND, name);
      if (status.ok()) status = refuseControlCharacters(input);
      if (!status.ok()) return status;
      EntryList arguments;
      // If the class has no such method, the request reports it.
      if (const schema::ClassMethod* declared = name->info->declared().findMethod(method)) {
        status = checkCall(path, *name, *declared, input);
        if (status.ok()) status = makeArguments(request.arena(), *declared, input, arguments);
        if (!status.ok()) return status;
      }
      EntryList output;
      CMPIData value = nullData(CMPI_null);
      status = request.invoke(*name, method, arguments, value, output);
      fillValue(value, result.returnValue);
      result.output.resize(output.size());
      for (std::uint32_t i = 0; i < output.size(); ++i) {
        result.output[i].name = output[i].name->view();
        fillValue(output[i].data, result.output[i].value);
      }
      return status;
    });
  });
}

std::vector<std::string> Broker::openLibraries() { return core_->loader().openAll(); }

const schema::ClassRepository& Broker::classes() const noexcept { return core_->classes().repository(); }

const ProviderRegistry& Broker::registry() const noexcept { return core_->registry(); }

Expected<ObjectPath, Status> Broker::canonicalPath(const ObjectPath& path) const {
  return resultOf<ObjectPath>([&](ObjectPath& canonical) {
    return inRequest(*core_, {}, 0, [&](Request& request) {
      PathObject* name = nullptr;
      Status status = makePath(request.arena(), path, true, name);
      if (!status.ok()) return status;
      const Expected<PathObject*, Status> resolved = request.resolve(*name);
      if (!resolved) return resolved.error();
      fillPath(**resolved, canonical);
      return status;
    });
  });
}

const CMPIBroker* Broker::handle() const noexcept { return core_->handle(); }

}  // namespace zorva::broker
