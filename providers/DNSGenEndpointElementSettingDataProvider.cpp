// ZORVA_DNSGenEndPointElementSettingData: the host-wide DNS settings of every endpoint. Instance and association
// provider, all objects come from the factory. Every endpoint has the settings: no key of either end is read.

#include "factory/DNSClientObjFactory.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"

namespace ZV {

static const char* const dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
static const char* const dnsGeneralSettingDataClass = "ZORVA_DNSGeneralSettingData";
// The paths of ReferenceNames have the class of the sibling association, the one for the settings of single endpoints.
static const Association elementSettingData = {"Zorvagent.DNSGenEndpointElementSettingDataProvider",
                                               "ZORVA_DNSGenEndPointElementSettingData",
                                               "ManagedElement",
                                               "SettingData",
                                               newPath,
                                               "ZORVA_DNSEndPointElementSettingData",
                                               kNamesTwoOperations};

// Both references and the flags: 1 here, 2 for the settings of single endpoints.
static void setAll(const CMPIInstance* instance, const CMPIObjectPath* endpoint, const CMPIObjectPath* setting) {
  setPair(instance, elementSettingData, endpoint, setting);
  setUint16(instance, "IsCurrent", 1);
  setUint16(instance, "IsDefault", 1);
}

static unsigned short DNSGenEndpointElementSettingDataCMPIInstances(Operation operation,
                                                                    std::vector<CMPIInstance*>& instances) {
  operation = enter(operation, elementSettingData.category);
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> endpoints;
  if (!fetchEndpoints(operation, factory, operation.ref, endpoints)) {
    return failBuilder(operation, "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames");
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, operation.ref, &settings, &operation.status) != 0) {
    return failAndLeaveBuilder(operation, "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
  }
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  for (CMPIObjectPath* endpoint : counted16(endpoints)) {
    if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Server")) return 1;
    setNameSpace(endpoint, nameSpace);  // its host is not changed
    for (CMPIObjectPath* setting : counted16(settings)) {
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNS Client")) return 1;
      setNameSpaceAndHost(setting, nameSpace);
      CMPIInstance* instance = nullptr;
      if (!newBuilt(operation, elementSettingData, nameSpace,
                    "Create CMPIObjectPath failed for                     DNSGenEndpointElementSettingData.",
                    instance)) {
        return 1;
      }
      if (!isGood(instance)) continue;
      setAll(instance, endpoint, setting);
      instances.push_back(instance);
    }
  }
  markExit(operation);
  return 0;
}

ZV_BUILT_INSTANCES(DNSGenEndpointElementSettingData, elementSettingData, DNSGenEndpointElementSettingDataCMPIInstances)

// Returns each path at once: after a later failure these paths are already delivered, and the result stays open.
static CMPIStatus DNSGenEndpointElementSettingData_EnumInstanceNames(Operation operation) {
  operation = enter(operation, elementSettingData.category);
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> endpoints;
  if (!fetchEndpoints(operation, factory, operation.ref, endpoints)) {
    return fail(operation, "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames");
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, operation.ref, &settings, &operation.status) != 0) {
    return fail(operation,
                "Can't get ObjectPaths for DNSGeneralSettingData.             Exiting EnumerateInstanceNames");
  }
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  for (CMPIObjectPath* endpoint : counted16(endpoints)) {
    if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Server")) return operation.status;
    setNameSpace(endpoint, nameSpace);
    for (CMPIObjectPath* setting : counted16(settings)) {
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNSGeneralSettingData")) return operation.status;
      setNameSpace(setting, nameSpace);  // the host is set only in the builder
      if (!returnPair(operation, elementSettingData, nameSpace,
                      "Create CMPIObjectPath failed for                     DNSGenEndpointElementSettingData Class.",
                      endpoint, setting)) {
        return operation.status;
      }
    }
  }
  return end(operation);
}

template <typename Found>
static CMPIStatus associate(Operation& operation, DNSClientObjFactory& factory, const FarEnd& farEnd) {
  if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(operation.resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) {
      return operation.status;
    }
    std::vector<Found*> endpoints;
    if (!fetchEndpoints(operation, factory, farEnd.path, endpoints)) return operation.status;
    const std::string nameSpace = nameSpaceForPaths<Found>(operation);
    for (Found* endpoint : counted16(endpoints)) returnOnThisHost(operation, endpoint, nameSpace);
  } else if (farEnd.className == dnsGeneralSettingDataClass) {
    if (!passesResultClass(operation.resultClass, dnsGeneralSettingDataClass, "CIM_DNSGeneralSettingData")) {
      return operation.status;
    }
    std::vector<Found*> settings;
    if (!fetchGeneralSettings(operation, operation.ref, settings)) return operation.status;
    returnAll(operation, settings);
  }
  return end(operation);
}

template <typename Found>
static CMPIStatus refer(Operation& operation, DNSClientObjFactory& factory, const ReferenceParts& parts) {
  const auto& [farEnd, nameSpace, association] = parts;
  if (farEnd.className == dnsGeneralSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (!fetchGeneralSettings(operation, farEnd.path, settings)) return operation.status;
    for (CMPIObjectPath* setting : counted16(settings)) {
      setNameSpaceAndHost(setting, nameSpace);
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setAll(reference, operation.ref, setting);
      deliver<Found>(operation, reference, nameSpace);
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    std::vector<CMPIObjectPath*> endpoints;
    if (!fetchEndpoints(operation, factory, farEnd.path, endpoints)) return operation.status;
    for (CMPIObjectPath* endpoint : counted16(endpoints)) {
      setNameSpaceAndHost(endpoint, nameSpace);
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setAll(reference, endpoint, operation.ref);
      deliver<Found>(operation, reference, nameSpace);
    }
  }
  return end(operation);
}

}  // namespace ZV

ZV_ASSOCIATION_PROVIDER(DNSGenEndPointElementSettingDataProvider, DNSGenEndpointElementSettingData, elementSettingData)
