#include "providers/Results.h"

#include <ObjectPaths.h>

#include "factory/CmpiSupport.h"

namespace ZV {

bool fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                    std::vector<CMPIObjectPath*>& endpoints) {
  endpoints.reserve(factory.getNumberOfDNSClientInstances());
  return factory.getAllDNSClientCMPIObjPaths(operation.broker, path, endpoints, &operation.status) == 0;
}

bool fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                    const char** properties, std::vector<CMPIInstance*>& endpoints) {
  endpoints.reserve(factory.getNumberOfDNSClientInstances());
  return factory.getAllDNSClientCMPIInstances(operation.broker, path, properties, false, endpoints,
                                              &operation.status) == 0;
}

bool fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                  std::vector<CMPIObjectPath*>& servers) {
  servers.reserve(factory.getNumberOfDNSServerInstances());
  return factory.getAllDNSServerCMPIObjPaths(operation.broker, path, servers, &operation.status) == 0;
}

bool fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                  const char** properties, std::vector<CMPIInstance*>& servers) {
  servers.reserve(factory.getNumberOfDNSServerInstances());
  return factory.getAllDNSServerCMPIInstances(operation.broker, path, properties, false, servers, &operation.status) ==
         0;
}

void returnAll(const CMPIResult* result, const std::vector<CMPIInstance*>& instances) {
  for (const CMPIInstance* instance : counted16(instances)) returnInstance(result, instance);
}

void returnAll(const CMPIResult* result, const std::vector<CMPIObjectPath*>& paths) {
  for (const CMPIObjectPath* path : counted16(paths)) returnObjectPath(result, path);
}

void returnPathsOf(const CMPIResult* result, const std::vector<CMPIInstance*>& instances, CMPIStatus* status) {
  for (const CMPIInstance* instance : counted16(instances)) returnObjectPath(result, objectPathOf(instance, status));
}

void returnFirstEqual(const CMPIResult* result, const CMPIObjectPath* ref, const std::vector<CMPIInstance*>& instances,
                      bool keysAreReferences, CMPIStatus* status) {
  for (const CMPIInstance* instance : counted16(instances)) {
    if (!isGood(instance) || !isObjPathsEqual(ref, objectPathOf(instance, status), keysAreReferences)) continue;
    returnInstance(result, instance);
    return;
  }
}

}  // namespace ZV
