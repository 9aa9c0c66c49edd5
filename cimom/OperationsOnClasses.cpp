// DSP0200 5.3.2.1 GetClass, .9 EnumerateClasses, .10 EnumerateClassNames, .22 GetQualifier, .24 EnumerateQualifiers.
// All namespaces have the same classes.

#include <cmpidt.h>

#include "cimom/Operations.h"
#include "cimom/OperationsArguments.h"
#include "cimxml/ClassWriter.h"
#include "cimxml/QualifierWriter.h"

namespace zorva::cimom {

namespace {

using broker::Status;
using schema::Class;

cimxml::ClassDetail takeDetail(Arguments& arguments) {
  cimxml::ClassDetail detail;
  detail.localOnly = arguments.boolean("LocalOnly", true);
  detail.qualifiers = arguments.boolean("IncludeQualifiers", true);
  detail.classOrigin = arguments.boolean("IncludeClassOrigin", false);
  return detail;
}

Status getClass(Operation& operation) {
  Arguments arguments(operation.call);
  const std::string name = arguments.requiredClassName("ClassName");
  cimxml::ClassDetail detail = takeDetail(arguments);
  detail.propertyList = arguments.names("PropertyList");
  Status status = arguments.status();
  if (!status.ok()) return status;
  const Class* found = operation.classes().find(name);
  if (found == nullptr) return {CMPI_RC_ERR_NOT_FOUND, "there is no class \"" + name + "\" in " + operation.nameSpace};
  operation.writer.beginReturnValue();
  cimxml::appendClass(operation.writer.out(), *found, detail, operation.classes());
  operation.writer.endReturnValue();
  return {};
}

/// The subclasses of the named class, or the root classes if none is named.
Status findBelow(Operation& operation, Arguments& arguments, std::vector<const Class*>& found) {
  const std::string name = arguments.className("ClassName");
  const bool deep = arguments.boolean("DeepInheritance", false);
  Status status = arguments.status();
  if (!status.ok()) return status;
  const Class* ancestor = name.empty() ? nullptr : operation.classes().find(name);
  if (ancestor == nullptr && !name.empty()) {
    return {CMPI_RC_ERR_INVALID_CLASS, "there is no class \"" + name + "\" in " + operation.nameSpace};
  }
  found = operation.classes().subclasses(ancestor, deep);
  return {};
}

Status enumerateClasses(Operation& operation) {
  Arguments arguments(operation.call);
  const cimxml::ClassDetail detail = takeDetail(arguments);
  std::vector<const Class*> found;
  Status status = findBelow(operation, arguments, found);
  if (!status.ok()) return status;
  operation.writer.beginReturnValue();
  for (const Class* one : found) {
    cimxml::appendClass(operation.writer.out(), *one, detail, operation.classes());
    operation.writer.drainIfFull();
  }
  operation.writer.endReturnValue();
  return {};
}

Status enumerateClassNames(Operation& operation) {
  Arguments arguments(operation.call);
  std::vector<const Class*> found;
  Status status = findBelow(operation, arguments, found);
  if (!status.ok()) return status;
  operation.writer.beginReturnValue();
  for (const Class* one : found) cimxml::appendClassName(operation.writer.out(), one->name());
  operation.writer.endReturnValue();
  return {};
}

Status getQualifier(Operation& operation) {
  Arguments arguments(operation.call);
  const std::string name = arguments.requiredText("QualifierName");
  Status status = arguments.status();
  if (!status.ok()) return status;
  const schema::QualifierType* found = operation.classes().findQualifierType(name);
  if (found == nullptr) return {CMPI_RC_ERR_NOT_FOUND, "there is no qualifier type \"" + name + "\""};
  operation.writer.beginReturnValue();
  cimxml::appendQualifierType(operation.writer.out(), *found);
  operation.writer.endReturnValue();
  return {};
}

Status enumerateQualifiers(Operation& operation) {
  Arguments arguments(operation.call);
  Status status = arguments.status();
  if (!status.ok()) return status;
  operation.writer.beginReturnValue();
  for (const schema::QualifierType* type : operation.classes().qualifierTypes()) {
    cimxml::appendQualifierType(operation.writer.out(), *type);
    operation.writer.drainIfFull();
  }
  operation.writer.endReturnValue();
  return {};
}

}  // namespace

OperationFunction findClassOperation(std::string_view name) noexcept {
  constexpr std::pair<std::string_view, OperationFunction> kOperations[] = {
      {"GetClass", getClass},
      {"EnumerateClasses", enumerateClasses},
      {"EnumerateClassNames", enumerateClassNames},
      {"GetQualifier", getQualifier},
      {"EnumerateQualifiers", enumerateQualifiers},
  };
  for (const auto& [known, function] : kOperations) {
    if (util::sameName(known, name)) return function;
  }
  return nullptr;
}

}  // namespace zorva::cimom
