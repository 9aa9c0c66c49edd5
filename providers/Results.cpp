#include "providers/Results.h"

#include <ObjectPaths.h>

#include "factory/CmpiSupport.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "factory/DNSSettingDataObjects.h"

namespace ZV {

using Paths = std::vector<CMPIObjectPath*>;
using Instances = std::vector<CMPIInstance*>;

template <>
std::optional<Paths> fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                                    bool) {
  Paths paths;
  paths.reserve(factory.getNumberOfDNSClientInstances());
  if (factory.getAllDNSClientCMPIObjPaths(operation.broker, path, paths, &operation.status) != 0) return {};
  return paths;
}

template <>
std::optional<Instances> fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                                        bool keysOnly) {
  Instances instances;
  instances.reserve(factory.getNumberOfDNSClientInstances());
  if (factory.getAllDNSClientCMPIInstances(operation.broker, path, operation.properties, keysOnly, instances,
                                           &operation.status) != 0) {
    return {};
  }
  return instances;
}

template <>
std::optional<Paths> fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                                  bool) {
  Paths paths;
  paths.reserve(factory.getNumberOfDNSServerInstances());
  if (factory.getAllDNSServerCMPIObjPaths(operation.broker, path, paths, &operation.status) != 0) return {};
  return paths;
}

template <>
std::optional<Instances> fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                                      bool keysOnly) {
  Instances instances;
  instances.reserve(factory.getNumberOfDNSServerInstances());
  if (factory.getAllDNSServerCMPIInstances(operation.broker, path, operation.properties, keysOnly, instances,
                                           &operation.status) != 0) {
    return {};
  }
  return instances;
}

template <>
std::optional<Paths> fetchSettings(Operation& operation, const CMPIObjectPath* path, const char* failed,
                                   const Place& place) {
  Paths paths;
  if (getAllDNSSettingDataCMPIObjectPaths(operation.broker, path, &paths, &operation.status) == 0) return paths;
  complain(operation, failed != nullptr ? failed : "getAllDNSSettingDataCMPIObjectPaths Failed", place);
  return {};
}

template <>
std::optional<Instances> fetchSettings(Operation& operation, const CMPIObjectPath* path, const char* failed,
                                       const Place& place) {
  Instances all;
  if (getAllDNSSettingDataCMPIInstances(operation.broker, path, operation.properties, &all, &operation.status) == 0) {
    return all;
  }
  complain(operation, failed != nullptr ? failed : "getAllDNSSettingDataCMPIInstances Failed", place);
  return {};
}

template <>
std::optional<Paths> fetchGeneralSettings(Operation& operation, const CMPIObjectPath* path, const char* failed,
                                          const Place& place) {
  Paths paths;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(operation.broker, path, &paths, &operation.status) == 0) return paths;
  complain(operation, failed != nullptr ? failed : "getAllDNSGeneralSettingDataCMPIObjectPaths Failed", place);
  return {};
}

template <>
std::optional<Instances> fetchGeneralSettings(Operation& operation, const CMPIObjectPath* path, const char* failed,
                                              const Place& place) {
  Instances all;
  if (getAllDNSGeneralSettingDataCMPIInstances(operation.broker, path, operation.properties, &all, &operation.status) ==
      0) {
    return all;
  }
  complain(operation, failed != nullptr ? failed : "getAllDNSGeneralSettingDataCMPIInstances Failed", place);
  return {};
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
