// ZORVA_DNSGenEndPointElementSettingData: the host-wide DNS settings of every endpoint. Instance and association
// provider, wholly from the factory. Every endpoint goes with the settings: no key of either end is read.
#include "factory/DNSClientObjFactory.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "providers/AssociationSteps.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSGenEndpointElementSettingData = "Zorvagent.DNSGenEndpointElementSettingDataProvider";
static const char* const dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
static const char* const dnsGeneralSettingDataClass = "ZORVA_DNSGeneralSettingData";
static const char* const dnsEndpointElementSettingDataClass = "ZORVA_DNSEndPointElementSettingData";
static const char* const dnsGenEndpointElementSettingDataClass = "ZORVA_DNSGenEndPointElementSettingData";

// 1, where the settings of single endpoints have 2.
static void setFlags(const CMPIInstance* instance) {
  setUint16(instance, "IsCurrent", 1);
  setUint16(instance, "IsDefault", 1);
}

static unsigned short DNSGenEndpointElementSettingDataCMPIInstances(const CMPIObjectPath* ref, const char** properties,
                                                                    const CMPIContext*,
                                                                    std::vector<CMPIInstance*>& instances) {
  ZV_PROVIDER_ENTRY(loggerDNSGenEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> endpoints;
  endpoints.reserve(factory.getNumberOfDNSClientInstances());
  if (factory.getAllDNSClientCMPIObjPaths(broker, ref, endpoints, &status) != 0) {
    logError(loggerDNSGenEndpointElementSettingData, ZV_HERE,
             "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames");
    return 1;
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
    logError(loggerDNSGenEndpointElementSettingData, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
    ZV_PROVIDER_EXIT(loggerDNSGenEndpointElementSettingData);
    return 1;
  }
  const std::string nameSpace = nameSpaceOf(ref, &status);
  for (unsigned short e = 0; e < count16(endpoints); ++e) {
    CMPIObjectPath* endpoint = endpoints.at(e);
    if (isMissing(endpoint, loggerDNSGenEndpointElementSettingData, ZV_HERE, "CMPIObjectPath is NULL for DNS Server")) {
      return 1;  // the text says Server in the endpoints' loop, and Client in that of the settings
    }
    setNameSpace(endpoint, nameSpace);  // its host stays as it came
    for (unsigned short s = 0; s < count16(settings); ++s) {
      CMPIObjectPath* setting = settings.at(s);
      if (isMissing(setting, loggerDNSGenEndpointElementSettingData, ZV_HERE,
                    "CMPIObjectPath is NULL for DNS Client")) {
        return 1;
      }
      setNameSpaceAndHost(setting, nameSpace);
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsGenEndpointElementSettingDataClass, &status);
      if (isMissing(path, loggerDNSGenEndpointElementSettingData, ZV_HERE,
                    "Create CMPIObjectPath failed for                     DNSGenEndpointElementSettingData.")) {
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
  ZV_PROVIDER_EXIT(loggerDNSGenEndpointElementSettingData);
  return 0;
}

// Delivers each path at once: a failure further on leaves what went out, and the result open.
static CMPIStatus DNSGenEndpointElementSettingData_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext*,
                                                                     const CMPIResult* result,
                                                                     const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSGenEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> endpoints;
  endpoints.reserve(factory.getNumberOfDNSClientInstances());
  if (factory.getAllDNSClientCMPIObjPaths(broker, ref, endpoints, &status) != 0) {
    logError(loggerDNSGenEndpointElementSettingData, ZV_HERE,
             "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames");
    return status;
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
    logError(loggerDNSGenEndpointElementSettingData, ZV_HERE,
             "Can't get ObjectPaths for DNSGeneralSettingData.             Exiting EnumerateInstanceNames");
    return status;
  }
  const std::string nameSpace = nameSpaceOf(ref, &status);
  for (unsigned short e = 0; e < count16(endpoints); ++e) {
    CMPIObjectPath* endpoint = endpoints.at(e);
    if (isMissing(endpoint, loggerDNSGenEndpointElementSettingData, ZV_HERE, "CMPIObjectPath is NULL for DNS Server")) {
      return status;
    }
    setNameSpace(endpoint, nameSpace);
    for (unsigned short s = 0; s < count16(settings); ++s) {
      CMPIObjectPath* setting = settings.at(s);
      if (isMissing(setting, loggerDNSGenEndpointElementSettingData, ZV_HERE,
                    "CMPIObjectPath is NULL for DNSGeneralSettingData")) {
        return status;
      }
      setNameSpace(setting, nameSpace);  // no host, unlike in the builder
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsGenEndpointElementSettingDataClass, &status);
      if (isMissing(path, loggerDNSGenEndpointElementSettingData, ZV_HERE,
                    "Create CMPIObjectPath failed for                     DNSGenEndpointElementSettingData Class.")) {
        return status;
      }
      addReferenceKey(path, "ManagedElement", endpoint);
      addReferenceKey(path, "SettingData", setting);
      returnObjectPath(result, path);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGenEndpointElementSettingData);
  return status;
}

static CMPIStatus DNSGenEndpointElementSettingData_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                                 const CMPIResult* result, const CMPIObjectPath* ref,
                                                                 const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGenEndpointElementSettingData);
  std::vector<CMPIInstance*> instances;
  if (DNSGenEndpointElementSettingDataCMPIInstances(ref, properties, context, instances) == 0) {
    returnAll(result, instances);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGenEndpointElementSettingData);
  return kStatusOk;
}

static CMPIStatus DNSGenEndpointElementSettingData_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                               const CMPIResult* result, const CMPIObjectPath* ref,
                                                               const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGenEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (keyCountOf(ref, &status) == 0) {
    logError(loggerDNSGenEndpointElementSettingData, ZV_HERE, "At least one key should be passed");
  } else if (DNSGenEndpointElementSettingDataCMPIInstances(ref, properties, context, instances) == 0) {
    returnFirstEqual(result, ref, instances, true, &status);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGenEndpointElementSettingData);
  return status;
}

