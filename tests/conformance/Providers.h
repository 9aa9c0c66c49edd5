// The create functions of the twelve providers by their exported prefix.
#pragma once

#include <cmpift.h>

#include <string>

namespace ZV::Test {

struct ProviderFunctions {
  const char* prefix;
  CMPIInstanceMI* (*instance)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
  CMPIAssociationMI* (*association)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);  // null where there is none
  CMPIMethodMI* (*method)(const CMPIBroker*, const CMPIContext*, CMPIStatus*);            // likewise
};

// Null where no provider has that prefix.
const ProviderFunctions* findProvider(const std::string& prefix);

}  // namespace ZV::Test
