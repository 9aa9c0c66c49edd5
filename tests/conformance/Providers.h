// The create functions of the twelve providers by their exported prefix.
#pragma once

#include <cmpift.h>

#include <string>

namespace ZV::Test {

struct ProviderFunctions {
  const char* prefix;
  CMPIInstanceMI* (*instance)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
  CMPIAssociationMI* (*association)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);  // null if there is none
  CMPIMethodMI* (*method)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);            // likewise
};

// Null if no provider has that prefix.
const ProviderFunctions* findProvider(const std::string& prefix);

}  // namespace ZV::Test
