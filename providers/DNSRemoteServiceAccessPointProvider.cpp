// ZORVA_RemoteServiceAccessPoint: the configured DNS servers. Instance provider.
#include "factory/DNSClientObjFactory.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSRemoteSAP = "Zorvagent.DNSRemoteServiceAccessPointProvider";

// A failure below leaves the result open: neither done nor marked as left, with the status as the broker's calls left
// it.

static CMPIStatus DNSRemoteServiceAccessPoint_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext*,
                                                                const CMPIResult* result, const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSRemoteSAP);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> paths;
  paths.reserve(factory.getNumberOfDNSServerInstances());
  if (factory.getAllDNSServerCMPIObjPaths(broker, ref, paths, &status) != 0) {
    logError(loggerDNSRemoteSAP, ZV_HERE, "getAllDNSServerCMPIObjPaths Failed");
    return status;
  }
  for (const CMPIObjectPath* path : paths) returnObjectPath(result, path);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSRemoteSAP);
  return status;
}

static CMPIStatus DNSRemoteServiceAccessPoint_EnumInstances(CMPIInstanceMI*, const CMPIContext*,
                                                            const CMPIResult* result, const CMPIObjectPath* ref,
                                                            const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSRemoteSAP);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  std::vector<CMPIInstance*> instances;
  instances.reserve(factory.getNumberOfDNSServerInstances());
  if (factory.getAllDNSServerCMPIInstances(broker, ref, properties, false, instances, &status) != 0) {
    logError(loggerDNSRemoteSAP, ZV_HERE, "getAllDNSServerCMPIInstances Failed");
    return status;
  }
  for (const CMPIInstance* instance : instances) returnInstance(result, instance);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSRemoteSAP);
  return status;
}

namespace {

// The name alone decides; the other keys of the path are not looked at. False leaves the result open.
bool returnByName(CMPIString* name, const CMPIResult* result, const CMPIObjectPath* ref, const char** properties,
                  const LogSite& site, CMPIStatus* status) {
  DNSClientObjFactory factory;
  std::vector<CMPIInstance*> instances;
  instances.reserve(factory.getNumberOfDNSServerInstances());
  if (factory.getOneDNSServerCMPIInstance(broker, ref, name, properties, instances, status) != 0) {
    logError(loggerDNSRemoteSAP, site, "getOneDNSServerCMPIInstance Failed");
    return false;
  }
  for (const CMPIInstance* instance : instances) returnInstance(result, instance);
  return true;
}

// All keys count, and every instance has a name: a path without one finds nothing. False leaves the result open.
bool returnByKeys(const CMPIResult* result, const CMPIObjectPath* ref, const char** properties, const LogSite& site,
                  CMPIStatus* status) {
  DNSClientObjFactory factory;
  std::vector<CMPIInstance*> instances;
  instances.reserve(factory.getNumberOfDNSServerInstances());
  if (factory.getAllDNSServerCMPIInstances(broker, ref, properties, false, instances, status) != 0) {
    logError(loggerDNSRemoteSAP, site, "getAllDNSServerCMPIInstances Failed");
    return false;
  }
  returnFirstEqual(result, ref, instances, false, status);
  return true;
}

}  // namespace

static CMPIStatus DNSRemoteServiceAccessPoint_GetInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                                          const CMPIObjectPath* ref, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSRemoteSAP);
  CMPIStatus status = kStatusOk;
  if (keyCountOf(ref, &status) == 0) {
    logError(loggerDNSRemoteSAP, ZV_HERE, "At least one key should be passed");
  } else {
    const CMPIString* name = stringOf(getKey(ref, "Name", &status));
    const bool complete = isGood(name)
                              ? returnByName(const_cast<CMPIString*>(name), result, ref, properties, ZV_HERE, &status)
                              : returnByKeys(result, ref, properties, ZV_HERE, &status);
    if (!complete) return status;
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSRemoteSAP);
  return status;
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSRemoteServiceAccessPoint)
ZV_REFUSED_MODIFICATION(DNSRemoteServiceAccessPoint)

}  // namespace ZV

ZV_INSTANCE_MI(DNSRemoteServiceAccessPointProvider, DNSRemoteServiceAccessPoint)
