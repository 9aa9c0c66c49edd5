#pragma once

// A text to be stored must not have control characters other than tab (U+0000 to U+001F, U+007F to U+009F): with a line
// feed in a value, a client could write its own lines into an interface file. Nested values are checked too: elements
// of arrays, keys of references, embedded instances.

#include <optional>
#include <string>
#include <vector>

#include "broker/objects/Value.h"

namespace zorva::broker {

/// Checks a modification. `propertyList` names the properties to change (absent: all); the others are not checked.
/// CIM_ERR_INVALID_PARAMETER names the first property whose text is refused.
Status refuseControlCharacters(const Instance& instance, const std::optional<std::vector<std::string>>& propertyList);

/// Checks the arguments of a method; as above, with the parameter's name.
Status refuseControlCharacters(const std::vector<NamedValue>& arguments);

}  // namespace zorva::broker
