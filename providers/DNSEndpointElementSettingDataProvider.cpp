// ZORVA_DNSEndPointElementSettingData: the DNS settings of each endpoint's own interface. Instance and association
// provider, wholly from the factory.
//
// An endpoint and a setting data belong together where the InstanceID, split at "%", has the endpoint's name as its
// second part. An InstanceID of fewer parts is passed over in the enumerations; the association operations stop at it.
#include "factory/DNSClientObjFactory.h"
#include "factory/DNSSettingDataObjects.h"
#include "providers/AssociationSteps.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSEndpointElementSettingData = "Zorvagent.DNSEndpointElementSettingDataProvider";
static const char* const dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
static const char* const dnsSettingDataClass = "ZORVA_DNSSettingData";
static const char* const dnsEndpointElementSettingDataClass = "ZORVA_DNSEndPointElementSettingData";

namespace {

// 2, where the host-wide settings have 1.
void setFlags(const CMPIInstance* instance) {
  setUint16(instance, "IsCurrent", 2);
  setUint16(instance, "IsDefault", 2);
}

// The interface that an InstanceID names; false where it names none.
bool interfaceOf(const std::string& instanceID, std::string& interfaceName) {
  std::vector<std::string> tokens;
  Tokenize(instanceID, tokens, "%");
  if (tokens.size() < 2) return false;
  interfaceName = tokens[1];
  return true;
}

// The same for an operation that cannot go on without it.
bool requireInterfaceOf(const std::string& instanceID, std::string& interfaceName, const LogSite& site) {
  if (interfaceOf(instanceID, interfaceName)) return true;
  logError(loggerDNSEndpointElementSettingData, site, "Incorrect InstanceID in the Source ObjectPath");
  return false;
}

}  // namespace

static unsigned short DNSEndpointElementSettingDataCMPIInstances(const CMPIObjectPath* ref, const char** properties,
                                                                 const CMPIContext*,
                                                                 std::vector<CMPIInstance*>& instances) {
  ZV_PROVIDER_ENTRY(loggerDNSEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> endpoints;
  endpoints.reserve(factory.getNumberOfDNSClientInstances());
  if (factory.getAllDNSClientCMPIObjPaths(broker, ref, endpoints, &status) != 0) {
    logError(loggerDNSEndpointElementSettingData, ZV_HERE,
             "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames");
    return 1;
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
    logError(loggerDNSEndpointElementSettingData, ZV_HERE, "getAllDNSSettingDataCMPIObjectPaths failed");
    ZV_PROVIDER_EXIT(loggerDNSEndpointElementSettingData);
    return 1;
  }
  const std::string nameSpace = nameSpaceOf(ref, &status);
  for (unsigned short e = 0; e < count16(endpoints); ++e) {
    CMPIObjectPath* endpoint = endpoints.at(e);
    if (isMissing(endpoint, loggerDNSEndpointElementSettingData, ZV_HERE, "CMPIObjectPath is NULL for DNS Server")) {
      return 1;  // the text says Server in the endpoints' loop, and Client in that of the settings
    }
    setNameSpace(endpoint, nameSpace);  // its host stays as it came
    const std::string name = keyText(endpoint, "Name", &status);
    for (unsigned short s = 0; s < count16(settings); ++s) {
      CMPIObjectPath* setting = settings.at(s);
      if (isMissing(setting, loggerDNSEndpointElementSettingData, ZV_HERE, "CMPIObjectPath is NULL for DNS Client")) {
        return 1;
      }
      std::string interfaceName;
      if (!interfaceOf(keyText(setting, "InstanceID", &status), interfaceName)) continue;
      logVariable(loggerDNSEndpointElementSettingData, ZV_HERE, "instance_tokens[1]", interfaceName);
      if (interfaceName != name) continue;
      setNameSpaceAndHost(setting, nameSpace);
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsEndpointElementSettingDataClass, &status);
      if (isMissing(path, loggerDNSEndpointElementSettingData, ZV_HERE,
                    "Create CMPIObjectPath failed for                     DNSEndpointElementSettingData.")) {
        return 1;
      }
      CMPIInstance* instance = newInstance(broker, path, nullptr);
      if (!isGood(instance)) continue;
      setPropertyFilter(instance, properties, {"ManagedElement", "SettingData"});
      setReference(instance, "ManagedElement", endpoint);
      setReference(instance, "SettingData", setting);
      setFlags(instance);
      instances.push_back(instance);
    }
  }
  ZV_PROVIDER_EXIT(loggerDNSEndpointElementSettingData);
  return 0;
}

// Unlike most siblings by way of the builder: nothing goes out before all is built.
static CMPIStatus DNSEndpointElementSettingData_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                                  const CMPIResult* result, const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (DNSEndpointElementSettingDataCMPIInstances(ref, nullptr, context, instances) == 0) {
    returnPathsOf(result, instances, &status);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSEndpointElementSettingData);
  return status;
}

