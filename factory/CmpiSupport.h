#pragma once

// CMPI's objects for this library: the support that every provider has, and paths with this system as their host.

#include <cmpidt.h>

#include <string>
#include <vector>

#include "cmpi/support/CmpiSupport.h"

namespace ZV {

using namespace zorva::cmpi;

/// Every path gets this system's name as its host again.
void setNameSpaceAndHost(CMPIObjectPath* path, const std::string& nameSpace);

/// A new path with that namespace and this system's name as its host; the broker's result, good or not.
CMPIObjectPath* newHostPath(const CMPIBroker* broker, const std::string& nameSpace, const char* className,
                            CMPIStatus* rc);

/// A new instance on this host with the filter of these properties, or without one if only its keys are asked for; the
/// broker's result, good or not.
CMPIInstance* newHostInstance(const CMPIBroker* broker, const std::string& nameSpace, const char* className,
                              const char** properties, bool keysOnly, const char* const* keys);

}  // namespace ZV
