// ZORVA_DNSGeneralSettingData: the DNS settings of the host as a whole. Instance provider.

#include "factory/DNSGeneralSettingDataObjects.h"
#include "factory/InstanceModification.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSGeneralSettingDataProv = "Zorvagent.DNSGeneralSettingDataProvider";

// A failure leaves the result open: no returnDone and no exit in the log. The status is what the broker's calls left.

static CMPIStatus DNSGeneralSettingData_EnumInstanceNames(Operation operation) {
  operation = enter(operation, loggerDNSGeneralSettingDataProv);
  return endWithAll(operation, fetchGeneralSettings<CMPIObjectPath>(operation, operation.ref));
}

static CMPIStatus DNSGeneralSettingData_EnumInstances(Operation operation) {
  operation = enter(operation, loggerDNSGeneralSettingDataProv);
  return endWithAll(operation, fetchGeneralSettings<CMPIInstance>(operation, operation.ref));
}

static CMPIStatus DNSGeneralSettingData_GetInstance(Operation operation) {
  operation = enter(operation, loggerDNSGeneralSettingDataProv);
  std::vector<CMPIInstance*> instances;
  if (getOneDNSGeneralSettingDataCMPIInstance(broker, operation.ref, operation.properties, &instances,
                                              &operation.status) != 0) {
    return fail(operation, "getOneDNSGeneralSettingDataCMPIInstance Failed");
  }
  returnAll(operation, instances);
  return end(operation);
}

// This modification does not return its own rc: the client gets the status that the broker's calls left, and a failure
// leaves the result open.
static CMPIStatus DNSGeneralSettingData_ModifyInstance(Operation operation, const CMPIInstance* changed) {
  operation = enter(operation, loggerDNSGeneralSettingDataProv);
  const unsigned int rc =
      modifyDNSGeneralSettingDataCMPIInstance(broker, operation.ref, operation.properties, changed, &operation.status);
  if (rc != CMPI_RC_OK) {
    return fail(operation, "modifyDNSSettingDataCMPIInstance Failed");
  }
  returnDone(operation.result);
  return {operation.status.rc, nullptr};  // no exit is logged
}

}  // namespace ZV

ZV_INSTANCE_MI(DNSGeneralSettingDataProvider, DNSGeneralSettingData,
               modifyInstance<DNSGeneralSettingData_ModifyInstance>)
