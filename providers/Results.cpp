#include "providers/Results.h"

#include <ObjectPaths.h>

#include "factory/CmpiSupport.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "factory/DNSSettingDataObjects.h"

namespace ZV {

using Paths = std::vector<CMPIObjectPath*>;
using Instances = std::vector<CMPIInstance*>;

namespace {

using GetPaths = unsigned short (DNSClientObjFactory::*)(const CMPIBroker*, const CMPIObjectPath*, Paths&, CMPIStatus*);
using GetInstances = unsigned short (DNSClientObjFactory::*)(const CMPIBroker*, const CMPIObjectPath*,
                                                             const char** properties, bool keysOnly, Instances&,
                                                             CMPIStatus*);

std::optional<Paths> fetchPaths(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                                GetPaths getPaths, unsigned short count) {
  Paths paths;
  paths.reserve(count);
  if ((factory.*getPaths)(operation.broker, path, paths, &operation.status) != 0) return {};
  return paths;
}

std::optional<Instances> fetchInstances(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                                        bool keysOnly, GetInstances getInstances, unsigned short count) {
  Instances all;
  all.reserve(count);
  if ((factory.*getInstances)(operation.broker, path, operation.properties, keysOnly, all, &operation.status) != 0) {
    return {};
  }
  return all;
}

}  // namespace

template <>
std::optional<Paths> fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                                    bool) {
  return fetchPaths(operation, factory, path, &DNSClientObjFactory::getAllDNSClientCMPIObjPaths,
                    factory.getNumberOfDNSClientInstances());
}

template <>
std::optional<Instances> fetchEndpoints(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                                        bool keysOnly) {
  return fetchInstances(operation, factory, path, keysOnly, &DNSClientObjFactory::getAllDNSClientCMPIInstances,
                        factory.getNumberOfDNSClientInstances());
}

template <>
std::optional<Paths> fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                                  bool) {
  return fetchPaths(operation, factory, path, &DNSClientObjFactory::getAllDNSServerCMPIObjPaths,
                    factory.getNumberOfDNSServerInstances());
}

template <>
std::optional<Instances> fetchServers(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* path,
                                      bool keysOnly) {
  return fetchInstances(operation, factory, path, keysOnly, &DNSClientObjFactory::getAllDNSServerCMPIInstances,
                        factory.getNumberOfDNSServerInstances());
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

CMPIStatus endWithNamed(Operation& operation, GetNamed getNamed, const char* noneNamed, FetchInstances fetch,
                        const char* cannotFetch, const Place& place) {
  if (keyCountOf(operation.ref, &operation.status) == 0) {
    complain(operation, "At least one key should be passed", place);
    return end(operation, place);
  }
  const CMPIString* name = stringOf(getKey(operation.ref, "Name", &operation.status));
  DNSClientObjFactory factory;
  if (isGood(name)) {
    Instances named;
    if ((factory.*getNamed)(operation.broker, operation.ref, const_cast<CMPIString*>(name), operation.properties, named,
                            &operation.status) != 0) {
      return fail(operation, noneNamed, place);
    }
    for (const CMPIInstance* instance : named) returnOne(operation, instance);
  } else {
    const auto all = fetch(operation, factory, operation.ref, false);
    if (!all) return fail(operation, cannotFetch, place);
    returnFirstEqual(operation, *all, false);
  }
  return end(operation, place);
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
