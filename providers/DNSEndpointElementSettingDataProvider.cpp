// ZORVA_DNSEndPointElementSettingData: the DNS settings of each endpoint's own interface. Instance and association
// provider, all objects come from the factory.
//
// An endpoint and a setting data belong together where the InstanceID, split at "%", has the endpoint's name as its
// second part. The enumerations skip an InstanceID with fewer parts; the association operations stop at it.

#include "factory/DNSClientObjFactory.h"
#include "factory/DNSSettingDataObjects.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSEndpointElementSettingData = "Zorvagent.DNSEndpointElementSettingDataProvider";
static const char* const dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
static const char* const dnsSettingDataClass = "ZORVA_DNSSettingData";
static const char* const dnsEndpointElementSettingDataClass = "ZORVA_DNSEndPointElementSettingData";

namespace {

// Both references and the flags: 2 here, 1 for the host-wide settings.
void setAll(const CMPIInstance* instance, const CMPIObjectPath* endpoint, const CMPIObjectPath* setting) {
  setPair(instance, "ManagedElement", endpoint, "SettingData", setting);
  setUint16(instance, "IsCurrent", 2);
  setUint16(instance, "IsDefault", 2);
}

// The interface that an InstanceID names; false if it names none.
bool interfaceOf(const std::string& instanceID, std::string& interfaceName) {
  std::vector<std::string> tokens;
  Tokenize(instanceID, tokens, "%");
  if (tokens.size() < 2) return false;
  interfaceName = tokens[1];
  return true;
}

// The same for an operation that cannot continue without it.
bool requireInterfaceOf(const Operation& operation, const std::string& instanceID, std::string& interfaceName,
                        const Place& place = Place::here()) {
  return interfaceOf(instanceID, interfaceName) ||
         complain(operation, "Incorrect InstanceID in the Source ObjectPath", place);
}

}  // namespace

static unsigned short DNSEndpointElementSettingDataCMPIInstances(const CMPIContext* context, const CMPIObjectPath* ref,
                                                                 const char** properties,
                                                                 std::vector<CMPIInstance*>& instances) {
  Operation operation = ZV_OPERATION(loggerDNSEndpointElementSettingData, context, nullptr, ref);
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> endpoints;
  if (!fetchEndpoints(operation, factory, ref, endpoints)) {
    return failBuilder(operation, "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames");
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSSettingDataCMPIObjectPaths(broker, ref, &settings, &operation.status) != 0) {
    return failAndLeaveBuilder(operation, "getAllDNSSettingDataCMPIObjectPaths failed");
  }
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  for (CMPIObjectPath* endpoint : counted16(endpoints)) {
    if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Server")) return 1;
    setNameSpace(endpoint, nameSpace);  // its host is not changed
    const std::string name = keyText(endpoint, "Name", &operation.status);
    for (CMPIObjectPath* setting : counted16(settings)) {
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNS Client")) return 1;
      std::string interfaceName;
      if (!interfaceOf(keyText(setting, "InstanceID", &operation.status), interfaceName)) continue;
      logValue(operation, "instance_tokens[1]", interfaceName);
      if (interfaceName != name) continue;
      setNameSpaceAndHost(setting, nameSpace);
      CMPIInstance* instance = nullptr;
      if (!newBuilt(operation, nameSpace, dnsEndpointElementSettingDataClass,
                    "Create CMPIObjectPath failed for                     DNSEndpointElementSettingData.", instance)) {
        return 1;
      }
      if (!isGood(instance)) continue;
      setPropertyFilter(instance, properties, {"ManagedElement", "SettingData"});
      setAll(instance, endpoint, setting);
      instances.push_back(instance);
    }
  }
  markExit(operation);
  return 0;
}

// The paths of the built instances: none is returned before all are built.
static CMPIStatus DNSEndpointElementSettingData_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                                  const CMPIResult* result, const CMPIObjectPath* ref) {
  Operation operation = ZV_OPERATION(loggerDNSEndpointElementSettingData, context, result, ref);
  returnPathsOfBuilt(operation, DNSEndpointElementSettingDataCMPIInstances);
  return end(operation);
}