static CMPIStatus DNSGenEndpointElementSettingData_Associators(CMPIAssociationMI*, const CMPIContext*,
                                                               const CMPIResult* result, const CMPIObjectPath* ref,
                                                               const char* assocClass, const char* resultClass,
                                                               const char*, const char*, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGenEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsGenEndpointElementSettingDataClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSGenEndpointElementSettingData, ZV_HERE, "Object Path is NULL in Associators.")) {
    return status;
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  std::vector<CMPIInstance*> instances;
  if (farEndClass == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return status;
    instances.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIInstances(broker, farEnd, properties, false, instances, &status) != 0) {
      return status;  // without a word of its own
    }
  } else if (farEndClass == dnsGeneralSettingDataClass) {
    if (!passesResultClass(resultClass, dnsGeneralSettingDataClass, "CIM_DNSGeneralSettingData")) return status;
    if (getAllDNSGeneralSettingDataCMPIInstances(broker, ref, properties, &instances, &status) != 0) {
      logError(loggerDNSGenEndpointElementSettingData, ZV_HERE, "getAllDNSGeneralSettingDataCMPIInstances Failed");
      return status;
    }
  }
  returnAll(result, instances);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGenEndpointElementSettingData);
  return status;
}

static CMPIStatus DNSGenEndpointElementSettingData_AssociatorNames(CMPIAssociationMI*, const CMPIContext*,
                                                                   const CMPIResult* result, const CMPIObjectPath* ref,
                                                                   const char* assocClass, const char* resultClass,
                                                                   const char*, const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSGenEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsGenEndpointElementSettingDataClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSGenEndpointElementSettingData, ZV_HERE, "Object Path is NULL in Associators.")) {
    return status;  // the text of the associators
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return status;
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, endpoints, &status) != 0) return status;
    const std::string nameSpace = nameSpaceOf(ref, &status);
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      setNameSpaceAndHost(endpoints.at(i), nameSpace);
      returnObjectPath(result, endpoints.at(i));
    }
  } else if (farEndClass == dnsGeneralSettingDataClass) {
    if (!passesResultClass(resultClass, dnsGeneralSettingDataClass, "CIM_DNSGeneralSettingData")) return status;
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
      logError(loggerDNSGenEndpointElementSettingData, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
      return status;
    }
    returnAll(result, settings);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGenEndpointElementSettingData);
  return status;
}

