#pragma once

#include <string_view>

namespace zorva::schema {

/// The declarations of profile.mof, and those that interop.mof has beyond them, compiled by the build
/// (CompiledClasses.h).
extern const std::string_view kProfileClasses;
extern const std::string_view kInteropClasses;

}  // namespace zorva::schema
