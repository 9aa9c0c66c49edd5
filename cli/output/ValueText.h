#pragma once

// Values for people.

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "broker/objects/Value.h"

namespace zorva::cli {

/// One value: text unchanged, numbers in decimal, a reference as its path, nothing for null. Not made printable.
std::string scalarText(const broker::Scalar& scalar);

/// A value; the elements of an array with ", " between them. If the property's ValueMap and Values qualifiers (DSP0004
/// 5.6.3) have a word for a number, the word follows it: "2 (Enabled)". Null is "NULL". `declaration` may be null.
std::string valueText(const broker::Value& value, const schema::ClassProperty* declaration);

/// The word that the property's qualifiers have for a number.
std::optional<std::string> valueWord(const schema::ClassProperty& declaration, std::int64_t number);

/// The same for a value of the property; nothing if it is no number.
std::optional<std::string> scalarWord(const broker::Scalar& scalar, const schema::ClassProperty& declaration);

/// A path as a person would type it: without the host, and without the default namespace.
std::string shortPathText(const broker::ObjectPath& path);

/// If null, the empty text.
std::string propertyText(const broker::Instance& instance, std::string_view property);

/// The elements of an array as texts, a scalar as one; none if the property is null or missing.
std::vector<std::string> propertyTexts(const broker::Instance& instance, std::string_view property);

}  // namespace zorva::cli
