// ZORVA_DNSGenEndPointElementSettingData: the host-wide DNS settings of every endpoint. Instance and association
// provider, all objects come from the factory. Every endpoint has the settings: no key of either end is read.

#include "factory/DNSClientObjFactory.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSGenEndpointElementSettingData = "Zorvagent.DNSGenEndpointElementSettingDataProvider";
static const char* const dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
static const char* const dnsGeneralSettingDataClass = "ZORVA_DNSGeneralSettingData";
static const char* const dnsEndpointElementSettingDataClass = "ZORVA_DNSEndPointElementSettingData";
static const char* const dnsGenEndpointElementSettingDataClass = "ZORVA_DNSGenEndPointElementSettingData";

// Both references and the flags: 1 here, 2 for the settings of single endpoints.
static void setAll(const CMPIInstance* instance, const CMPIObjectPath* endpoint, const CMPIObjectPath* setting) {
  setPair(instance, "ManagedElement", endpoint, "SettingData", setting);
  setUint16(instance, "IsCurrent", 1);
  setUint16(instance, "IsDefault", 1);
}

static unsigned short DNSGenEndpointElementSettingDataCMPIInstances(const CMPIContext* context,
                                                                    const CMPIObjectPath* ref, const char** properties,
                                                                    std::vector<CMPIInstance*>& instances) {
  Operation operation = ZV_OPERATION(loggerDNSGenEndpointElementSettingData, context, nullptr, ref);
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> endpoints;
  if (!fetchEndpoints(operation, factory, ref, endpoints)) {
    return failBuilder(operation, "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames");
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &operation.status) != 0) {
    return failAndLeaveBuilder(operation, "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
  }
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  for (CMPIObjectPath* endpoint : counted16(endpoints)) {
    if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Server")) return 1;
    setNameSpace(endpoint, nameSpace);  // its host is not changed
    for (CMPIObjectPath* setting : counted16(settings)) {
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNS Client")) return 1;
      setNameSpaceAndHost(setting, nameSpace);
      CMPIInstance* instance = nullptr;
      if (!newBuilt(operation, nameSpace, dnsGenEndpointElementSettingDataClass,
                    "Create CMPIObjectPath failed for                     DNSGenEndpointElementSettingData.",
                    instance)) {
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

// Returns each path at once: after a later failure these paths are already delivered, and the result stays open.
static CMPIStatus DNSGenEndpointElementSettingData_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                                     const CMPIResult* result,
                                                                     const CMPIObjectPath* ref) {
  Operation operation = ZV_OPERATION(loggerDNSGenEndpointElementSettingData, context, result, ref);
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> endpoints;
  if (!fetchEndpoints(operation, factory, ref, endpoints)) {
    return fail(operation, "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames");
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &operation.status) != 0) {
    return fail(operation,
                "Can't get ObjectPaths for DNSGeneralSettingData.             Exiting EnumerateInstanceNames");
  }
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  for (CMPIObjectPath* endpoint : counted16(endpoints)) {
    if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Server")) return operation.status;
    setNameSpace(endpoint, nameSpace);
    for (CMPIObjectPath* setting : counted16(settings)) {
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNSGeneralSettingData")) return operation.status;
      setNameSpace(setting, nameSpace);  // the host is set only in the builder
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsGenEndpointElementSettingDataClass, &operation.status);
      if (isMissing(operation, path,
                    "Create CMPIObjectPath failed for                     DNSGenEndpointElementSettingData Class.")) {
        return operation.status;
      }
      returnPairPath(operation, path, "ManagedElement", endpoint, "SettingData", setting);
    }
  }
  return end(operation);
}

static CMPIStatus DNSGenEndpointElementSettingData_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                                 const CMPIResult* result, const CMPIObjectPath* ref,
                                                                 const char** properties) {
  const Operation operation = ZV_OPERATION(loggerDNSGenEndpointElementSettingData, context, result, ref);
  returnBuilt(operation, DNSGenEndpointElementSettingDataCMPIInstances, properties);
  return end(operation);
}

static CMPIStatus DNSGenEndpointElementSettingData_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                               const CMPIResult* result, const CMPIObjectPath* ref,
                                                               const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSGenEndpointElementSettingData, context, result, ref);
  returnEqualBuilt(operation, DNSGenEndpointElementSettingDataCMPIInstances, properties);
  return end(operation);
}

