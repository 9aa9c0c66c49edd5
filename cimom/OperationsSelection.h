#pragma once

// The parameters that many operations share.

#include "broker/Broker.h"
#include "cimom/Operations.h"
#include "cimom/OperationsArguments.h"
#include "cimxml/ElementWriter.h"

namespace zorva::cimom {

/// IncludeQualifiers, IncludeClassOrigin, PropertyList and, if the operation has it, LocalOnly, which counts as false:
/// it is deprecated (DSP0200 5.3.2.2), and with its default clients would not see inherited properties.
inline broker::Selection takeSelection(Arguments& arguments, bool hasLocalOnly) {
  broker::Selection selection;
  if (hasLocalOnly) arguments.boolean("LocalOnly", false);
  selection.includeQualifiers = arguments.boolean("IncludeQualifiers", false);
  selection.includeClassOrigin = arguments.boolean("IncludeClassOrigin", false);
  selection.propertyList = arguments.names("PropertyList");
  return selection;
}

inline cimxml::InstanceDetail detailOf(const Operation& operation, const broker::Selection& selection) {
  return {selection.includeClassOrigin, selection.includeQualifiers ? &operation.classes() : nullptr};
}

/// The requested part of an association; `ofReferences`: without the far end.
inline broker::AssociationFilter takeFilter(Arguments& arguments, bool ofReferences) {
  broker::AssociationFilter filter;
  if (ofReferences) {
    filter.associationClass = arguments.className("ResultClass");
  } else {
    filter.associationClass = arguments.className("AssocClass");
    filter.resultClass = arguments.className("ResultClass");
    filter.resultRole = arguments.text("ResultRole").value_or("");
  }
  filter.role = arguments.text("Role").value_or("");
  return filter;
}

}  // namespace zorva::cimom