static CMPIStatus DNSEndpointElementSettingData_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                              const CMPIResult* result, const CMPIObjectPath* ref,
                                                              const char** properties) {
  const Operation operation = ZV_OPERATION(loggerDNSEndpointElementSettingData, context, result, ref);
  returnBuilt(operation, DNSEndpointElementSettingDataCMPIInstances, properties);
  return end(operation);
}

static CMPIStatus DNSEndpointElementSettingData_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                            const CMPIResult* result, const CMPIObjectPath* ref,
                                                            const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSEndpointElementSettingData, context, result, ref);
  returnEqualBuilt(operation, DNSEndpointElementSettingDataCMPIInstances, properties);
  return end(operation);
}

static CMPIStatus DNSEndpointElementSettingData_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                            const CMPIResult* result, const CMPIObjectPath* ref,
                                                            const char* assocClass, const char* resultClass,
                                                            const char*, const char*, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSEndpointElementSettingData, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsEndpointElementSettingDataClass),
                                      resultClass, "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  std::string interfaceName;
  if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return operation.status;
    if (!requireInterfaceOf(operation, sourceKey(operation, "InstanceID"), interfaceName)) return operation.status;
    logValue(operation, "instance_tokens[1]", interfaceName);
    std::vector<CMPIInstance*> endpoints;
    if (!fetchEndpoints(operation, factory, farEnd.path, properties, endpoints)) return operation.status;
    for (const CMPIInstance* endpoint : counted16(endpoints)) {
      if (propertyText(endpoint, "Name", &operation.status) == interfaceName) returnInstance(result, endpoint);
    }
  } else if (farEnd.className == dnsSettingDataClass) {
    if (!passesResultClass(resultClass, dnsSettingDataClass, "CIM_DNSSettingData")) return operation.status;
    const std::string name = sourceKey(operation, "Name");
    std::vector<CMPIInstance*> settings;
    if (getAllDNSSettingDataCMPIInstances(broker, ref, properties, &settings, &operation.status) != 0) {
      return fail(operation, "getAllDNSSettingDataCMPIInstances Failed");
    }
    for (const CMPIInstance* setting : counted16(settings)) {
      const std::string instanceID = propertyText(setting, "InstanceID", &operation.status);
      if (!requireInterfaceOf(operation, instanceID, interfaceName)) return operation.status;
      logValue(operation, "instance_tokens[1]", interfaceName);
      if (interfaceName == name) returnInstance(result, setting);
    }
  }
  return end(operation);
}

static CMPIStatus DNSEndpointElementSettingData_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                                const CMPIResult* result, const CMPIObjectPath* ref,
                                                                const char* assocClass, const char* resultClass,
                                                                const char*, const char*) {
  Operation operation = ZV_OPERATION(loggerDNSEndpointElementSettingData, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsEndpointElementSettingDataClass),
                                      resultClass, "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  std::string interfaceName;
  if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return operation.status;
    if (!requireInterfaceOf(operation, sourceKey(operation, "InstanceID"), interfaceName)) return operation.status;
    std::vector<CMPIObjectPath*> endpoints;
    if (!fetchEndpoints(operation, factory, farEnd.path, endpoints)) return operation.status;
    const std::string nameSpace = nameSpaceOf(ref, &operation.status);
    for (CMPIObjectPath* endpoint : counted16(endpoints)) {
      if (keyText(endpoint, "Name", &operation.status) != interfaceName) continue;
      setNameSpaceAndHost(endpoint, nameSpace);
      returnObjectPath(result, endpoint);
    }
  } else if (farEnd.className == dnsSettingDataClass) {
    if (!passesResultClass(resultClass, dnsSettingDataClass, "CIM_DNSSettingData")) return operation.status;
    const std::string name = sourceKey(operation, "Name");
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSSettingDataCMPIObjectPaths(broker, ref, &settings, &operation.status) != 0) {
      return fail(operation, "getAllDNSSettingDataCMPIObjectPaths Failed");
    }
    for (const CMPIObjectPath* setting : counted16(settings)) {
      const std::string instanceID = keyText(setting, "InstanceID", &operation.status);
      if (!requireInterfaceOf(operation, instanceID, interfaceName)) return operation.status;
      if (interfaceName == name) returnObjectPath(result, setting);
    }
  }
  return end(operation);
}

