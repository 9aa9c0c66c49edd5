#pragma once

#include <cstddef>
#include <string_view>

namespace zorva::schema {

/// A MOF file of this folder, embedded by the build.
struct BuiltInMof {
  std::string_view name;  ///< "zorva.mof"
  std::string_view text;
};

extern const BuiltInMof kBuiltInMof[];
extern const std::size_t kBuiltInMofCount;

}  // namespace zorva::schema
