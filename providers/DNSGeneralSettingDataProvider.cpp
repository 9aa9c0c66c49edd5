// ZORVA_DNSGeneralSettingData: the DNS settings of the host as a whole. Instance provider.

#include "factory/DNSGeneralSettingDataObjects.h"
#include "factory/InstanceModification.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSGeneralSettingDataProv = "Zorvagent.DNSGeneralSettingDataProvider";

// A failure leaves the result open: no returnDone and no exit in the log. The status is what the broker's calls left.

static CMPIStatus DNSGeneralSettingData_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                          const CMPIResult* result, const CMPIObjectPath* ref) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralSettingDataProv, context, result, ref);
  std::vector<CMPIObjectPath*> paths;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &paths, &operation.status) != 0) {
    return fail(operation, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
  }
  returnAll(result, paths);
  return end(operation);
}

static CMPIStatus DNSGeneralSettingData_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                      const CMPIResult* result, const CMPIObjectPath* ref,
                                                      const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralSettingDataProv, context, result, ref);
  std::vector<CMPIInstance*> instances;
  if (getAllDNSGeneralSettingDataCMPIInstances(broker, ref, properties, &instances, &operation.status) != 0) {
    return fail(operation, "getAllDNSGeneralSettingDataCMPIInstances Failed");
  }
  returnAll(result, instances);
  return end(operation);
}

static CMPIStatus DNSGeneralSettingData_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                    const CMPIResult* result, const CMPIObjectPath* ref,
                                                    const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralSettingDataProv, context, result, ref);
  std::vector<CMPIInstance*> instances;
  if (getOneDNSGeneralSettingDataCMPIInstance(broker, ref, properties, &instances, &operation.status) != 0) {
    return fail(operation, "getOneDNSGeneralSettingDataCMPIInstance Failed");
  }
  returnAll(result, instances);
  return end(operation);
}

// This modification does not return its own rc: the client gets the status that the broker's calls left, and a failure
// leaves the result open.
static CMPIStatus DNSGeneralSettingData_ModifyInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                       const CMPIResult* result, const CMPIObjectPath* ref,
                                                       const CMPIInstance* instance, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralSettingDataProv, context, result, ref);
  const unsigned int rc = modifyDNSGeneralSettingDataCMPIInstance(broker, ref, properties, instance, &operation.status);
  if (rc != CMPI_RC_OK) {
    return fail(operation, "modifyDNSSettingDataCMPIInstance Failed");
  }
  returnDone(result);
  return {operation.status.rc, nullptr};  // no exit is logged
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSGeneralSettingData)

}  // namespace ZV

ZV_INSTANCE_MI(DNSGeneralSettingDataProvider, DNSGeneralSettingData)
