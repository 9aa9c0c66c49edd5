#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "broker/objects/Value.h"

// Values as a person reads them.

namespace zorva::cli {

/// One value: text as it is, numbers in decimal, a reference as its path, nothing for null. Not made printable.
std::string scalarText(const broker::Scalar& scalar);

/// A value; the elements of an array with ", " between them. A number for which the property's ValueMap and Values
/// qualifiers (DSP0004 5.6.3) have a word is followed by that: "2 (Enabled)". Null is "NULL". `declaration` may be
/// null.
std::string valueText(const broker::Value& value, const schema::ClassProperty* declaration);

/// The word that the property's qualifiers have for a number.
std::optional<std::string> valueWord(const schema::ClassProperty& declaration, std::int64_t number);

/// A path as a person would type it: without the host, and without the namespace that is meant where none is given.
std::string shortPathText(const broker::ObjectPath& path);

/// Where null, the empty text.
std::string propertyText(const broker::Instance& instance, std::string_view property);

}  // namespace zorva::cli
