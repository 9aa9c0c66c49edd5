#pragma once

// Object paths as a person types them: any spelling of names, and keys left out if the rest is unambiguous.

#include <string>
#include <string_view>
#include <vector>

#include "broker/objects/Value.h"
#include "cli/session/Session.h"

namespace zorva::cli {

/// Reads a path text. Throws Failure (wrong usage) that shows the text with a mark below the error; of a long text,
/// only the part around the error.
broker::ObjectPath readPath(std::string_view text);

/// Reads a class name, with or without a namespace before it. Throws Failure as readPath does, also if keys follow the
/// name.
broker::ObjectPath readClassName(std::string_view text);

/// The class that `text` names, with its namespace, in the schema's spelling. Throws Failure if the text is wrong,
/// names another host, or there is no such class.
broker::ObjectPath resolveClass(Session& session, std::string_view text);

/// The path of the instance that `text` identifies. Names are returned in the schema's spelling. Missing keys, also
/// those of a reference, are found among the names of all instances, and so is the class if only a superclass was
/// named. Throws Failure if the text is wrong, names another host or a class that does not exist, no instance has these
/// keys, or several have them (they are listed).
broker::ObjectPath resolvePath(Session& session, std::string_view text);

/// True if every key of `given` is in `found` with the same value. References are compared by the same rule, so their
/// keys may be missing too.
bool keysMatch(const broker::ObjectPath& given, const broker::ObjectPath& found);

}  // namespace zorva::cli