// The references of an endpoint to its settings.
static bool referToSettings(Operation& operation, const ReferenceParts& parts) {
  const std::string name = sourceKey(operation, "Name");
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSSettingDataCMPIObjectPaths(broker, parts.farEnd.path, &settings, &operation.status) != 0) {
    return complain(operation, "getAllDNSSettingDataCMPIObjectPaths Failed");
  }
  for (CMPIObjectPath* setting : counted16(settings)) {
    std::string interfaceName;
    const std::string instanceID = keyText(setting, "InstanceID", &operation.status);
    if (!requireInterfaceOf(operation, instanceID, interfaceName)) return false;
    if (interfaceName != name) continue;
    setNameSpaceAndHost(setting, parts.nameSpace);
    const CMPIInstance* reference = newInstance(broker, parts.association, &operation.status);
    setAll(reference, operation.ref, setting);
    deliverInstance(operation, reference, parts.nameSpace);
  }
  return true;
}

// The names of the references: an instance is made for every candidate, matching or not.
static bool nameSettings(Operation& operation, const ReferenceParts& parts) {
  const std::string name = sourceKey(operation, "Name");
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSSettingDataCMPIObjectPaths(broker, parts.farEnd.path, &settings, &operation.status) != 0) {
    return complain(operation, "getAllDNSSettingDataCMPIObjectPaths Failed");
  }
  for (CMPIObjectPath* setting : counted16(settings)) {
    const CMPIInstance* reference = newInstance(broker, parts.association, &operation.status);
    std::string interfaceName;
    const std::string instanceID = keyText(setting, "InstanceID", &operation.status);
    if (!requireInterfaceOf(operation, instanceID, interfaceName)) return false;
    if (interfaceName != name) continue;
    setNameSpaceAndHost(setting, parts.nameSpace);
    setAll(reference, operation.ref, setting);
    deliverPath(operation, reference, parts.nameSpace);
  }
  return true;
}

using WalkSettings = bool (*)(Operation& operation, const ReferenceParts& parts);

static CMPIStatus refer(Operation operation, WalkSettings walkSettings, Deliver deliver) {
  DNSClientObjFactory factory;
  const ReferenceParts parts =
      resolveReferences(operation, factory, dnsEndpointElementSettingDataClass, newPath,
                        dnsEndpointElementSettingDataClass, "Object Path is NULL in References.");
  const FarEnd& farEnd = parts.farEnd;
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == dnsSettingDataClass) {
    if (!walkSettings(operation, parts)) return operation.status;
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    std::string interfaceName;
    if (!requireInterfaceOf(operation, sourceKey(operation, "InstanceID"), interfaceName)) return operation.status;
    std::vector<CMPIObjectPath*> endpoints;
    if (!fetchEndpoints(operation, factory, farEnd.path, endpoints)) return operation.status;
    for (CMPIObjectPath* endpoint : counted16(endpoints)) {
      if (keyText(endpoint, "Name", &operation.status) != interfaceName) continue;
      setNameSpaceAndHost(endpoint, parts.nameSpace);
      const CMPIInstance* reference = newInstance(broker, parts.association, &operation.status);
      setAll(reference, endpoint, operation.ref);
      deliver(operation, reference, parts.nameSpace);
    }
  }
  return end(operation);
}

static CMPIStatus DNSEndpointElementSettingData_References(CMPIAssociationMI*, const CMPIContext* context,
                                                           const CMPIResult* result, const CMPIObjectPath* ref,
                                                           const char*, const char*, const char**) {
  return refer(ZV_OPERATION(loggerDNSEndpointElementSettingData, context, result, ref), referToSettings,
               deliverInstance);
}

static CMPIStatus DNSEndpointElementSettingData_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                               const CMPIResult* result, const CMPIObjectPath* ref,
                                                               const char*, const char*) {
  return refer(ZV_OPERATION(loggerDNSEndpointElementSettingData, context, result, ref), nameSettings, deliverPath);
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSEndpointElementSettingData)
ZV_REFUSED_MODIFICATION(DNSEndpointElementSettingData)
ZV_ASSOCIATION_CLEANUP(DNSEndpointElementSettingData)

}  // namespace ZV

ZV_INSTANCE_MI(DNSEndPointElementSettingDataProvider, DNSEndpointElementSettingData)
ZV_ASSOCIATION_MI(DNSEndPointElementSettingDataProvider, DNSEndpointElementSettingData)
