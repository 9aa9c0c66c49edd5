#pragma once

// The built-in classes: those of the MOF files of this folder, embedded in the binary in a compact form.

#include <memory>
#include <string_view>

#include "schema/ClassRepository.h"

namespace zorva::schema {

/// A set of the built-in classes.
enum class ClassSet {
  Profile,  ///< the sixteen ZORVA_ classes, and the CIM_ classes that they need
  Interop,  ///< those of Profile, and the classes that describe a server: namespaces, object manager, registered
            ///< profiles
};

/// The built-in classes, made again at each call, so keep the result. The caller may add others. The compiled form is
/// valid (a test compares it with the MOF files); if it were not, the call would throw std::logic_error. Safe on any
/// thread.
std::shared_ptr<ClassRepository> loadBuiltInClasses(ClassSet set = ClassSet::Profile);

/// Namespaces are compared without regard to case and to slashes at either end.
bool sameNamespace(std::string_view a, std::string_view b) noexcept;

}  // namespace zorva::schema