static CMPIStatus DNSGenEndpointElementSettingData_References(CMPIAssociationMI*, const CMPIContext*,
                                                              const CMPIResult* result, const CMPIObjectPath* ref,
                                                              const char*, const char*, const char**) {
  ZV_PROVIDER_ENTRY(loggerDNSGenEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsGenEndpointElementSettingDataClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newPath(broker, nameSpace, dnsGenEndpointElementSettingDataClass, &status);  // no host
  if (isMissing(farEnd, loggerDNSGenEndpointElementSettingData, ZV_HERE, "Object Path is NULL in References.")) {
    return status;
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == dnsGeneralSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, farEnd, &settings, &status) != 0) {
      logError(loggerDNSGenEndpointElementSettingData, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      setNameSpaceAndHost(settings.at(i), nameSpace);
      CMPIInstance* reference =
          newPair(broker, association, "ManagedElement", ref, "SettingData", settings.at(i), &status);
      setFlags(reference);
      returnInstance(result, reference);
    }
  } else if (farEndClass == dnsProtocolEndPointClass) {
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, endpoints, &status) != 0) return status;
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      setNameSpaceAndHost(endpoints.at(i), nameSpace);
      CMPIInstance* reference =
          newPair(broker, association, "ManagedElement", endpoints.at(i), "SettingData", ref, &status);
      setFlags(reference);
      returnInstance(result, reference);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGenEndpointElementSettingData);
  return status;
}

// The paths that go out are of the sister association's class, the one of single endpoints' settings.
static CMPIStatus DNSGenEndpointElementSettingData_ReferenceNames(CMPIAssociationMI*, const CMPIContext*,
                                                                  const CMPIResult* result, const CMPIObjectPath* ref,
                                                                  const char*, const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSGenEndpointElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsGenEndpointElementSettingDataClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newPath(broker, nameSpace, dnsEndpointElementSettingDataClass, &status);
  if (isMissing(farEnd, loggerDNSGenEndpointElementSettingData, ZV_HERE, "Object Path is NULL in References.")) {
    return status;  // the text of the references
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == dnsGeneralSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, farEnd, &settings, &status) != 0) {
      logError(loggerDNSGenEndpointElementSettingData, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      setNameSpaceAndHost(settings.at(i), nameSpace);
      CMPIInstance* reference =
          newPair(broker, association, "ManagedElement", ref, "SettingData", settings.at(i), &status);
      setFlags(reference);
      CMPIObjectPath* path = objectPathOf(reference, &status);
      setNameSpace(path, nameSpace);
      returnObjectPath(result, path);
    }
  } else if (farEndClass == dnsProtocolEndPointClass) {
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, endpoints, &status) != 0) return status;
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      setNameSpaceAndHost(endpoints.at(i), nameSpace);
      CMPIInstance* reference =
          newPair(broker, association, "ManagedElement", endpoints.at(i), "SettingData", ref, &status);
      setFlags(reference);
      CMPIObjectPath* path = objectPathOf(reference, &status);
      setNameSpace(path, nameSpace);
      returnObjectPath(result, path);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGenEndpointElementSettingData);
  return status;
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSGenEndpointElementSettingData)
ZV_REFUSED_MODIFICATION(DNSGenEndpointElementSettingData)
ZV_ASSOCIATION_CLEANUP(DNSGenEndpointElementSettingData)

}  // namespace ZV

ZV_INSTANCE_MI(DNSGenEndPointElementSettingDataProvider, DNSGenEndpointElementSettingData)
ZV_ASSOCIATION_MI(DNSGenEndPointElementSettingDataProvider, DNSGenEndpointElementSettingData)
