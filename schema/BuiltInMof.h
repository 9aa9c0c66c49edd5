#pragma once

#include <cstddef>
#include <string_view>

namespace zorva::schema {

/// A MOF file of this folder, as the build put it into the program.
struct BuiltInMof {
  std::string_view name;  ///< "zorva.mof"
  std::string_view text;
};

extern const BuiltInMof kBuiltInMof[];
extern const std::size_t kBuiltInMofCount;

}  // namespace zorva::schema
