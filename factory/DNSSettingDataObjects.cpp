#include "factory/DNSSettingDataObjects.h"

#include "factory/CmpiSupport.h"
#include "factory/DNSClientObjFactory.h"
#include "factory/SettingProperties.h"
#include "trace/Trace.h"

namespace ZV {

static const char* const dnsSettingDataClass = "ZORVA_DNSSettingData";

unsigned short getAllDNSSettingDataCMPIObjectPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                   std::vector<CMPIObjectPath*>* paths, CMPIStatus* status) {
  logEntry(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " paths=", paths, " status=", status);
  for (DNSSettingData data; data; ++data) {
    CMPIObjectPath* path = newHostPath(broker, nameSpaceOf(ref, nullptr), dnsSettingDataClass, nullptr);
    if (!isGood(path)) {
      logError(loggerDNSObjFactory, ZV_HERE, "getAllDNSSettingDataCMPIObjectPaths failed");
      logExit(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " paths=", paths, " status=", status);
      return 1;
    }
    std::string instanceID;
    if (data.getInstanceID(instanceID)) addTextKey(path, "InstanceID", instanceID);
    paths->push_back(path);
  }
  return 0;  // an exit is marked where it fails, and nowhere else
}

namespace {

// False where the broker makes no array.
bool setServerAddresses(const CMPIBroker* broker, const CMPIInstance* instance,
                        const std::vector<std::string>& addresses, const LogSite& site, CMPIStatus* status) {
  const unsigned short count = count16(addresses);
  CMPIArray* array = newArray(broker, count, CMPI_string, status);
  if (array == nullptr) {
    logError(loggerDNSObjFactory, site, "Create Array for Property DNSServerAddresses failed.");
    return false;
  }
  for (unsigned short i = 0; i < count; ++i) {
    CMPIString* address = newString(broker, addresses[i], status);
    if (address != nullptr) setTextElement(array, i, address);
  }
  setArray(instance, "DNSServerAddresses", array, CMPI_stringA);
  return true;
}

// False where the broker makes no array.
bool setDHCPOptions(const CMPIBroker* broker, const CMPIInstance* instance, const std::vector<unsigned short>& options,
                    const LogSite& site, CMPIStatus* status) {
  const unsigned short count = count16(options);
  CMPIArray* array = newArray(broker, count, CMPI_uint16, status);
  if (array == nullptr) {
    logError(loggerDNSObjFactory, site, "Create Array for Property DHCPOptionsToUse failed.");
    return false;
  }
  for (unsigned short i = 0; i < count; ++i) setUint16Element(array, i, options[i]);
  setArray(instance, "DHCPOptionsToUse", array, CMPI_uint16A);
  return true;
}

}  // namespace

CMPIInstance* makeDNSSettingDataInstance(const CMPIBroker* broker, const CMPIObjectPath* ref, DNSSettingData data,
                                         const char** properties, bool isObjPath, CMPIStatus* status) {
  logEntry(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " data=", &data, " properties=", properties,
           " isObjPath=", isObjPath, " status=", status);
  const WantedProperties wanted(properties, isObjPath);

  CMPIObjectPath* path = newHostPath(broker, nameSpaceOf(ref, nullptr), dnsSettingDataClass, nullptr);
  if (!isGood(path)) return nullptr;
  CMPIInstance* instance = newInstance(broker, path, nullptr);
  if (!isGood(instance)) return instance;
  if (!isObjPath) setPropertyFilter(instance, properties, {"InstanceID"});

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
  if (wanted("DNSServerAddresses")) {
    std::vector<std::string> addresses;
    if (data.getDNSServerAddresses(addresses) && !addresses.empty() &&
        !setServerAddresses(broker, instance, addresses, ZV_HERE, status)) {
      return instance;
    }
  }
  if (wanted("DHCPOptionsToUse")) {
    std::vector<unsigned short> options;
    if (data.getDHCPOptionsToUse(options) && !options.empty() &&
        !setDHCPOptions(broker, instance, options, ZV_HERE, status)) {
      return instance;
    }
  }
  logExit(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " data=", &data, " properties=", properties,
          " isObjPath=", isObjPath, " status=", status);
  return instance;
}

unsigned short getOneDNSSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                const char** properties, CMPIInstance** instance, CMPIStatus* status) {
  logEntry(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
           " instance=", instance, " status=", status);
  const std::string key = keyText(ref, "InstanceID", status);
  for (DNSSettingData data; data; ++data) {
    std::string instanceID;
    data.getInstanceID(instanceID);  // of an interface without a name it stays empty, and an empty key finds it
    if (instanceID != key) continue;
    *instance = makeDNSSettingDataInstance(broker, ref, data, properties, false, status);
    return 0;
  }
  logExit(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
          " instance=", instance, " status=", status);
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