static CMPIStatus DNSGenEndpointElementSettingData_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                               const CMPIResult* result, const CMPIObjectPath* ref,
                                                               const char* assocClass, const char* resultClass,
                                                               const char*, const char*, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSGenEndpointElementSettingData, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd =
      resolveFarEnd(operation, factory, associationOr(assocClass, dnsGenEndpointElementSettingDataClass), resultClass,
                    "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  std::vector<CMPIInstance*> instances;
  if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return operation.status;
    if (!fetchEndpoints(operation, factory, farEnd.path, properties, instances)) return operation.status;
  } else if (farEnd.className == dnsGeneralSettingDataClass) {
    if (!passesResultClass(resultClass, dnsGeneralSettingDataClass, "CIM_DNSGeneralSettingData")) {
      return operation.status;
    }
    if (getAllDNSGeneralSettingDataCMPIInstances(broker, ref, properties, &instances, &operation.status) != 0) {
      return fail(operation, "getAllDNSGeneralSettingDataCMPIInstances Failed");
    }
  }
  returnAll(result, instances);
  return end(operation);
}

static CMPIStatus DNSGenEndpointElementSettingData_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                                   const CMPIResult* result, const CMPIObjectPath* ref,
                                                                   const char* assocClass, const char* resultClass,
                                                                   const char*, const char*) {
  Operation operation = ZV_OPERATION(loggerDNSGenEndpointElementSettingData, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd =
      resolveFarEnd(operation, factory, associationOr(assocClass, dnsGenEndpointElementSettingDataClass), resultClass,
                    "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return operation.status;
    std::vector<CMPIObjectPath*> endpoints;
    if (!fetchEndpoints(operation, factory, farEnd.path, endpoints)) return operation.status;
    const std::string nameSpace = nameSpaceOf(ref, &operation.status);
    for (CMPIObjectPath* endpoint : counted16(endpoints)) {
      setNameSpaceAndHost(endpoint, nameSpace);
      returnObjectPath(result, endpoint);
    }
  } else if (farEnd.className == dnsGeneralSettingDataClass) {
    if (!passesResultClass(resultClass, dnsGeneralSettingDataClass, "CIM_DNSGeneralSettingData")) {
      return operation.status;
    }
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &operation.status) != 0) {
      return fail(operation, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
    }
    returnAll(result, settings);
  }
  return end(operation);
}

static CMPIStatus refer(Operation operation, const char* madeClass, Deliver deliver) {
  DNSClientObjFactory factory;
  const auto [farEnd, nameSpace, association] =
      resolveReferences(operation, factory, dnsGenEndpointElementSettingDataClass, newPath, madeClass,
                        "Object Path is NULL in References.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == dnsGeneralSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, farEnd.path, &settings, &operation.status) != 0) {
      return fail(operation, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
    }
    for (CMPIObjectPath* setting : counted16(settings)) {
      setNameSpaceAndHost(setting, nameSpace);
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setAll(reference, operation.ref, setting);
      deliver(operation, reference, nameSpace);
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    std::vector<CMPIObjectPath*> endpoints;
    if (!fetchEndpoints(operation, factory, farEnd.path, endpoints)) return operation.status;
    for (CMPIObjectPath* endpoint : counted16(endpoints)) {
      setNameSpaceAndHost(endpoint, nameSpace);
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setAll(reference, endpoint, operation.ref);
      deliver(operation, reference, nameSpace);
    }
  }
  return end(operation);
}

static CMPIStatus DNSGenEndpointElementSettingData_References(CMPIAssociationMI*, const CMPIContext* context,
                                                              const CMPIResult* result, const CMPIObjectPath* ref,
                                                              const char*, const char*, const char**) {
  return refer(ZV_OPERATION(loggerDNSGenEndpointElementSettingData, context, result, ref),
               dnsGenEndpointElementSettingDataClass, deliverInstance);
}

// The paths have the class of the sibling association, the one for the settings of single endpoints.
static CMPIStatus DNSGenEndpointElementSettingData_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                                  const CMPIResult* result, const CMPIObjectPath* ref,
                                                                  const char*, const char*) {
  return refer(ZV_OPERATION(loggerDNSGenEndpointElementSettingData, context, result, ref),
               dnsEndpointElementSettingDataClass, deliverPath);
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSGenEndpointElementSettingData)
ZV_REFUSED_MODIFICATION(DNSGenEndpointElementSettingData)
ZV_ASSOCIATION_CLEANUP(DNSGenEndpointElementSettingData)

}  // namespace ZV

ZV_INSTANCE_MI(DNSGenEndPointElementSettingDataProvider, DNSGenEndpointElementSettingData)
ZV_ASSOCIATION_MI(DNSGenEndPointElementSettingDataProvider, DNSGenEndpointElementSettingData)
