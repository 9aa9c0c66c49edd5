#pragma once

#include <string>
#include <string_view>

#include "broker/Value.h"

// CIM values, names and instances as elements of CIM-XML (DSP0201 2.4, DTD DSP0203 2.4.0).
//
// Each function appends to `out` one element, without blanks or line feeds around it. Output is well-formed UTF-8 for
// any input: characters that XML 1.0 cannot hold, and bytes that are no UTF-8, come out as U+FFFD. The functions keep
// no state and throw only for want of memory; each may be called on any thread.

namespace zorva::cimxml {

/// `text` with the characters escaped that mean something to XML, in content and in attributes in double quotes.
void appendEscaped(std::string& out, std::string_view text);

/// VALUE, VALUE.ARRAY, VALUE.REFERENCE or VALUE.REFARRAY. Nothing at all for null.
void appendValue(std::string& out, const broker::Value& value);

/// INSTANCENAME with its KEYBINDINGs, whatever host and namespace the path has.
void appendInstanceName(std::string& out, const broker::ObjectPath& path);

/// LOCALNAMESPACEPATH: a NAMESPACE for each part between slashes.
void appendLocalNamespacePath(std::string& out, std::string_view nameSpace);

/// INSTANCEPATH where the path has host and namespace, LOCALINSTANCEPATH where it has a namespace alone, INSTANCENAME
/// where it has none.
void appendInstancePath(std::string& out, const broker::ObjectPath& path);

/// INSTANCE with a PROPERTY, PROPERTY.ARRAY or PROPERTY.REFERENCE for each of its properties, in their order. With
/// `classOrigin`, each has the attribute CLASSORIGIN where the property's declaration is known.
void appendInstance(std::string& out, const broker::Instance& instance, bool classOrigin = false);

}  // namespace zorva::cimxml
