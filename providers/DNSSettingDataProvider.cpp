// ZORVA_DNSSettingData: the DNS settings of each network interface. Instance provider.
#include "factory/DNSSettingDataObjects.h"
#include "factory/InstanceModification.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSSettingDataProv = "Zorvagent.DNSSettingDataProvider";

// A failure below leaves the result open: neither done nor marked as left, with the status as the broker's calls left
// it.

static CMPIStatus DNSSettingData_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                                   const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSSettingDataProv);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIObjectPath*> paths;
  if (getAllDNSSettingDataCMPIObjectPaths(broker, ref, &paths, &status) != 0) {
    logError(loggerDNSSettingDataProv, ZV_HERE, "getAllDNSSettingDataCMPIInstances Failed");  // one text for both
    return status;
  }
  returnAll(result, paths);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSSettingDataProv);
  return status;
}

static CMPIStatus DNSSettingData_EnumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                               const CMPIObjectPath* ref, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSSettingDataProv);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (getAllDNSSettingDataCMPIInstances(broker, ref, properties, &instances, &status) != 0) {
    logError(loggerDNSSettingDataProv, ZV_HERE, "getAllDNSSettingDataCMPIInstances Failed");
    return status;
  }
  returnAll(result, instances);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSSettingDataProv);
  return status;
}

static CMPIStatus DNSSettingData_GetInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                             const CMPIObjectPath* ref, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSSettingDataProv);
  CMPIStatus status = kStatusOk;
  CMPIInstance* instance = nullptr;
  if (getOneDNSSettingDataCMPIInstance(broker, ref, properties, &instance, &status) != 0) {
    logError(loggerDNSSettingDataProv, ZV_HERE, "getOneDNSSettingDataCMPIInstance Failed");
    return status;
  }
  returnInstance(result, instance);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSSettingDataProv);
  return status;
}

static CMPIStatus DNSSettingData_ModifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                                const CMPIObjectPath* ref, const CMPIInstance* instance,
                                                const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSSettingDataProv);
  CMPIStatus status = kStatusOk;
  const auto rc =
      static_cast<unsigned short>(modifyDNSSettingDataCMPIInstance(broker, ref, properties, instance, &status));
  if (rc != CMPI_RC_OK) {
    logError(loggerDNSSettingDataProv, ZV_HERE, "modifyDNSSettingDataCMPIInstance Failed");
    status.rc = static_cast<CMPIrc>(rc);
  }
  returnDone(result);
  return {status.rc, nullptr};  // no exit is marked
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSSettingData)

}  // namespace ZV

ZV_INSTANCE_MI(DNSSettingDataProvider, DNSSettingData)
