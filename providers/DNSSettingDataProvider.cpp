// ZORVA_DNSSettingData: the DNS settings of each network interface. Instance provider.

#include "factory/DNSSettingDataObjects.h"
#include "factory/InstanceModification.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSSettingDataProv = "Zorvagent.DNSSettingDataProvider";

// A failure leaves the result open: no returnDone and no exit in the log. The status is what the broker's calls left.

static CMPIStatus DNSSettingData_EnumInstanceNames(Operation operation) {
  operation = enter(operation, loggerDNSSettingDataProv);
  const auto paths =
      fetchSettings<CMPIObjectPath>(operation, operation.ref, "getAllDNSSettingDataCMPIInstances Failed");
  if (!paths) return operation.status;
  returnAll(operation, *paths);
  return end(operation);
}

static CMPIStatus DNSSettingData_EnumInstances(Operation operation) {
  operation = enter(operation, loggerDNSSettingDataProv);
  return endWithAll(operation, fetchSettings<CMPIInstance>(operation, operation.ref));
}

static CMPIStatus DNSSettingData_GetInstance(Operation operation) {
  operation = enter(operation, loggerDNSSettingDataProv);
  CMPIInstance* instance = nullptr;
  if (getOneDNSSettingDataCMPIInstance(broker, operation.ref, operation.properties, &instance, &operation.status) !=
      0) {
    return fail(operation, "getOneDNSSettingDataCMPIInstance Failed");
  }
  returnOne(operation, instance);
  return end(operation);
}

static CMPIStatus DNSSettingData_ModifyInstance(Operation operation, const CMPIInstance* changed) {
  operation = enter(operation, loggerDNSSettingDataProv);
  const unsigned int rc =
      modifyDNSSettingDataCMPIInstance(broker, operation.ref, operation.properties, changed, &operation.status);
  return endModification(operation, rc);
}

}  // namespace ZV

ZV_INSTANCE_MI(DNSSettingDataProvider, DNSSettingData, modifyInstance<DNSSettingData_ModifyInstance>)
