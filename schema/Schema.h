#pragma once

#include <memory>
#include <string_view>

#include "schema/ClassRepository.h"

// The classes that are built into the program: the MOF files of this folder, as text in the binary, read when asked
// for.

namespace zorva::schema {

/// Which of the built-in classes.
enum class ClassSet {
  Profile,  ///< the sixteen ZORVA_ classes and the CIM_ classes above and beside them
  Interop,  ///< those of Profile, and what describes a server: namespaces, object manager, registered profiles
};

/// The built-in classes, read anew at each call; keep what it gives. The built-in text is known to be good (a test
/// reads it): a text that is not ends the call with std::logic_error. Safe on any thread.
std::shared_ptr<const ClassRepository> loadBuiltInClasses(ClassSet set = ClassSet::Profile);

/// Namespaces are compared without regard to case and to slashes at either end.
bool sameNamespace(std::string_view a, std::string_view b) noexcept;

}  // namespace zorva::schema
