#include "factory/DNSGeneralSettingDataObjects.h"

#include <PlatformUtilities.h>

#include "factory/ClassNames.h"
#include "factory/CmpiSupport.h"
#include "factory/DNSClientObjFactory.h"
#include "factory/SettingProperties.h"
#include "trace/Trace.h"

namespace ZV {

namespace {

std::string generalInstanceID() { return "dnsgen1:" + getSystemName(); }

// False if the broker makes no array.
bool setSuffixes(const CMPIBroker* broker, const CMPIInstance* instance, const std::vector<std::string>& suffixes,
                 const char* function, CMPIStatus* status) {
  return setElements(broker, instance, "DNSSuffixesToAppend", CMPI_string, suffixes, ZV_HERE_IN(function), status,
                     [&](CMPIArray* array, unsigned short i) {
                       logVariable(loggerDNSObjFactory, ZV_HERE_IN(function), "dnsSuf", suffixes[i]);
                       CMPIString* suffix = newString(broker, suffixes[i], status);
                       if (suffix != nullptr) setTextElement(array, i, suffix);
                     });
}

void addInstance(const CMPIBroker* broker, const CMPIObjectPath* ref, const char** properties,
                 std::vector<CMPIInstance*>* instances, CMPIStatus* status) {
  DNSGeneralSettingData data;
  if (data) {
    instances->push_back(makeDNSGeneralSettingDataInstance(broker, ref, data, properties, false, status));
  }
}

}  // namespace

unsigned short getAllDNSGeneralSettingDataCMPIObjectPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                          std::vector<CMPIObjectPath*>* paths, CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " paths=", paths,
                     " status=", status);
  unsigned short failed = 0;
  DNSGeneralSettingData data;
  if (data) {
    CMPIObjectPath* path = newHostPath(broker, nameSpaceOf(ref, nullptr), dnsGeneralSettingDataClass, nullptr);
    if (isGood(path)) {
      addTextKey(path, "InstanceID", generalInstanceID());
      paths->push_back(path);
    } else {
      logError(loggerDNSObjFactory, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
      failed = 1;
    }
  }
  flow.exit();
  return failed;
}

CMPIInstance* makeDNSGeneralSettingDataInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                DNSGeneralSettingData data, const char** properties, bool isObjPath,
                                                CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " data=", &data,
                     " properties=", properties, " isObjPath=", isObjPath, " status=", status);
  const WantedProperties wanted(properties, isObjPath);

  CMPIInstance* instance = newHostInstance(broker, nameSpaceOf(ref, nullptr), dnsGeneralSettingDataClass, properties,
                                           isObjPath, kSettingKeys);
  if (!isGood(instance)) return instance;

  setText(instance, "InstanceID", generalInstanceID());
  setTextIfWanted(instance, wanted, "Caption", data, &DNSGeneralSettingData::getCaption);
  setTextIfWanted(instance, wanted, "Description", data, &DNSGeneralSettingData::getDescription);
  setTextIfWanted(instance, wanted, "ElementName", data, &DNSGeneralSettingData::getElementName);
  if (wanted("ConfigurationName")) {
    std::string configurationName;
    data.getConfigurationName(configurationName);  // without a file the empty text is set
    setText(instance, "ConfigurationName", configurationName);
  }
  setUint16IfWanted(instance, wanted, "AddressOrigin", data, &DNSGeneralSettingData::getAddressOrigin);
  setBooleanIfWanted(instance, wanted, "AppendPrimarySuffixes", data, &DNSGeneralSettingData::getAppendPrimarySuffixes);
  setBooleanIfWanted(instance, wanted, "AppendParentSuffixes", data, &DNSGeneralSettingData::getAppendParentSuffixes);
  if (wanted("DNSSuffixesToAppend")) {
    std::vector<std::string> suffixes;
    if (data.getDNSSuffixesToAppend(suffixes) && !suffixes.empty() &&
        !setSuffixes(broker, instance, suffixes, static_cast<const char*>(__func__), status)) {
      return instance;
    }
  }
  flow.exit();
  return instance;
}

unsigned short getOneDNSGeneralSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                       const char** properties, std::vector<CMPIInstance*>* instances,
                                                       CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
                     " instances=", instances, " status=", status);
  keyText(ref, "InstanceID", status);  // read but not compared: there is only one instance
  addInstance(broker, ref, properties, instances, status);
  flow.exit();
  return 0;
}

unsigned short getAllDNSGeneralSettingDataCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                        const char** properties, std::vector<CMPIInstance*>* instances,
                                                        CMPIStatus* status) {
  const FlowLog flow(loggerDNSObjFactory, ZV_HERE, " broker=", broker, " ref=", ref, " properties=", properties,
                     " instances=", instances, " status=", status);
  addInstance(broker, ref, properties, instances, status);
  flow.exit();
  return 0;
}

}  // namespace ZV
