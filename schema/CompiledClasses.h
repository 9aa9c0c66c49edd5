#pragma once

// Declarations in a compact form. A program reads it in a third of the time that their MOF takes, so the build compiles
// the built-in classes to it.

#include <string>
#include <string_view>

#include "schema/Declarations.h"

namespace zorva::schema {

/// The compact form, without places. It is only meant for the same build.
std::string compileDeclarations(Declarations declarations);

/// The declarations of a compact form. Throws std::logic_error if it breaks off.
Declarations readCompiledDeclarations(std::string_view compiled);

}  // namespace zorva::schema
