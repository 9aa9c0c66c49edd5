// ZORVA_RemoteServiceAccessPoint: the configured DNS servers. Instance provider.

#include "factory/DNSClientObjFactory.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSRemoteSAP = "Zorvagent.DNSRemoteServiceAccessPointProvider";

// A failure leaves the result open: no returnDone and no exit in the log. The status is what the broker's calls left.

static CMPIStatus DNSRemoteServiceAccessPoint_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                                const CMPIResult* result, const CMPIObjectPath* ref) {
  Operation operation = ZV_OPERATION(loggerDNSRemoteSAP, context, result, ref);
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> paths;
  if (!fetchServers(operation, factory, ref, paths)) return fail(operation, "getAllDNSServerCMPIObjPaths Failed");
  for (const CMPIObjectPath* path : paths) returnObjectPath(result, path);
  return end(operation);
}

static CMPIStatus DNSRemoteServiceAccessPoint_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                            const CMPIResult* result, const CMPIObjectPath* ref,
                                                            const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSRemoteSAP, context, result, ref);
  DNSClientObjFactory factory;
  std::vector<CMPIInstance*> instances;
  if (!fetchServers(operation, factory, ref, properties, instances)) {
    return fail(operation, "getAllDNSServerCMPIInstances Failed");
  }
  for (const CMPIInstance* instance : instances) returnInstance(result, instance);
  return end(operation);
}

static CMPIStatus DNSRemoteServiceAccessPoint_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                          const CMPIResult* result, const CMPIObjectPath* ref,
                                                          const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSRemoteSAP, context, result, ref);
  if (keyCountOf(ref, &operation.status) == 0) {
    complain(operation, "At least one key should be passed");
    return end(operation);
  }
  const CMPIString* name = stringOf(getKey(ref, "Name", &operation.status));
  DNSClientObjFactory factory;
  std::vector<CMPIInstance*> instances;
  if (isGood(name)) {  // only the name decides; the other keys are ignored
    if (factory.getOneDNSServerCMPIInstance(broker, ref, const_cast<CMPIString*>(name), properties, instances,
                                            &operation.status) != 0) {
      return fail(operation, "getOneDNSServerCMPIInstance Failed");
    }
    for (const CMPIInstance* instance : instances) returnInstance(result, instance);
  } else {  // all keys count, and every server has a name: nothing is found
    if (!fetchServers(operation, factory, ref, properties, instances)) {
      return fail(operation, "getAllDNSServerCMPIInstances Failed");
    }
    returnFirstEqual(result, ref, instances, false, &operation.status);
  }
  return end(operation);
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSRemoteServiceAccessPoint)
ZV_REFUSED_MODIFICATION(DNSRemoteServiceAccessPoint)

}  // namespace ZV

ZV_INSTANCE_MI(DNSRemoteServiceAccessPointProvider, DNSRemoteServiceAccessPoint)
