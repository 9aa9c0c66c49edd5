// The companion providers: the classes that the DNS associations refer to and that a bare CIM server lacks.
#include <cmpidt.h>
#include <cmpift.h>

#include "host/HostObjects.h"
#include "host/InstanceOperations.h"

namespace zorva::host {

namespace {

// One provider: its objects, with its own broker and table.
template <Publish publish>
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

  static CMPIInstanceMI* make(const CMPIBroker* newBroker, const char* name) {
    static CMPIInstanceMIFT table = {200, 200,    name,   cleanup, enumNames, enumInstances,
                                     get, create, modify, remove,  query};
    static CMPIInstanceMI mi = {nullptr, &table};
    broker = newBroker;
    return &mi;
  }
};

}  // namespace

}  // namespace zorva::host

#define ZORVA_HOST_EXPORT extern "C" __attribute__((visibility("default")))

ZORVA_HOST_EXPORT CMPIInstanceMI* HostComputerSystemProvider_Create_InstanceMI(const CMPIBroker* broker,
                                                                               const CMPIContext*, CMPIStatus*) {
  using namespace zorva::host;
  return Provider<computerSystems>::make(broker, "instanceHostComputerSystemProvider");
}

ZORVA_HOST_EXPORT CMPIInstanceMI* HostIPProtocolEndpointProvider_Create_InstanceMI(const CMPIBroker* broker,
                                                                                   const CMPIContext*, CMPIStatus*) {
  using namespace zorva::host;
  return Provider<ipEndpoints>::make(broker, "instanceHostIPProtocolEndpointProvider");
}

ZORVA_HOST_EXPORT CMPIInstanceMI* HostIPAssignmentSettingDataProvider_Create_InstanceMI(const CMPIBroker* broker,
                                                                                        const CMPIContext*,
                                                                                        CMPIStatus*) {
  using namespace zorva::host;
  return Provider<ipAssignments>::make(broker, "instanceHostIPAssignmentSettingDataProvider");
}
