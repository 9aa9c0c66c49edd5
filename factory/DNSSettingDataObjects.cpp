#include "factory/DNSSettingDataObjects.h"

#include "factory/ClassNames.h"
#include "factory/CmpiSupport.h"
#include "factory/DNSClientObjFactory.h"
#include "factory/SettingProperties.h"
#include "trace/Trace.h"

namespace ZV {

unsigned short getAllDNSSettingDataCMPIObjectPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                   std::vector<CMPIObjectPath*>* paths, CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " paths=", paths,
                     " status=", status);
  for (DNSSettingData data; data; ++data) {
    CMPIObjectPath* path = newHostPath(broker, nameSpaceOf(ref, nullptr), dnsSettingDataClass, nullptr);
    if (!isGood(path)) {
      logError(loggerDNSObjFactory, ZV_HERE, "getAllDNSSettingDataCMPIObjectPaths failed");
      flow.exit();
      return 1;
    }
    std::string instanceID;
    if (data.getInstanceID(instanceID)) addTextKey(path, "InstanceID", instanceID);
    paths->push_back(path);
  }
  return 0;
}

namespace {

void setPlainProperties(const CMPIInstance* instance, const WantedProperties& wanted, DNSSettingData& data) {
  std::string instanceID;
  if (data.getInstanceID(instanceID)) setText(instance, "InstanceID", instanceID);
  setTextIfWanted(instance, wanted, "Caption", data, &DNSSettingData::getCaption);
  setTextIfWanted(instance, wanted, "Description", data, &DNSSettingData::getDescription);
  setTextIfWanted(instance, wanted, "ElementName", data, &DNSSettingData::getElementName);
  setUint16IfWanted(instance, wanted, "AddressOrigin", data, &DNSSettingData::getAddressOrigin);
  setTextIfWanted(instance, wanted, "DomainName", data, &DNSSettingData::getDomainName);
  setTextIfWanted(instance, wanted, "RequestedHostname", data, &DNSSettingData::getRequestedHostname);
  if (wanted("ConfigurationName")) {
    std::string configurationName;
    data.getConfigurationName(configurationName);  // without a file the empty text is set
    setText(instance, "ConfigurationName", configurationName);
  }
  setBooleanIfWanted(instance, wanted, "UseSuffixWhenRegistering", data, &DNSSettingData::getUseSuffixWhenRegistering);
  setBooleanIfWanted(instance, wanted, "RegisterThisConnectionsAddress", data,
                     &DNSSettingData::getRegisterThisConnectionsAddress);
}

// False if the broker makes no array.
bool setServerAddresses(const CMPIBroker* broker, const CMPIInstance* instance, DNSSettingData& data,
                        const char* function, CMPIStatus* status) {
  std::vector<std::string> addresses;
  if (!data.getDNSServerAddresses(addresses) || addresses.empty()) return true;
  return setElements(broker, instance, "DNSServerAddresses", CMPI_string, addresses, ZV_HERE_IN(function), status,
                     [&](CMPIArray* array, unsigned short i) {
                       CMPIString* address = newString(broker, addresses[i], status);
                       if (address != nullptr) setTextElement(array, i, address);
                     });
}

// False if the broker makes no array.
bool setDHCPOptions(const CMPIBroker* broker, const CMPIInstance* instance, DNSSettingData& data, const char* function,
                    CMPIStatus* status) {
  std::vector<unsigned short> options;
  if (!data.getDHCPOptionsToUse(options) || options.empty()) return true;
  return setElements(broker, instance, "DHCPOptionsToUse", CMPI_uint16, options, ZV_HERE_IN(function), status,
                     [&](CMPIArray* array, unsigned short i) { setUint16Element(array, i, options[i]); });
}

}  // namespace

CMPIInstance* makeDNSSettingDataInstance(const CMPIBroker* broker, const CMPIObjectPath* ref, DNSSettingData data,
                                         const char** properties, bool isObjPath, CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " data=", &data,
                     " properties=", properties, " isObjPath=", isObjPath, " status=", status);
  const WantedProperties wanted(properties, isObjPath);

  CMPIInstance* instance =
      newHostInstance(broker, nameSpaceOf(ref, nullptr), dnsSettingDataClass, properties, isObjPath, kSettingKeys);
  if (!isGood(instance)) return instance;

  setPlainProperties(instance, wanted, data);
  const char* function = static_cast<const char*>(__func__);
  if (wanted("DNSServerAddresses") && !setServerAddresses(broker, instance, data, function, status)) return instance;
  if (wanted("DHCPOptionsToUse") && !setDHCPOptions(broker, instance, data, function, status)) return instance;
  flow.exit();
  return instance;
}

unsigned short getOneDNSSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                const char** properties, CMPIInstance** instance, CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
                     " instance=", instance, " status=", status);
  const std::string key = keyText(ref, "InstanceID", status);
  for (DNSSettingData data; data; ++data) {
    std::string instanceID;
    data.getInstanceID(
        instanceID);  // it stays empty for an interface without a name; an empty key finds such an interface
    if (instanceID != key) continue;
    *instance = makeDNSSettingDataInstance(broker, ref, data, properties, false, status);
    return 0;
  }
  flow.exit();
  return 1;
}

unsigned short getAllDNSSettingDataCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                 const char** properties, std::vector<CMPIInstance*>* instances,
                                                 CMPIStatus* status) {
  logEntry(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
           " instances=", instances, " status=", status);
  for (DNSSettingData data; data; ++data) {
    instances->push_back(makeDNSSettingDataInstance(broker, ref, data, properties, false, status));
  }
  return 0;
}

}  // namespace ZV
