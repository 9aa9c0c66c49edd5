// DSP0200 5.3.2.2 GetInstance, .4 DeleteInstance, .6 CreateInstance, .8 ModifyInstance, .11 EnumerateInstances,
// .12 EnumerateInstanceNames, .18 GetProperty, .19 SetProperty.

#include <cmpidt.h>

#include "broker/objects/PathText.h"
#include "cimom/Operations.h"
#include "cimom/OperationsArguments.h"
#include "cimom/OperationsSelection.h"
#include "cimxml/ElementWriter.h"
#include "frontend/HostApply.h"
#include "frontend/ReadBack.h"
#include "util/Expected.h"

namespace zorva::cimom {

namespace {

using broker::Instance;
using broker::ObjectPath;
using broker::Status;

Status getInstance(Operation& operation) {
  Arguments arguments(operation.call);
  ObjectPath path = arguments.requiredPath("InstanceName");
  const broker::Selection selection = takeSelection(arguments, true);
  Status status = arguments.status();
  if (status.ok()) status = canonicalizePath(operation, path);
  if (!status.ok()) return status;
  const auto instance = operation.broker.getInstance(path, selection, operation.caller);
  if (!instance) return instance.error();
  operation.writer.beginReturnValue();
  cimxml::appendInstance(operation.writer.out(), *instance, detailOf(operation, selection));
  operation.writer.endReturnValue();
  return {};
}

Status enumerateInstances(Operation& operation) {
  Arguments arguments(operation.call);
  const std::string className = arguments.requiredClassName("ClassName");
  broker::Selection selection = takeSelection(arguments, true);
  selection.deepInheritance = arguments.boolean("DeepInheritance", true);
  Status status = arguments.status();
  if (!status.ok()) return status;
  cimxml::ObjectWriters::Loan loan(operation.writers, className);
  cimxml::ObjectWriter withDetail(detailOf(operation, selection));
  cimxml::ObjectWriter& writer = selection.includeQualifiers || selection.includeClassOrigin ? withDetail : *loan;
  Stream stream(operation.writer);
  operation.writer.beginReturnValue();
  const auto write = [&](const broker::InstanceObject& object, const broker::PropertyMask& wanted) {
    return stream.put([&](std::string& out) { writer.append(out, object, wanted); });
  };
  status = operation.broker.enumerateObjects(operation.nameSpace, className, selection, write, operation.caller);
  stream.finish();
  operation.writer.endReturnValue();
  return status;
}

Status enumerateInstanceNames(Operation& operation) {
  Arguments arguments(operation.call);
  const std::string className = arguments.requiredClassName("ClassName");
  Status status = arguments.status();
  if (!status.ok()) return status;
  Stream stream(operation.writer);
  operation.writer.beginReturnValue();
  const auto write = [&](const ObjectPath& path) {
    return stream.put([&](std::string& out) { cimxml::appendInstanceName(out, path); });
  };
  status = operation.broker.enumerateInstanceNames(operation.nameSpace, className, write, operation.caller);
  stream.finish();
  operation.writer.endReturnValue();
  return status;
}

void canonicalizeProperties(const Operation& operation, Instance& instance) {
  for (broker::Property& property : instance.properties) canonicalizeValue(operation, property.value);
}

Status createInstance(Operation& operation) {
  Arguments arguments(operation.call);
  Instance instance = arguments.requiredInstance("NewInstance");
  Status status = arguments.status();
  if (!status.ok()) return status;
  instance.path.nameSpace = operation.nameSpace;
  canonicalizeProperties(operation, instance);
  noteObject(operation, instance.path);
  const auto created = operation.broker.createInstance(instance, operation.caller);
  if (!created) return created.error();
  noteObject(operation, *created);
  operation.writer.beginReturnValue();
  cimxml::appendInstanceName(operation.writer.out(), *created);
  operation.writer.endReturnValue();
  return {};
}

Status modifyAndNote(const Operation& operation, const Instance& instance,
                     const std::optional<std::vector<std::string>>& propertyList) {
  broker::ModificationEffect effect;
  Status status = frontend::modifyInstance(operation.broker, instance, propertyList, operation.caller, &effect);
  for (std::size_t i = 0; i < effect.changes.size(); ++i) {
    operation.record.changes.push_back(
        {effect.changes[i].name, broker::literalText(effect.before[i]), broker::literalText(effect.changes[i].value)});
  }
  if (!status.ok() || !effect.changes.empty()) noteObject(operation, instance.path);
  if (!status.ok()) return status;
  // Also where nothing changed: a client repeats a change that did not reach the host.
  return frontend::applyToHost(instance.path, frontend::SettingsLockIs::Free).status;
}

Status modifyInstance(Operation& operation) {
  Arguments arguments(operation.call);
  Instance instance = arguments.requiredInstance("ModifiedInstance");
  arguments.boolean("IncludeQualifiers", true);  // qualifiers of instances cannot be changed
  const std::optional<std::vector<std::string>> propertyList = arguments.names("PropertyList");
  Status status = arguments.status();
  if (status.ok()) status = canonicalizePath(operation, instance.path);
  if (!status.ok()) return status;
  canonicalizeProperties(operation, instance);
  return modifyAndNote(operation, instance, propertyList);
}

Status deleteInstance(Operation& operation) {
  Arguments arguments(operation.call);
  ObjectPath path = arguments.requiredPath("InstanceName");
  Status status = arguments.status();
  if (status.ok()) status = canonicalizePath(operation, path);
  noteObject(operation, path);
  return status.ok() ? operation.broker.deleteInstance(path, operation.caller) : status;
}

/// The property that an operation names.
Expected<const schema::ClassProperty*, Status> findProperty(const Operation& operation, const ObjectPath& path,
                                                            const std::string& name) {
  const schema::Class* declared = operation.classes().find(path.className);
  if (declared == nullptr) {
    return unexpected(Status{CMPI_RC_ERR_INVALID_CLASS, "there is no class \"" + path.className + "\""});
  }
  const schema::ClassProperty* property = declared->findProperty(name);
  if (property != nullptr) return property;
  return unexpected(Status{CMPI_RC_ERR_NO_SUCH_PROPERTY, declared->name() + " has no property \"" + name + "\""});
}

Status getProperty(Operation& operation) {
  Arguments arguments(operation.call);
  ObjectPath path = arguments.requiredPath("InstanceName");
  const std::string name = arguments.requiredText("PropertyName");
  Status status = arguments.status();
  if (status.ok()) status = canonicalizePath(operation, path);
  if (!status.ok()) return status;
  const auto found = findProperty(operation, path, name);
  if (!found) return found.error();
  const schema::ClassProperty* property = *found;
  broker::Selection selection;
  selection.propertyList = {property->name};
  const auto instance = operation.broker.getInstance(path, selection, operation.caller);
  if (!instance) return instance.error();
  const broker::Value* value = instance->property(property->name);
  if (value == nullptr || value->isNull) return {};  // null is no IRETURNVALUE at all
  operation.writer.beginReturnValue();
  cimxml::appendValue(operation.writer.out(), *value);
  operation.writer.endReturnValue();
  return {};
}

Status setProperty(Operation& operation) {
  Arguments arguments(operation.call);
  Instance instance;
  instance.path = arguments.requiredPath("InstanceName");
  const std::string name = arguments.requiredText("PropertyName");
  broker::Value value = arguments.value("NewValue");
  Status status = arguments.status();
  if (status.ok()) status = canonicalizePath(operation, instance.path);
  if (!status.ok()) return status;
  const auto found = findProperty(operation, instance.path, name);
  if (!found) return found.error();
  const schema::ClassProperty* property = *found;
  canonicalizeValue(operation, value);
  if (value.isNull) value = broker::Value::null(property->type, property->isArray);
  instance.properties.push_back({property->name, std::move(value), property});
  return modifyAndNote(operation, instance, std::vector<std::string>{property->name});
}

}  // namespace

OperationFunction findInstanceOperation(std::string_view name) noexcept {
  constexpr std::pair<std::string_view, OperationFunction> kOperations[] = {
      {"EnumerateInstances", enumerateInstances},
      {"GetInstance", getInstance},
      {"EnumerateInstanceNames", enumerateInstanceNames},
      {"ModifyInstance", modifyInstance},
      {"CreateInstance", createInstance},
      {"DeleteInstance", deleteInstance},
      {"GetProperty", getProperty},
      {"SetProperty", setProperty},
  };
  for (const auto& [known, function] : kOperations) {
    if (util::sameName(known, name)) return function;
  }
  return nullptr;
}

}  // namespace zorva::cimom