static CMPIStatus DNSEndpointElementSettingData_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                              const CMPIResult* result, const CMPIObjectPath* ref,
                                                              const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSEndpointElementSettingData);
  std::vector<CMPIInstance*> instances;
  if (DNSEndpointElementSettingDataCMPIInstances(ref, properties, context, instances) == 0) {
    returnAll(result, instances);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSEndpointElementSettingData);
  return kStatusOk;
}

static CMPIStatus DNSEndpointElementSettingData_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                            const CMPIResult* result, const CMPIObjectPath* ref,
                                                            const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (keyCountOf(ref, &status) == 0) {
    logError(loggerDNSEndpointElementSettingData, ZV_HERE, "At least one key should be passed");
  } else if (DNSEndpointElementSettingDataCMPIInstances(ref, properties, context, instances) == 0) {
    returnFirstEqual(result, ref, instances, true, &status);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSEndpointElementSettingData);
  return status;
}

static CMPIStatus DNSEndpointElementSettingData_Associators(CMPIAssociationMI*, const CMPIContext*,
                                                            const CMPIResult* result, const CMPIObjectPath* ref,
                                                            const char* assocClass, const char* resultClass,
                                                            const char*, const char*, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsEndpointElementSettingDataClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSEndpointElementSettingData, ZV_HERE, "Object Path is NULL in Associators.")) {
    return status;
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  std::string interfaceName;
  if (farEndClass == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return status;
    if (!requireInterfaceOf(keyText(ref, "InstanceID", &status), interfaceName, ZV_HERE)) return status;
    logVariable(loggerDNSEndpointElementSettingData, ZV_HERE, "instance_tokens[1]", interfaceName);
    std::vector<CMPIInstance*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIInstances(broker, farEnd, properties, false, endpoints, &status) != 0) {
      return status;  // without a word of its own
    }
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      const CMPIInstance* endpoint = endpoints.at(i);
      if (propertyText(endpoint, "Name", &status) == interfaceName) returnInstance(result, endpoint);
    }
  } else if (farEndClass == dnsSettingDataClass) {
    if (!passesResultClass(resultClass, dnsSettingDataClass, "CIM_DNSSettingData")) return status;
    const std::string name = keyText(ref, "Name", &status);
    std::vector<CMPIInstance*> settings;
    if (getAllDNSSettingDataCMPIInstances(broker, ref, properties, &settings, &status) != 0) {
      logError(loggerDNSEndpointElementSettingData, ZV_HERE, "getAllDNSSettingDataCMPIInstances Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      const CMPIInstance* setting = settings.at(i);
      if (!requireInterfaceOf(propertyText(setting, "InstanceID", &status), interfaceName, ZV_HERE)) return status;
      logVariable(loggerDNSEndpointElementSettingData, ZV_HERE, "instance_tokens[1]", interfaceName);
      if (interfaceName == name) returnInstance(result, setting);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSEndpointElementSettingData);
  return status;
}

static CMPIStatus DNSEndpointElementSettingData_AssociatorNames(CMPIAssociationMI*, const CMPIContext*,
                                                                const CMPIResult* result, const CMPIObjectPath* ref,
                                                                const char* assocClass, const char* resultClass,
                                                                const char*, const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsEndpointElementSettingDataClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSEndpointElementSettingData, ZV_HERE, "Object Path is NULL in Associators.")) {
    return status;  // the text of the associators
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  std::string interfaceName;
  if (farEndClass == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return status;
    if (!requireInterfaceOf(keyText(ref, "InstanceID", &status), interfaceName, ZV_HERE)) return status;
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, endpoints, &status) != 0) return status;
    const std::string nameSpace = nameSpaceOf(ref, &status);
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      CMPIObjectPath* endpoint = endpoints.at(i);
      if (keyText(endpoint, "Name", &status) != interfaceName) continue;
      setNameSpaceAndHost(endpoint, nameSpace);
      returnObjectPath(result, endpoint);
    }
  } else if (farEndClass == dnsSettingDataClass) {
    if (!passesResultClass(resultClass, dnsSettingDataClass, "CIM_DNSSettingData")) return status;
    const std::string name = keyText(ref, "Name", &status);
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
      logError(loggerDNSEndpointElementSettingData, ZV_HERE, "getAllDNSSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      CMPIObjectPath* setting = settings.at(i);
      if (!requireInterfaceOf(keyText(setting, "InstanceID", &status), interfaceName, ZV_HERE)) return status;
      if (interfaceName == name) returnObjectPath(result, setting);  // as it came
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSEndpointElementSettingData);
  return status;
}

