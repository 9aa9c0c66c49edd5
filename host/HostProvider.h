#pragma once

// The instance operations of one provider of objects of the host.

#include <cmpidt.h>
#include <cmpift.h>

#include "cmpi/support/ProviderFrame.h"
#include "host/InstanceOperations.h"

namespace zorva::host {

/// One provider: its objects, with its own broker and table.
template <std::vector<HostObject> (*publish)(const agent::TreeSnapshot&)>
struct Provider {
  static inline const CMPIBroker* broker = nullptr;

  static CMPIStatus cleanup(CMPIInstanceMI*, const CMPIContext*, CMPIBoolean) { return {CMPI_RC_OK, nullptr}; }
  static CMPIStatus enumNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                              const CMPIObjectPath* ref) {
    return enumerateInstanceNames(broker, publish, result, ref);
  }
  static CMPIStatus enumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                  const CMPIObjectPath* ref, const char** properties) {
    return enumerateInstances(broker, publish, result, ref, properties);
  }
  static CMPIStatus get(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result, const CMPIObjectPath* ref,
                        const char** properties) {
    return getInstance(broker, publish, result, ref, properties);
  }
  static CMPIStatus create(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                           const CMPIInstance*) {
    return refuse(broker, "CreateInstance");
  }
  static CMPIStatus modify(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*,
                           const CMPIInstance*, const char**) {
    return refuse(broker, "ModifyInstance");
  }
  static CMPIStatus remove(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) {
    return refuse(broker, "DeleteInstance");
  }
  static CMPIStatus query(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*,
                          const char*) {
    return refuse(broker, "ExecQuery");
  }

  static constexpr CMPIInstanceMIFT table(const char* name) {
    return cmpi::tableOf<CMPIInstanceMIFT>(cmpi::kTableVersion, cmpi::kTableVersion, name, cleanup, enumNames,
                                           enumInstances, get, create, modify, remove, query);
  }
};

}  // namespace zorva::host
