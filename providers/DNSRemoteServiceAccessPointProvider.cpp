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
  return endWithEach(operation, fetchServers<CMPIObjectPath>(operation, factory, operation.ref),
                     "getAllDNSServerCMPIObjPaths Failed");
}

static CMPIStatus DNSRemoteServiceAccessPoint_EnumInstances(Operation operation) {
  operation = enter(operation, loggerDNSRemoteSAP);
  DNSClientObjFactory factory;
  return endWithEach(operation, fetchServers<CMPIInstance>(operation, factory, operation.ref),
                     "getAllDNSServerCMPIInstances Failed");
}

// Without a name nothing is found: every server has one.
static CMPIStatus DNSRemoteServiceAccessPoint_GetInstance(Operation operation) {
  operation = enter(operation, loggerDNSRemoteSAP);
  return endWithNamed(operation, &DNSClientObjFactory::getOneDNSServerCMPIInstance,
                      "getOneDNSServerCMPIInstance Failed", fetchServers<CMPIInstance>,
                      "getAllDNSServerCMPIInstances Failed");
}

}  // namespace ZV

ZV_INSTANCE_MI(DNSRemoteServiceAccessPointProvider, DNSRemoteServiceAccessPoint, refusedModification)