static CMPIStatus DNSEndpointElementSettingData_References(CMPIAssociationMI*, const CMPIContext*,
                                                           const CMPIResult* result, const CMPIObjectPath* ref,
                                                           const char*, const char*, const char**) {
  ZV_PROVIDER_ENTRY(loggerDNSEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsEndpointElementSettingDataClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newPath(broker, nameSpace, dnsEndpointElementSettingDataClass, &status);  // no host
  if (isMissing(farEnd, loggerDNSEndpointElementSettingData, ZV_HERE, "Object Path is NULL in References.")) {
    return status;
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  std::string interfaceName;
  if (farEndClass == dnsSettingDataClass) {
    const std::string name = keyText(ref, "Name", &status);
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSSettingDataCMPIObjectPaths(broker, farEnd, &settings, &status) != 0) {
      logError(loggerDNSEndpointElementSettingData, ZV_HERE, "getAllDNSSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      CMPIObjectPath* setting = settings.at(i);
      if (!requireInterfaceOf(keyText(setting, "InstanceID", &status), interfaceName, ZV_HERE)) return status;
      if (interfaceName != name) continue;
      setNameSpaceAndHost(setting, nameSpace);
      CMPIInstance* reference = newPair(broker, association, "ManagedElement", ref, "SettingData", setting, &status);
      setFlags(reference);
      returnInstance(result, reference);
    }
  } else if (farEndClass == dnsProtocolEndPointClass) {
    if (!requireInterfaceOf(keyText(ref, "InstanceID", &status), interfaceName, ZV_HERE)) return status;
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, endpoints, &status) != 0) return status;
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      CMPIObjectPath* endpoint = endpoints.at(i);
      if (keyText(endpoint, "Name", &status) != interfaceName) continue;
      setNameSpaceAndHost(endpoint, nameSpace);
      CMPIInstance* reference = newPair(broker, association, "ManagedElement", endpoint, "SettingData", ref, &status);
      setFlags(reference);
      returnInstance(result, reference);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSEndpointElementSettingData);
  return status;
}

static CMPIStatus DNSEndpointElementSettingData_ReferenceNames(CMPIAssociationMI*, const CMPIContext*,
                                                               const CMPIResult* result, const CMPIObjectPath* ref,
                                                               const char*, const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsEndpointElementSettingDataClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newPath(broker, nameSpace, dnsEndpointElementSettingDataClass, &status);
  if (isMissing(farEnd, loggerDNSEndpointElementSettingData, ZV_HERE, "Object Path is NULL in References.")) {
    return status;  // the text of the references
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  std::string interfaceName;
  if (farEndClass == dnsSettingDataClass) {
    const std::string name = keyText(ref, "Name", &status);
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSSettingDataCMPIObjectPaths(broker, farEnd, &settings, &status) != 0) {
      logError(loggerDNSEndpointElementSettingData, ZV_HERE, "getAllDNSSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      CMPIObjectPath* setting = settings.at(i);
      CMPIInstance* reference = newInstance(broker, association, &status);  // for every candidate, matched or not
      if (!requireInterfaceOf(keyText(setting, "InstanceID", &status), interfaceName, ZV_HERE)) return status;
      if (interfaceName != name) continue;
      setNameSpaceAndHost(setting, nameSpace);
      setReference(reference, "ManagedElement", ref);
      setReference(reference, "SettingData", setting);
      setFlags(reference);
      CMPIObjectPath* path = objectPathOf(reference, &status);
      setNameSpace(path, nameSpace);
      returnObjectPath(result, path);
    }
  } else if (farEndClass == dnsProtocolEndPointClass) {
    if (!requireInterfaceOf(keyText(ref, "InstanceID", &status), interfaceName, ZV_HERE)) return status;
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, endpoints, &status) != 0) return status;
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      CMPIObjectPath* endpoint = endpoints.at(i);
      if (keyText(endpoint, "Name", &status) != interfaceName) continue;
      setNameSpaceAndHost(endpoint, nameSpace);
      CMPIInstance* reference = newPair(broker, association, "ManagedElement", endpoint, "SettingData", ref, &status);
      setFlags(reference);
      CMPIObjectPath* path = objectPathOf(reference, &status);
      setNameSpace(path, nameSpace);
      returnObjectPath(result, path);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSEndpointElementSettingData);
  return status;
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSEndpointElementSettingData)
ZV_REFUSED_MODIFICATION(DNSEndpointElementSettingData)
ZV_ASSOCIATION_CLEANUP(DNSEndpointElementSettingData)

}  // namespace ZV

ZV_INSTANCE_MI(DNSEndPointElementSettingDataProvider, DNSEndpointElementSettingData)
ZV_ASSOCIATION_MI(DNSEndPointElementSettingDataProvider, DNSEndpointElementSettingData)
