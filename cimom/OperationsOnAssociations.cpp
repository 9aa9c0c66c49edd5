// DSP0200 5.3.2.14 Associators, .15 AssociatorNames, .16 References, .17 ReferenceNames; for instances by the broker,
// for classes from the schema.

#include <cmpidt.h>

#include <algorithm>

#include "cimom/Operations.h"
#include "cimom/OperationsArguments.h"
#include "cimom/OperationsSelection.h"
#include "cimxml/ClassWriter.h"
#include "cimxml/ElementWriter.h"
#include "util/Expected.h"

namespace zorva::cimom {

namespace {

using broker::Status;
using schema::Class;
using schema::ClassProperty;
using util::sameName;

/// The parameters of all four operations: which objects, and which part of them.
struct Question {
  bool ofReferences = false;
  bool namesOnly = false;
  bool isClass = false;
  broker::ObjectPath object;
  broker::AssociationFilter filter;
  broker::Selection selection;
};

Status takeQuestion(Operation& operation, Question& question) {
  Arguments arguments(operation.call);
  question.object = arguments.requiredObject("ObjectName", question.isClass);
  question.filter = takeFilter(arguments, question.ofReferences);
  if (!question.namesOnly) question.selection = takeSelection(arguments, false);
  Status status = arguments.status();
  return status.ok() ? canonicalizePath(operation, question.object) : status;
}

// Of classes.

bool fits(const ClassProperty& end, const std::string& role) { return role.empty() || sameName(end.name, role); }

/// Whether an object of either class may be one of the other.
bool related(const Class& a, const Class& b) { return a.isA(b) || b.isA(a); }

/// The classes to which an association leads from `source`, or the association itself.
void collect(const Class& association, const Class& source, const Question& question, const Class* resultClass,
             std::vector<const Class*>& found) {
  const auto add = [&found](const Class& one) {
    if (std::find(found.begin(), found.end(), &one) == found.end()) found.push_back(&one);
  };
  for (const ClassProperty* nearEnd : association.references()) {
    if (!source.isA(*nearEnd->reference) || !fits(*nearEnd, question.filter.role)) continue;
    if (question.ofReferences) add(association);
    if (question.ofReferences) continue;
    for (const ClassProperty* farEnd : association.references()) {
      if (farEnd == nearEnd || !fits(*farEnd, question.filter.resultRole)) continue;
      if (resultClass == nullptr || related(*farEnd->reference, *resultClass)) add(*farEnd->reference);
    }
  }
}

/// Null if no class is named.
Expected<const Class*, Status> findClass(const Operation& operation, const std::string& name, std::string_view what) {
  const Class* found = operation.classes().find(name);
  if (found != nullptr || name.empty()) return found;
  return unexpected(Status{CMPI_RC_ERR_INVALID_PARAMETER, std::string(what) + ": there is no class \"" + name + "\""});
}

Status answerOfClass(Operation& operation, const Question& question) {
  const auto source = findClass(operation, question.object.className, "ObjectName");
  if (!source) return source.error();
  if (*source == nullptr) return {CMPI_RC_ERR_INVALID_PARAMETER, "ObjectName: no class is named"};
  const auto association =
      findClass(operation, question.filter.associationClass, question.ofReferences ? "ResultClass" : "AssocClass");
  if (!association) return association.error();
  const auto resultClass = findClass(operation, question.filter.resultClass, "ResultClass");
  if (!resultClass) return resultClass.error();
  std::vector<const Class*> found;
  for (const Class* candidate : operation.classes().classes()) {
    if (!candidate->isAssociation() || (*association != nullptr && !candidate->isA(**association))) continue;
    collect(*candidate, **source, question, *resultClass, found);
  }
  const cimxml::ClassDetail detail{false, question.selection.includeQualifiers, question.selection.includeClassOrigin,
                                   question.selection.propertyList};
  operation.writer.beginReturnValue();
  for (const Class* one : found) {
    std::string& out = operation.writer.out();
    out += question.namesOnly ? "<OBJECTPATH>" : "<VALUE.OBJECTWITHPATH>";
    cimxml::appendClassPath(out, operation.host.name(), operation.nameSpace, one->name());
    if (!question.namesOnly) cimxml::appendClass(out, *one, detail, operation.classes());
    out += question.namesOnly ? "</OBJECTPATH>" : "</VALUE.OBJECTWITHPATH>";
    operation.writer.drainIfFull();
  }
  operation.writer.endReturnValue();
  return {};
}

// Of instances.

Status answerNames(Operation& operation, const Question& question) {
  Stream stream(operation.writer);
  const broker::PathSink write = [&](const broker::ObjectPath& path) {
    if (!mayRead(operation, path)) return true;
    return stream.put([&](std::string& out) {
      out += "<OBJECTPATH>";
      cimxml::appendWholePath(out, path, operation.host.name());
      out += "</OBJECTPATH>";
    });
  };
  operation.writer.beginReturnValue();
  Status status = question.ofReferences
                      ? operation.broker.referenceNames(question.object, question.filter, write, operation.caller)
                      : operation.broker.associatorNames(question.object, question.filter, write, operation.caller);
  stream.finish();
  operation.writer.endReturnValue();
  return status;
}

Status answerInstances(Operation& operation, const Question& question) {
  Stream stream(operation.writer);
  cimxml::InstanceWriter writer(detailOf(operation, question.selection));
  const broker::InstanceSink write = [&](const broker::Instance& instance) {
    if (!mayRead(operation, instance.path)) return true;
    return stream.put([&](std::string& out) {
      out += "<VALUE.OBJECTWITHPATH>";
      cimxml::appendWholePath(out, instance.path, operation.host.name());
      writer.append(out, instance);
      out += "</VALUE.OBJECTWITHPATH>";
    });
  };
  operation.writer.beginReturnValue();
  broker::Broker& broker = operation.broker;
  Status status =
      question.ofReferences
          ? broker.references(question.object, question.filter, question.selection, write, operation.caller)
          : broker.associators(question.object, question.filter, question.selection, write, operation.caller);
  stream.finish();
  operation.writer.endReturnValue();
  return status;
}

template <bool ofReferences, bool namesOnly>
Status answer(Operation& operation) {
  Question question;
  question.ofReferences = ofReferences;
  question.namesOnly = namesOnly;
  Status status = takeQuestion(operation, question);
  if (!status.ok()) return status;
  if (question.isClass) return answerOfClass(operation, question);
  return namesOnly ? answerNames(operation, question) : answerInstances(operation, question);
}

}  // namespace

OperationFunction findAssociationOperation(std::string_view name) noexcept {
  constexpr std::pair<std::string_view, OperationFunction> kOperations[] = {
      {"Associators", answer<false, false>},
      {"AssociatorNames", answer<false, true>},
      {"References", answer<true, false>},
      {"ReferenceNames", answer<true, true>},
  };
  for (const auto& [known, function] : kOperations) {
    if (sameName(known, name)) return function;
  }
  return nullptr;
}

}  // namespace zorva::cimom
