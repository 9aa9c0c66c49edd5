#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "broker/objects/Value.h"
#include "cli/session/Session.h"

// Object paths as a person types them: any spelling of names, keys left out where the rest is clear.

namespace zorva::cli {

/// Reads a path text. Throws Failure (wrong usage) that shows the text with a mark under the place that is wrong; of a
/// long text, what stands around that place.
broker::ObjectPath readPath(std::string_view text);

/// Reads a class name, with a namespace before it or not. Throws Failure as readPath does, also where keys stand behind
/// the name.
broker::ObjectPath readClassName(std::string_view text);

/// The class that `text` means, with its namespace, in the schema's spelling. Throws Failure where the text is wrong,
/// names another host, or there is no such class.
broker::ObjectPath resolveClass(Session& session, std::string_view text);

/// The path of the one instance that `text` means. Names come out in the schema's spelling; keys that are left out,
/// also those of a reference, are found by asking for the names of all instances, and so is the class where only one
/// above it was named. Throws Failure where the text is wrong, names another host or a class that is not, no instance
/// has these keys, or several have them (they are listed).
broker::ObjectPath resolvePath(Session& session, std::string_view text);

/// True where every key that `given` has is in `found` with the same value. References are compared by the same rule,
/// so they too may leave keys out.
bool keysMatch(const broker::ObjectPath& given, const broker::ObjectPath& found);

}  // namespace zorva::cli
