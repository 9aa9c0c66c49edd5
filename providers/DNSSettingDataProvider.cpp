// ZORVA_DNSSettingData: the DNS settings of each network interface. Instance provider.

#include "factory/DNSSettingDataObjects.h"
#include "factory/InstanceModification.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSSettingDataProv = "Zorvagent.DNSSettingDataProvider";

// A failure leaves the result open: no returnDone and no exit in the log. The status is what the broker's calls left.

static CMPIStatus DNSSettingData_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                   const CMPIResult* result, const CMPIObjectPath* ref) {
  Operation operation = ZV_OPERATION(loggerDNSSettingDataProv, context, result, ref);
  std::vector<CMPIObjectPath*> paths;
  if (getAllDNSSettingDataCMPIObjectPaths(broker, ref, &paths, &operation.status) != 0) {
    return fail(operation, "getAllDNSSettingDataCMPIInstances Failed");
  }
  returnAll(result, paths);
  return end(operation);
}

static CMPIStatus DNSSettingData_EnumInstances(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                               const CMPIObjectPath* ref, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSSettingDataProv, context, result, ref);
  std::vector<CMPIInstance*> instances;
  if (getAllDNSSettingDataCMPIInstances(broker, ref, properties, &instances, &operation.status) != 0) {
    return fail(operation, "getAllDNSSettingDataCMPIInstances Failed");
  }
  returnAll(result, instances);
  return end(operation);
}

static CMPIStatus DNSSettingData_GetInstance(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                             const CMPIObjectPath* ref, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSSettingDataProv, context, result, ref);
  CMPIInstance* instance = nullptr;
  if (getOneDNSSettingDataCMPIInstance(broker, ref, properties, &instance, &operation.status) != 0) {
    return fail(operation, "getOneDNSSettingDataCMPIInstance Failed");
  }
  returnInstance(result, instance);
  return end(operation);
}

static CMPIStatus DNSSettingData_ModifyInstance(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                                const CMPIObjectPath* ref, const CMPIInstance* instance,
                                                const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSSettingDataProv, context, result, ref);
  const unsigned int rc = modifyDNSSettingDataCMPIInstance(broker, ref, properties, instance, &operation.status);
  if (rc != CMPI_RC_OK) {
    complain(operation, "modifyDNSSettingDataCMPIInstance Failed");
    operation.status.rc = static_cast<CMPIrc>(rc);
  }
  returnDone(result);
  return {operation.status.rc, nullptr};  // no exit is logged
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSSettingData)

}  // namespace ZV

ZV_INSTANCE_MI(DNSSettingDataProvider, DNSSettingData)
