#pragma once

// An object of the host for the companion providers: a class name and properties in order, the keys first.

#include <cstdint>
#include <string>
#include <variant>
#include <vector>

namespace zorva::host {

using PropertyValue = std::variant<std::string, std::uint8_t, std::uint16_t, std::uint64_t, bool,
                                   std::vector<std::string>, std::vector<std::uint16_t>>;

struct HostProperty {
  const char* name;
  PropertyValue value;
};

struct HostObject {
  const char* className;
  std::vector<HostProperty> keys;        ///< all of them texts
  std::vector<HostProperty> properties;  ///< without the keys
};

}  // namespace zorva::host
