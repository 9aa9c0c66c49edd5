#pragma once

// The instance operations that the companion providers share: they publish objects, and refuse to change them.

#include <cmpidt.h>

#include <functional>
#include <vector>

#include "agent/tree/TreeSnapshot.h"
#include "host/HostObject.h"

namespace zorva::host {

/// Makes a provider's objects from the current state of the host.
using Publish = std::function<std::vector<HostObject>(const zorva::agent::TreeSnapshot& tree)>;

/// Each reads the host again and returns the objects of the class that ref names. rc CMPI_RC_ERR_FAILED, with the
/// reason, if the host cannot be read; no exception leaves them. Thread-safe.
CMPIStatus enumerateInstanceNames(const CMPIBroker* broker, const Publish& publish, const CMPIResult* result,
                                  const CMPIObjectPath* ref);
CMPIStatus enumerateInstances(const CMPIBroker* broker, const Publish& publish, const CMPIResult* result,
                              const CMPIObjectPath* ref, const char** properties);

/// The object that has all the keys of ref and no others: names of classes in any case, other values exactly. rc
/// CMPI_RC_ERR_NOT_FOUND, with the reason, if there is none.
CMPIStatus getInstance(const CMPIBroker* broker, const Publish& publish, const CMPIResult* result,
                       const CMPIObjectPath* ref, const char** properties);

/// rc CMPI_RC_ERR_NOT_SUPPORTED, with a text that names the client's operation.
CMPIStatus refuse(const CMPIBroker* broker, const char* operation);

}  // namespace zorva::host
