#pragma once

#include <optional>
#include <string>
#include <vector>

#include "broker/objects/Value.h"

// Texts that clients want to store must not have control characters other than tab (U+0000 to U+001F, U+007F to
// U+009F): a line feed in a value would write lines of the client's own into an interface file. Whatever lies within a
// value is looked at: elements of arrays, keys of references, embedded instances.

namespace zorva::broker {

/// Of a modification: `propertyList` names what of the instance is to be changed (absent: all that it has); the rest is
/// not looked at. CIM_ERR_INVALID_PARAMETER names the first property whose text is refused.
Status refuseControlCharacters(const Instance& instance, const std::optional<std::vector<std::string>>& propertyList);

/// Of a method's arguments; as above, with the parameter's name.
Status refuseControlCharacters(const std::vector<NamedValue>& arguments);

}  // namespace zorva::broker
