#include "providers/Results.h"

#include <ObjectPaths.h>

#include "factory/CmpiSupport.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "factory/DNSSettingDataObjects.h"

namespace ZV {

bool fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                    std::vector<CMPIObjectPath*>& endpoints) {
  endpoints.reserve(factory.getNumberOfDNSClientInstances());
  return factory.getAllDNSClientCMPIObjPaths(operation.broker, path, endpoints, &operation.status) == 0;
}

bool fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                    std::vector<CMPIInstance*>& endpoints) {
  endpoints.reserve(factory.getNumberOfDNSClientInstances());
  return factory.getAllDNSClientCMPIInstances(operation.broker, path, operation.properties, false, endpoints,
                                              &operation.status) == 0;
}

bool fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                  std::vector<CMPIObjectPath*>& servers) {
  servers.reserve(factory.getNumberOfDNSServerInstances());
  return factory.getAllDNSServerCMPIObjPaths(operation.broker, path, servers, &operation.status) == 0;
}

bool fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                  std::vector<CMPIInstance*>& servers) {
  servers.reserve(factory.getNumberOfDNSServerInstances());
  return factory.getAllDNSServerCMPIInstances(operation.broker, path, operation.properties, false, servers,
                                              &operation.status) == 0;
}

bool fetchSettings(Operation& operation, const CMPIObjectPath* path, std::vector<CMPIObjectPath*>& settings,
                   const Place& place) {
  return getAllDNSSettingDataCMPIObjectPaths(operation.broker, path, &settings, &operation.status) == 0 ||
         complain(operation, "getAllDNSSettingDataCMPIObjectPaths Failed", place);
}

bool fetchSettings(Operation& operation, const CMPIObjectPath* path, std::vector<CMPIInstance*>& settings,
                   const Place& place) {
  return getAllDNSSettingDataCMPIInstances(operation.broker, path, operation.properties, &settings,
                                           &operation.status) == 0 ||
         complain(operation, "getAllDNSSettingDataCMPIInstances Failed", place);
}

bool fetchGeneralSettings(Operation& operation, const CMPIObjectPath* path, std::vector<CMPIObjectPath*>& settings,
                          const Place& place) {
  return getAllDNSGeneralSettingDataCMPIObjectPaths(operation.broker, path, &settings, &operation.status) == 0 ||
         complain(operation, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed", place);
}

bool fetchGeneralSettings(Operation& operation, const CMPIObjectPath* path, std::vector<CMPIInstance*>& settings,
                          const Place& place) {
  return getAllDNSGeneralSettingDataCMPIInstances(operation.broker, path, operation.properties, &settings,
                                                  &operation.status) == 0 ||
         complain(operation, "getAllDNSGeneralSettingDataCMPIInstances Failed", place);
}

void returnPathsOf(Operation& operation, const std::vector<CMPIInstance*>& instances) {
  for (const CMPIInstance* instance : counted16(instances)) {
    returnOne(operation, objectPathOf(instance, &operation.status));
  }
}

void returnFirstEqual(Operation& operation, const std::vector<CMPIInstance*>& instances, bool keysAreReferences) {
  for (const CMPIInstance* instance : counted16(instances)) {
    if (!isGood(instance)) continue;
    if (!isObjPathsEqual(operation.ref, objectPathOf(instance, &operation.status), keysAreReferences)) continue;
    returnOne(operation, instance);
    return;
  }
}

CMPIStatus endModification(Operation& operation, unsigned int rc, const Place& place) {
  if (rc != CMPI_RC_OK) {
    complain(operation, "modifyDNSSettingDataCMPIInstance Failed", place);
    operation.status.rc = static_cast<CMPIrc>(rc);
  }
  returnDone(operation.result);
  return {operation.status.rc, nullptr};
}

}  // namespace ZV
