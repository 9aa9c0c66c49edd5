#pragma once

// The tree as a JSON document.

#include <memory>
#include <string>
#include <string_view>

#include "agent/tree/Json.h"
#include "agent/tree/TreeSnapshot.h"

namespace zorva::agent {

JsonValue treeToJsonValue(const TreeSnapshot& tree);

/// Throws ConfigError, under that name and with line and key, for every error in the document.
std::shared_ptr<const TreeSnapshot> treeFromJsonValue(const JsonValue& document, const std::string& name);

/// The name of a property in documents, such as "host_name"; null for a number that is no property.
const char* propertyName(PropertyNumber number);

/// The property of that name, 0 if there is none.
PropertyNumber propertyNumber(std::string_view name);

/// The value of a property, of the property's type. Throws ConfigError if it is of another; document and key are its
/// place in the error.
PropertyValue propertyFromJson(PropertyNumber number, const JsonValue& value, const std::string& document,
                               const std::string& key);
JsonValue propertyToJson(const PropertyValue& value);

}  // namespace zorva::agent
