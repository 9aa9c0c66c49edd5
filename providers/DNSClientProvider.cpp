// ZORVA_DNSProtocolEndPoint: the DNS client endpoints, one for each network interface. Instance and method provider.
#include <cstring>

#include "factory/DNSClientObjFactory.h"
#include "factory/InstanceModification.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSClientProv = "Zorvagent.DNSClientProvider";
static const char* const dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
static const char* const setDNSDomainMethod = "SetDNSDomain";
static const char* const setDNSServerSearchOrderMethod = "SetDNSServerSearchOrder";
static const char* const setDNSSuffixSearchOrderMethod = "SetDNSSuffixSearchOrder";

// A failure below leaves the result open: neither done nor marked as left, with the status as the broker's calls left
// it.

static CMPIStatus DNSClient_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                              const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSClientProv);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> paths;
  paths.reserve(factory.getNumberOfDNSClientInstances());
  if (factory.getAllDNSClientCMPIObjPaths(broker, ref, paths, &status) != 0) {
    logError(loggerDNSClientProv, ZV_HERE, "getAllDNSClientCMPIObjPaths Failed");
    return status;
  }
  for (const CMPIObjectPath* path : paths) returnObjectPath(result, path);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSClientProv);
  return status;
}

static CMPIStatus DNSClient_EnumInstances(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                          const CMPIObjectPath* ref, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSClientProv);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  std::vector<CMPIInstance*> instances;
  instances.reserve(factory.getNumberOfDNSClientInstances());
  if (factory.getAllDNSClientCMPIInstances(broker, ref, properties, false, instances, &status) != 0) {
    logError(loggerDNSClientProv, ZV_HERE, "getAllDNSClientCMPIInstances Failed");
    return status;
  }
  for (const CMPIInstance* instance : instances) returnInstance(result, instance);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSClientProv);
  return status;
}

namespace {

// The name alone decides; the other keys of the path are not looked at. False leaves the result open.
bool returnByName(CMPIString* name, const CMPIResult* result, const CMPIObjectPath* ref, const char** properties,
                  const LogSite& site, CMPIStatus* status) {
  DNSClientObjFactory factory;
  std::vector<CMPIInstance*> instances;
  instances.reserve(factory.getNumberOfDNSClientInstances());
  if (factory.getOneDNSClientCMPIInstance(broker, ref, name, properties, instances, status) != 0) {
    logError(loggerDNSClientProv, site, "getOneDNSClientCMPIInstance Failed");
    return false;
  }
  for (const CMPIInstance* instance : instances) returnInstance(result, instance);
  return true;
}

// All keys count. False leaves the result open.
bool returnByKeys(const CMPIResult* result, const CMPIObjectPath* ref, const char** properties, const LogSite& site,
                  CMPIStatus* status) {
  DNSClientObjFactory factory;
  std::vector<CMPIInstance*> instances;
  instances.reserve(factory.getNumberOfDNSClientInstances());
  if (factory.getAllDNSClientCMPIInstances(broker, ref, properties, false, instances, status) != 0) {
    logError(loggerDNSClientProv, site, "getAllDNSClientCMPIInstances Failed");
    return false;
  }
  returnFirstEqual(result, ref, instances, false, status);
  return true;
}

}  // namespace

static CMPIStatus DNSClient_GetInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                        const CMPIObjectPath* ref, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSClientProv);
  CMPIStatus status = kStatusOk;
  if (keyCountOf(ref, &status) == 0) {
    logError(loggerDNSClientProv, ZV_HERE, "At least one key should be passed");
  } else {
    const CMPIString* name = stringOf(getKey(ref, "Name", &status));
    const bool complete = isGood(name)
                              ? returnByName(const_cast<CMPIString*>(name), result, ref, properties, ZV_HERE, &status)
                              : returnByKeys(result, ref, properties, ZV_HERE, &status);
    if (!complete) return status;
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSClientProv);
  return status;
}

static CMPIStatus DNSClient_ModifyInstance(CMPIInstanceMI*, const CMPIContext*, const CMPIResult* result,
                                           const CMPIObjectPath* ref, const CMPIInstance* instance,
                                           const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSClientProv);
  CMPIStatus status = kStatusOk;
  const auto rc =
      static_cast<unsigned short>(modifyDNSProtocolEndpointCMPIInstance(broker, ref, properties, instance, &status));
  if (rc != CMPI_RC_OK) {
    logError(loggerDNSClientProv, ZV_HERE, "modifyDNSSettingDataCMPIInstance Failed");  // the sibling's text
    status.rc = static_cast<CMPIrc>(rc);
  }
  returnDone(result);
  return {status.rc, nullptr};  // no exit is marked
}

// True where the method of the endpoint class is meant; its argument is then in data.
static bool isCallOf(const char* ownMethod, const std::string& className, const char* method, const char* argument,
                     const CMPIArgs* in, CMPIData& data, CMPIStatus* status) {
  if (className != dnsProtocolEndPointClass || method == nullptr || std::strcmp(method, ownMethod) != 0) return false;
  data = CMPIData{CMPI_null, CMPI_nullValue, {}};
  if (isGood(in)) {
    data = in->ft->getArg(in, argument, status);
  }
  return true;
}

static void returnValue(const CMPIResult* result, unsigned int number) {
  CMPIValue value{};
  value.uint32 = number;
  if (result != nullptr) result->ft->returnData(result, &value, CMPI_uint32);
}

// A method of another name, or of another class, is answered with no value and no failure.
static CMPIStatus DNSClient_InvokeMethod(CMPIMethodMI*, const CMPIContext* context, const CMPIResult* result,
                                         const CMPIObjectPath* objectPath, const char* method, const CMPIArgs* in,
                                         CMPIArgs*) {
  ZV_PROVIDER_ENTRY(loggerDNSClientProv);
  CMPIStatus status = kStatusOk;
  const std::string className = classNameOf(objectPath, &status);
  unsigned int value = 0;
  CMPIData data;
  DNSClientObjFactory factory;
  if (isCallOf(setDNSDomainMethod, className, method, "DNSDomain", in, data, &status)) {
    if (status.rc == CMPI_RC_OK) value = factory.setDNSDomainName(broker, objectPath, stringOf(data), context, &status);
    returnValue(result, value);
  }
  if (isCallOf(setDNSServerSearchOrderMethod, className, method, "DNSServerSearchOrder", in, data, &status)) {
    if (status.rc == CMPI_RC_OK) value = factory.setDNSServerSearchOrder(broker, objectPath, data, context, &status);
    returnValue(result, value);
  }
  if (isCallOf(setDNSSuffixSearchOrderMethod, className, method, "DNSDomainSuffixSearchOrder", in, data, &status)) {
    if (status.rc == CMPI_RC_OK) value = factory.setDNSSuffixesSearchOrder(broker, objectPath, data, context, &status);
    returnValue(result, value);
  }
  ZV_PROVIDER_EXIT(loggerDNSClientProv);
  returnDone(result);  // after the exit mark, the reverse of the instance operations
  return status;
}

// Meant to differ from the other cleanups.
static CMPIStatus DNSClient_MethodCleanup(CMPIMethodMI*, const CMPIContext*, CMPIBoolean) { return kNotSupported; }

ZV_REFUSED_INSTANCE_OPERATIONS(DNSClient)

}  // namespace ZV

ZV_INSTANCE_MI(DNSClientProvider, DNSClient)
ZV_METHOD_MI(DNSClientProvider, DNSClient)
