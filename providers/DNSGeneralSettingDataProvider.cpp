// ZORVA_DNSGeneralSettingData: the DNS settings of the host as a whole. Instance provider.
#include "factory/DNSGeneralSettingDataObjects.h"
#include "factory/InstanceModification.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSGeneralSettingDataProv = "Zorvagent.DNSGeneralSettingDataProvider";

// A failure below leaves the result open: neither done nor marked as left, with the status as the broker's calls left
// it.

static CMPIStatus DNSGeneralSettingData_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                                          const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralSettingDataProv);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIObjectPath*> paths;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &paths, &status) != 0) {
    logError(loggerDNSGeneralSettingDataProv, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
    return status;
  }
  returnAll(result, paths);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralSettingDataProv);
  return status;
}

static CMPIStatus DNSGeneralSettingData_EnumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                                      const CMPIObjectPath* ref, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralSettingDataProv);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (getAllDNSGeneralSettingDataCMPIInstances(broker, ref, properties, &instances, &status) != 0) {
    logError(loggerDNSGeneralSettingDataProv, ZV_HERE, "getAllDNSGeneralSettingDataCMPIInstances Failed");
    return status;
  }
  returnAll(result, instances);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralSettingDataProv);
  return status;
}

static CMPIStatus DNSGeneralSettingData_GetInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                                    const CMPIObjectPath* ref, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralSettingDataProv);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (getOneDNSGeneralSettingDataCMPIInstance(broker, ref, properties, &instances, &status) != 0) {
    logError(loggerDNSGeneralSettingDataProv, ZV_HERE, "getOneDNSGeneralSettingDataCMPIInstance Failed");
    return status;
  }
  returnAll(result, instances);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralSettingDataProv);
  return status;
}

// Unlike its siblings this modification keeps its own rc to itself: the client gets what the broker's calls left in the
// status, and a failure leaves the result open.
static CMPIStatus DNSGeneralSettingData_ModifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                                       const CMPIObjectPath* ref, const CMPIInstance* instance,
                                                       const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralSettingDataProv);
  CMPIStatus status = kStatusOk;
  const auto rc =
      static_cast<unsigned short>(modifyDNSGeneralSettingDataCMPIInstance(broker, ref, properties, instance, &status));
  if (rc != CMPI_RC_OK) {
    logError(loggerDNSGeneralSettingDataProv, ZV_HERE,
             "modifyDNSSettingDataCMPIInstance Failed");  // the sibling's text
    return status;
  }
  returnDone(result);
  return {status.rc, nullptr};  // no exit is marked
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSGeneralSettingData)

}  // namespace ZV

ZV_INSTANCE_MI(DNSGeneralSettingDataProvider, DNSGeneralSettingData)
