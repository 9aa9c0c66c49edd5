#pragma once

// The instances of the interop namespaces, as plain values.

#include <string>
#include <string_view>
#include <vector>

#include "broker/objects/Value.h"

namespace zorva::cimom {

inline constexpr const char* kProfileClass = "CIM_RegisteredProfile";
inline constexpr const char* kConformanceClass = "CIM_ElementConformsToProfile";

/// The facts from which the instances are made.
struct InteropWorld {
  std::string nameSpace;                ///< the namespace of the request
  std::string profileNameSpace;         ///< the namespace in which the profile is registered
  std::vector<std::string> nameSpaces;  ///< all namespaces of the server
  std::string hostName;
  std::vector<broker::ObjectPath> systems;    ///< the computer systems
  std::vector<broker::ObjectPath> endpoints;  ///< the DNS endpoints
};

/// All instances of one class, with their paths.
std::vector<broker::Instance> interopInstances(const InteropWorld& world, std::string_view className);

/// True for two names of one instance: hosts and namespaces are not compared, nor in references among the keys.
bool sameInstance(const broker::ObjectPath& a, const broker::ObjectPath& b);

}  // namespace zorva::cimom
