// ZORVA_RemoteServiceAccessPoint: the configured DNS servers. Instance provider.

#include "factory/DNSClientObjFactory.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSRemoteSAP = "Zorvagent.DNSRemoteServiceAccessPointProvider";

// A failure leaves the result open: no returnDone and no exit in the log. The status is what the broker's calls left.

static CMPIStatus DNSRemoteServiceAccessPoint_EnumInstanceNames(Operation operation) {
  operation = enter(operation, loggerDNSRemoteSAP);
  DNSClientObjFactory factory;
  const auto paths = fetchServers<CMPIObjectPath>(operation, factory, operation.ref);
  if (!paths) return fail(operation, "getAllDNSServerCMPIObjPaths Failed");
  for (const CMPIObjectPath* path : *paths) returnOne(operation, path);
  return end(operation);
}

static CMPIStatus DNSRemoteServiceAccessPoint_EnumInstances(Operation operation) {
  operation = enter(operation, loggerDNSRemoteSAP);
  DNSClientObjFactory factory;
  const auto instances = fetchServers<CMPIInstance>(operation, factory, operation.ref);
  if (!instances) return fail(operation, "getAllDNSServerCMPIInstances Failed");
  for (const CMPIInstance* instance : *instances) returnOne(operation, instance);
  return end(operation);
}

static CMPIStatus DNSRemoteServiceAccessPoint_GetInstance(Operation operation) {
  operation = enter(operation, loggerDNSRemoteSAP);
  if (keyCountOf(operation.ref, &operation.status) == 0) {
    complain(operation, "At least one key should be passed");
    return end(operation);
  }
  const CMPIString* name = stringOf(getKey(operation.ref, "Name", &operation.status));
  DNSClientObjFactory factory;
  std::vector<CMPIInstance*> instances;
  if (isGood(name)) {  // only the name decides; the other keys are ignored
    if (factory.getOneDNSServerCMPIInstance(broker, operation.ref, const_cast<CMPIString*>(name), operation.properties,
                                            instances, &operation.status) != 0) {
      return fail(operation, "getOneDNSServerCMPIInstance Failed");
    }
    for (const CMPIInstance* instance : instances) returnOne(operation, instance);
  } else {  // all keys count, and every server has a name: nothing is found
    const auto all = fetchServers<CMPIInstance>(operation, factory, operation.ref);
    if (!all) return fail(operation, "getAllDNSServerCMPIInstances Failed");
    returnFirstEqual(operation, *all, false);
  }
  return end(operation);
}

}  // namespace ZV

ZV_INSTANCE_MI(DNSRemoteServiceAccessPointProvider, DNSRemoteServiceAccessPoint, refusedModification)
