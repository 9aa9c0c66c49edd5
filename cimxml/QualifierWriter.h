#pragma once

// Qualifiers, and the values that a schema has, as elements of CIM-XML (DSP0201 2.4, DTD DSP0203 2.4.0). As XmlText.h:
// each function appends, keeps no state, and may be called on any thread.

#include <string>
#include <string_view>

#include "schema/ClassRepository.h"

namespace zorva::cimxml {

/// An attribute that is "true" or "false"; none if the value is the DTD's default `unlessSaid`.
void appendFlag(std::string& out, std::string_view name, bool value, bool unlessSaid);

/// VALUE or VALUE.ARRAY; nothing for null. Nothing for a reference's default value: the DTD has no place for a path
/// that is a text.
void appendSchemaValue(std::string& out, const schema::Value& value, schema::Type type);

/// A QUALIFIER for each. `inherited`: all are marked as propagated, independent of their own marks.
void appendQualifiers(std::string& out, const schema::Qualifiers& qualifiers, bool inherited,
                      const schema::ClassRepository& classes);

/// QUALIFIER.DECLARATION.
void appendQualifierType(std::string& out, const schema::QualifierType& type);

}  // namespace zorva::cimxml
