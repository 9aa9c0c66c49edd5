// The factory's functions for associations: the class at the far end, its path, the endpoint of an interface.

#include <cstring>

#include "factory/ClassNames.h"
#include "factory/CmpiSupport.h"
#include "factory/DNSClientObjFactory.h"
#include "trace/Trace.h"

namespace ZV {

namespace {

struct Target {
  const char* sourceClass;
  const char* associationClass;
  const char* targetClass;
  const char* text;  // null: found without a log line
};

// Some texts spell the class in another way; operators' log filters know these texts.
const Target kTargets[] = {
    {dnsProtocolEndPointClass, remoteAccessAvailableToElementClass, remoteServiceAccessPointClass,
     "Target Class is ZORVA_RemoteServiceAccessPoint"},
    {remoteServiceAccessPointClass, remoteAccessAvailableToElementClass, dnsProtocolEndPointClass,
     "Target Class is ZORVA_DNSProtocolEndPointClass"},
    {dnsProtocolEndPointClass, dnsSAPSAPDependencyClass, ipInterfaceClass, "Target Class is ZORVA_IPProtocolEndPoint"},
    {ipInterfaceClass, dnsSAPSAPDependencyClass, dnsProtocolEndPointClass,
     "Target Class is ZORVA_DNSProtocolEndPointClass"},
    {dnsProtocolEndPointClass, dnsHostedAccessPointClass, computerSystemClass, "Target Class is ZORVA_ComputerSystem"},
    {computerSystemClass, dnsHostedAccessPointClass, dnsProtocolEndPointClass,
     "Target Class is ZORVA_DNSProtocolEndPoint"},
    {dnsGeneralSettingDataClass, dnsGeneralElementSettingDataClass, computerSystemClass,
     "Target Class is ZORVA_ComputerSystem"},
    {computerSystemClass, dnsGeneralElementSettingDataClass, dnsGeneralSettingDataClass,
     "Target Class is ZORVA_DNSGeneralSettingData"},
    {dnsSettingDataClass, dnsEndpointElementSettingDataClass, dnsProtocolEndPointClass,
     "Target Class is ZORVA_DNSProtocolEndPoint"},
    {dnsProtocolEndPointClass, dnsEndpointElementSettingDataClass, dnsSettingDataClass,
     "Target Class is ZORVA_DNSSettingData"},
    {dnsGeneralSettingDataClass, dnsGenEndpointElementSettingDataClass, dnsProtocolEndPointClass,
     "Target Class is ZORVA_DNSProtocolEndPoint"},
    {dnsProtocolEndPointClass, dnsGenEndpointElementSettingDataClass, dnsGeneralSettingDataClass,
     "Target Class is ZORVA_DNSGeneralSettingData"},
    {dnsGeneralSettingDataClass, dnsGenOrderedComponentClass, ipAssignmentSettingDataClass, nullptr},
    {ipAssignmentSettingDataClass, dnsGenOrderedComponentClass, dnsGeneralSettingDataClass, nullptr},
    {dnsSettingDataClass, dnsOrderedComponentClass, ipAssignmentSettingDataClass, nullptr},
    {ipAssignmentSettingDataClass, dnsOrderedComponentClass, dnsSettingDataClass, nullptr},
};

const Target* findTarget(const std::string& sourceClass, const char* associationClass) {
  if (associationClass == nullptr) return nullptr;
  for (const Target& target : kTargets) {
    if (sourceClass == target.sourceClass && std::strcmp(associationClass, target.associationClass) == 0) {
      return &target;
    }
  }
  return nullptr;
}

}  // namespace

const char* DNSClientObjFactory::get_assoc_targetClass_Name(const CMPIBroker* _broker, const CMPIObjectPath* ref,
                                                            const char* _RefLeftClass, const char* _RefRightClass,
                                                            CMPIStatus* rc) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " _broker=", _broker, " ref=", ref, " _RefLeftClass=", _RefLeftClass,
                     " _RefRightClass=", _RefRightClass, " rc=", rc);
  const Target* target = findTarget(classNameOf(ref, rc), _RefLeftClass);
  if (target == nullptr) {
    logMessage(loggerDNSObjFactory, ZV_HERE, LOG_LEVEL_DETAIL, "Target Class is EMPTY");
  } else if (target->text != nullptr) {
    logMessage(loggerDNSObjFactory, ZV_HERE, LOG_LEVEL_DETAIL, target->text);
  }
  flow.exit();
  return target != nullptr ? target->targetClass : "";
}

CMPIObjectPath* DNSClientObjFactory::get_assoc_targetClass_ObjectPath(const CMPIBroker* _broker,
                                                                      const CMPIObjectPath* ref,
                                                                      const char* _RefLeftClass,
                                                                      const char* _RefRightClass, CMPIStatus* rc) {
  logEntry(loggerDNSObjFactory, ZV_HERE, " _broker=", _broker, " ref=", ref, " _RefLeftClass=", _RefLeftClass,
           " _RefRightClass=", _RefRightClass, " rc=", rc);
  const char* targetClass = get_assoc_targetClass_Name(_broker, ref, _RefLeftClass, _RefRightClass, rc);
  if (*targetClass == '\0') return nullptr;
  return newHostPath(_broker, nameSpaceOf(ref, rc), targetClass, rc);
}

unsigned short DNSClientObjFactory::getDNSClientCMPIInstanceFromIPInterface(const CMPIBroker* _broker,
                                                                            const CMPIObjectPath* ref,
                                                                            const std::string& interfaceName,
                                                                            CMPIInstance*& instance, bool isObjPath,
                                                                            const char** properties, CMPIStatus* rc) {
  logEntry(loggerDNSObjFactory, ZV_HERE, " _broker=", _broker, " ref=", ref, " interfaceName=", &interfaceName,
           " instance=", instance, " isObjPath=", isObjPath, " properties=", properties, " rc=", rc);
  const auto found = dnsClientMap.find(interfaceName);
  if (found != dnsClientMap.end()) {
    instance = makeDNSClientInstance(_broker, ref, found->second, properties, isObjPath, rc);
  }
  return 0;
}

}  // namespace ZV
