// ZORVA_DNSProtocolEndPoint: the DNS client endpoints, one for each network interface. Instance and method provider.

#include <cstring>

#include "factory/ClassNames.h"
#include "factory/DNSClientObjFactory.h"
#include "factory/InstanceModification.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSClientProv = "Zorvagent.DNSClientProvider";
static const char* const setDNSDomainMethod = "SetDNSDomain";
static const char* const setDNSServerSearchOrderMethod = "SetDNSServerSearchOrder";
static const char* const setDNSSuffixSearchOrderMethod = "SetDNSSuffixSearchOrder";

// A failure leaves the result open: no returnDone and no exit in the log. The status is what the broker's calls left.

static CMPIStatus DNSClient_EnumInstanceNames(Operation operation) {
  operation = enter(operation, loggerDNSClientProv);
  DNSClientObjFactory factory;
  return endWithEach(operation, fetchEndpoints<CMPIObjectPath>(operation, factory, operation.ref),
                     "getAllDNSClientCMPIObjPaths Failed");
}

static CMPIStatus DNSClient_EnumInstances(Operation operation) {
  operation = enter(operation, loggerDNSClientProv);
  DNSClientObjFactory factory;
  return endWithEach(operation, fetchEndpoints<CMPIInstance>(operation, factory, operation.ref),
                     "getAllDNSClientCMPIInstances Failed");
}

static CMPIStatus DNSClient_GetInstance(Operation operation) {
  operation = enter(operation, loggerDNSClientProv);
  return endWithNamed(operation, &DNSClientObjFactory::getOneDNSClientCMPIInstance,
                      "getOneDNSClientCMPIInstance Failed", fetchEndpoints<CMPIInstance>,
                      "getAllDNSClientCMPIInstances Failed");
}

static CMPIStatus DNSClient_ModifyInstance(Operation operation, const CMPIInstance* changed) {
  operation = enter(operation, loggerDNSClientProv);
  const unsigned int rc =
      modifyDNSProtocolEndpointCMPIInstance(broker, operation.ref, operation.properties, changed, &operation.status);
  return endModification(operation, rc);
}

// True if the call is for the method of the endpoint class; its argument is then in data.
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

// A method of another name or class returns no value and no failure.
static CMPIStatus DNSClient_InvokeMethod(CMPIMethodMI*, const CMPIContext* context, const CMPIResult* result,
                                         const CMPIObjectPath* objectPath, const char* method, const CMPIArgs* in,
                                         CMPIArgs*) {
  Operation operation =
      enter({.broker = broker, .context = context, .result = result, .ref = objectPath}, loggerDNSClientProv);
  CMPIStatus& status = operation.status;
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
  markExit(operation);
  returnDone(result);  // after the exit line; instance operations do it before
  return status;
}

static CMPIStatus DNSClient_MethodCleanup(CMPIMethodMI*, const CMPIContext*, CMPIBoolean) { return kNotSupported; }

}  // namespace ZV

ZV_INSTANCE_MI(DNSClientProvider, DNSClient, modifyInstance<DNSClient_ModifyInstance>)
ZV_METHOD_MI(DNSClientProvider, DNSClient)
