#include "cimom/Operations.h"

#include <cmpidt.h>

#include <algorithm>

#include "broker/objects/PathText.h"
#include "cimom/OperationsArguments.h"
#include "cimxml/ElementWriter.h"
#include "util/Utf8.h"

namespace zorva::cimom {

namespace {

using broker::Status;

/// Operations of DSP0200 that this server does not offer.
constexpr std::pair<std::string_view, const char*> kNotOffered[] = {
    {"CreateClass", "the classes are built in and cannot be changed"},
    {"ModifyClass", "the classes are built in and cannot be changed"},
    {"DeleteClass", "the classes are built in and cannot be changed"},
    {"SetQualifier", "the qualifier types are built in and cannot be changed"},
    {"DeleteQualifier", "the qualifier types are built in and cannot be changed"},
    {"ExecQuery", "queries are not offered; enumerate the class and choose among its instances"},
    {"OpenQueryInstances", "queries are not offered; use OpenEnumerateInstances"},
    {"PullInstances", "queries are not offered, and so are their results; use PullInstancesWithPath"},
};

Status notOffered(const std::string& name) {
  for (const auto& [known, why] : kNotOffered) {
    if (util::sameName(known, name)) return {CMPI_RC_ERR_NOT_SUPPORTED, std::string(known) + ": " + why};
  }
  return {CMPI_RC_ERR_NOT_SUPPORTED, "there is no operation " + broker::quotedText(name.substr(0, 80))};
}

OperationFunction findOperation(std::string_view name) noexcept {
  for (const auto find : {findInstanceOperation, findAssociationOperation, findClassOperation, findPullOperation}) {
    if (const OperationFunction found = find(name)) return found;
  }
  return nullptr;
}

/// The name of a parameter that is given twice, in any case; empty if there is none.
template <typename Parameters>
std::string_view twice(const Parameters& parameters) {
  std::vector<std::string_view> names;
  for (const auto& one : parameters) names.push_back(one.name);
  std::stable_sort(names.begin(), names.end(), util::NameLess());
  const auto found = std::adjacent_find(names.begin(), names.end(), util::NameEqual());
  return found != names.end() ? *found : std::string_view();
}

Status checkParameterNames(const cimxml::Call& call) {
  const std::string_view name = call.isExtrinsic ? twice(call.input) : twice(call.parameters);
  if (name.empty()) return {};
  return {CMPI_RC_ERR_INVALID_PARAMETER,
          call.name + ": the parameter " + broker::quotedText(name.substr(0, 80)) + " is there twice"};
}

/// The one method that is known to read only. What the others change is not known here.
bool onlyReads(const Operation& operation, const broker::ObjectPath& path) {
  const schema::Class* declared = operation.classes().find(path.className);
  const schema::ClassMethod* method = declared != nullptr ? declared->findMethod(operation.call.name) : nullptr;
  return method != nullptr && method->name == "GetCentralInstances";
}

bool changesSomething(const Operation& operation) {
  constexpr std::string_view kChanges[] = {"ModifyInstance", "SetProperty", "CreateInstance", "DeleteInstance"};
  const cimxml::Call& call = operation.call;
  if (call.isExtrinsic) return !onlyReads(operation, call.target);
  return std::any_of(std::begin(kChanges), std::end(kChanges),
                     [&](auto each) { return util::sameName(each, call.name); });
}

/// The object that a refused operation names, as far as it can be read.
broker::ObjectPath objectOf(const cimxml::Call& call) {
  Arguments arguments(call);
  if (call.isExtrinsic) return call.target;
  if (util::sameName(call.name, "ModifyInstance")) return arguments.requiredInstance("ModifiedInstance").path;
  if (util::sameName(call.name, "CreateInstance")) return arguments.requiredInstance("NewInstance").path;
  return arguments.requiredPath("InstanceName");
}

Status checkRole(const Operation& operation) {
  if (operation.who == nullptr) return {};
  const access::Role has = operation.who->grants.in(operation.nameSpace);
  const bool changes = changesSomething(operation);
  if (has >= (changes ? access::Role::Operate : access::Role::Read)) return {};
  broker::ObjectPath object;
  if (changes) object = objectOf(operation.call);
  object.nameSpace = operation.nameSpace;
  noteObject(operation, object);
  const std::string who = operation.who->user.empty() ? "a client without a login" : operation.who->user;
  return {
      CMPI_RC_ERR_ACCESS_DENIED,
      who + (has == access::Role::None ? " may not use the namespace " : " may only read in ") + operation.nameSpace};
}

/// Replaces CMPI codes that CIM lacks.
Status asCim(Status status) {
  constexpr int kLastOfCim = 29;
  if (status.rc >= 0 && status.rc <= kLastOfCim) return status;
  const std::string name(broker::statusName(status.rc));
  return {CMPI_RC_ERR_FAILED, status.message.empty() ? name : status.message + " (" + name + ")"};
}

}  // namespace

Status carryOut(Operation& operation) {
  const cimxml::Call& call = operation.call;
  const OperationFunction function = call.isExtrinsic ? invokeMethod : findOperation(call.name);
  if (function == nullptr) return notOffered(call.name);
  operation.nameSpace = operation.broker.registry().nameSpace(call.target.nameSpace);
  if (operation.nameSpace.empty()) {
    return {CMPI_RC_ERR_INVALID_NAMESPACE,
            "there is no namespace " + broker::quotedText(call.target.nameSpace.substr(0, 200))};
  }
  Status status = checkRole(operation);
  if (status.ok()) status = checkParameterNames(call);
  return asCim(status.ok() ? function(operation) : std::move(status));
}

bool mayRead(const Operation& operation, const broker::ObjectPath& result) {
  if (operation.who == nullptr) return true;
  const std::string& in = result.nameSpace.empty() ? operation.nameSpace : result.nameSpace;
  return operation.who->grants.in(in) >= access::Role::Read;
}

void noteObject(const Operation& operation, const broker::ObjectPath& path) {
  operation.record.object = broker::pathText(path);
}

void canonicalizeValue(const Operation& operation, broker::Value& value) {
  const auto canonicalize = [&](broker::Scalar& scalar) {
    if (auto* reference = std::get_if<broker::Boxed<broker::ObjectPath>>(&scalar)) {
      broker::ObjectPath& path = **reference;
      if (operation.host.isThis(path.host, operation.hostHeader)) path.host.clear();
      for (broker::NamedValue& key : path.keys) canonicalizeValue(operation, key.value);
    }
  };
  canonicalize(value.scalar);
  for (broker::Scalar& element : value.elements) canonicalize(element);
}

namespace {

/// Providers use the computer system's name, which is configurable, as host of their results.
bool isNameOfASystem(const Operation& operation, std::string_view host) {
  bool found = false;
  const broker::PathSink look = [&](const broker::ObjectPath& path) {
    const broker::Value* name = path.key("Name");
    found = found || (name != nullptr && util::sameName(name->asText(), host));
    return !found;
  };
  operation.broker.enumerateInstanceNames({}, "CIM_ComputerSystem", look, operation.caller);
  return found;
}

/// Whether a name has all the given keys.
bool hasKeys(const broker::ObjectPath& name, const broker::ObjectPath& given) {
  return util::sameName(name.className, given.className) &&
         std::all_of(given.keys.begin(), given.keys.end(), [&name](const broker::NamedValue& key) {
           const broker::Value* value = name.key(key.name);
           return value != nullptr && *value == key.value;
         });
}

/// Clients may leave out keys whose values they do not know. If exactly one instance has the given keys, that one is
/// used; else the provider decides.
void completeKeys(const Operation& operation, broker::ObjectPath& path) {
  const schema::Class* declared = operation.classes().find(path.className);
  if (declared == nullptr || path.keys.empty() || path.keys.size() >= declared->keys().size()) return;
  const auto given = operation.broker.canonicalPath(path);
  if (!given) return;
  std::vector<broker::ObjectPath> found;
  const broker::PathSink look = [&](const broker::ObjectPath& name) {
    if (hasKeys(name, *given)) found.push_back(name);
    return found.size() < 2;
  };
  const Status status =
      operation.broker.enumerateInstanceNames(operation.nameSpace, path.className, look, operation.caller);
  if (status.ok() && found.size() == 1) path.keys = std::move(found.front().keys);
}

}  // namespace

Status canonicalizePath(const Operation& operation, broker::ObjectPath& path) {
  if (!path.host.empty() && !operation.host.isThis(path.host, operation.hostHeader) &&
      !isNameOfASystem(operation, path.host)) {
    return {CMPI_RC_ERR_INVALID_PARAMETER,
            "the path is of the host " + broker::quotedText(path.host.substr(0, 200)) + ", which is not this one"};
  }
  path.host.clear();
  path.nameSpace = operation.nameSpace;
  for (broker::NamedValue& key : path.keys) {
    canonicalizeValue(operation, key.value);
    if (!key.name.empty()) continue;
    const schema::Class* declared = operation.classes().find(path.className);
    if (declared == nullptr) continue;  // the broker reports it
    if (declared->keys().size() != 1) {
      return {CMPI_RC_ERR_INVALID_PARAMETER,
              declared->name() + " has " + std::to_string(declared->keys().size()) + " keys, so each needs its name"};
    }
    key.name = declared->keys().front()->name;
  }
  completeKeys(operation, path);
  return {};
}

namespace {

/// Values without a type get the declared type. A type that the client names must be the declared one.
Status checkSaidTypes(const Operation& operation) {
  const cimxml::Call& call = operation.call;
  const schema::Class* declared = operation.classes().find(call.target.className);
  const schema::ClassMethod* method = declared != nullptr ? declared->findMethod(call.name) : nullptr;
  if (method == nullptr) return {};  // the broker reports it
  for (std::size_t i = 0; i < call.input.size(); ++i) {
    for (const schema::Parameter& parameter : method->parameters) {
      if (!call.saidTypes[i] || *call.saidTypes[i] == parameter.type) continue;
      if (!util::sameName(parameter.name, call.input[i].name)) continue;
      return {CMPI_RC_ERR_INVALID_PARAMETER, method->name + ": the parameter " + parameter.name + " is a " +
                                                 std::string(schema::typeName(parameter.type)) + ", but comes as a " +
                                                 std::string(schema::typeName(*call.saidTypes[i]))};
    }
  }
  return {};
}

/// What a method changes is not known here, so each call is noted.
void noteCall(const Operation& operation, const broker::ObjectPath& path) {
  if (onlyReads(operation, path)) return;
  noteObject(operation, path);
  for (const broker::NamedValue& argument : operation.call.input) {
    operation.record.changes.push_back({argument.name, {}, broker::literalText(argument.value)});
  }
}

/// By custom, a method that returns another number than 0 did not do its work.
void noteReturned(const Operation& operation, const broker::Value& value) {
  if (value.isNull || value.scalar == broker::Scalar(std::uint64_t{0}) ||
      value.scalar == broker::Scalar(std::int64_t{0})) {
    return;
  }
  operation.record.result = "returned " + broker::literalText(value);
}

}  // namespace

Status invokeMethod(Operation& operation) {
  broker::ObjectPath path = operation.call.target;
  Status status = checkSaidTypes(operation);
  if (status.ok()) status = canonicalizePath(operation, path);
  if (!status.ok()) return status;
  noteCall(operation, path);
  std::vector<broker::NamedValue> input = operation.call.input;
  for (broker::NamedValue& argument : input) canonicalizeValue(operation, argument.value);
  const auto result = operation.broker.invokeMethod(path, operation.call.name, input, operation.caller);
  if (!result) return result.error();
  noteReturned(operation, result->returnValue);
  std::string& out = operation.writer.out();
  if (!result->returnValue.isNull) cimxml::appendReturnValue(out, result->returnValue);
  for (const broker::NamedValue& value : result->output) {
    cimxml::appendParameter(out, value);
    operation.writer.drainIfFull();
  }
  return {};
}

}  // namespace zorva::cimom
