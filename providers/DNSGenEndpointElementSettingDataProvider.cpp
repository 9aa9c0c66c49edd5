// ZORVA_DNSGenEndPointElementSettingData: the host-wide DNS settings of every endpoint. Instance and association
// provider, all objects come from the factory. Every endpoint has the settings: no key of either end is read.

#include "factory/ClassNames.h"
#include "factory/DNSClientObjFactory.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"

namespace ZV {

// The flags: 1 here, 2 for the settings of single endpoints.
static void setFlags(const CMPIInstance* instance) {
  setUint16(instance, "IsCurrent", 1);
  setUint16(instance, "IsDefault", 1);
}

// The paths of ReferenceNames have the class of the sibling association, the one for the settings of single endpoints.
static const Association elementSettingData = {"Zorvagent.DNSGenEndpointElementSettingDataProvider",
                                               dnsGenEndpointElementSettingDataClass,
                                               kPathsWithoutHost,
                                               kElementAndSetting,
                                               setFlags,
                                               dnsEndpointElementSettingDataClass};

static unsigned short DNSGenEndpointElementSettingDataCMPIInstances(Operation operation,
                                                                    std::vector<CMPIInstance*>& instances) {
  operation = enter(operation, elementSettingData.category);
  DNSClientObjFactory factory;
  const auto endpoints = fetchEndpoints<CMPIObjectPath>(operation, factory, operation.ref);
  if (!endpoints) {
    return failBuilder(operation, "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames");
  }
  const auto settings = fetchGeneralSettings<CMPIObjectPath>(operation, operation.ref,
                                                             "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
  if (!settings) return leaveBuilder(operation);
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  for (CMPIObjectPath* endpoint : counted16(*endpoints)) {
    if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Server")) return 1;
    setNameSpace(endpoint, nameSpace);  // its host is not changed
    for (CMPIObjectPath* setting : counted16(*settings)) {
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNS Client")) return 1;
      setNameSpaceAndHost(setting, nameSpace);
      if (!addBuilt(operation, elementSettingData, nameSpace,
                    "Create CMPIObjectPath failed for                     DNSGenEndpointElementSettingData.", endpoint,
                    setting, instances)) {
        return 1;
      }
    }
  }
  return endBuilder(operation);
}

ZV_BUILT_INSTANCES(DNSGenEndpointElementSettingData, elementSettingData, DNSGenEndpointElementSettingDataCMPIInstances)

// Returns each path at once: after a later failure these paths are already delivered, and the result stays open.
static CMPIStatus DNSGenEndpointElementSettingData_EnumInstanceNames(Operation operation) {
  operation = enter(operation, elementSettingData.category);
  DNSClientObjFactory factory;
  const auto endpoints = fetchEndpoints<CMPIObjectPath>(operation, factory, operation.ref);
  if (!endpoints) {
    return fail(operation, "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames");
  }
  const auto settings = fetchGeneralSettings<CMPIObjectPath>(
      operation, operation.ref,
      "Can't get ObjectPaths for DNSGeneralSettingData.             Exiting EnumerateInstanceNames");
  if (!settings) return operation.status;
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  for (CMPIObjectPath* endpoint : counted16(*endpoints)) {
    if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Server")) return operation.status;
    setNameSpace(endpoint, nameSpace);
    for (CMPIObjectPath* setting : counted16(*settings)) {
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
    const auto endpoints = fetchEndpoints<Found>(operation, factory, farEnd.path);
    if (!endpoints) return operation.status;
    const std::string nameSpace = nameSpaceForPaths<Found>(operation);
    for (Found* endpoint : counted16(*endpoints)) returnOnThisHost(operation, endpoint, nameSpace);
  } else if (farEnd.className == dnsGeneralSettingDataClass) {
    if (!returnGeneralSettings<Found>(operation)) return operation.status;
  }
  return end(operation);
}

template <typename Found>
static CMPIStatus refer(Operation& operation, DNSClientObjFactory& factory, const ReferenceParts& parts) {
  const auto& [farEnd, nameSpace, association] = parts;
  if (farEnd.className == dnsGeneralSettingDataClass) {
    const auto settings = fetchGeneralSettings<CMPIObjectPath>(operation, farEnd.path);
    if (!settings) return operation.status;
    for (CMPIObjectPath* setting : counted16(*settings)) {
      setNameSpaceAndHost(setting, nameSpace);
      deliverPair<Found>(operation, elementSettingData, parts, operation.ref, setting);
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    const auto endpoints = fetchEndpoints<CMPIObjectPath>(operation, factory, farEnd.path);
    if (!endpoints) return operation.status;
    for (CMPIObjectPath* endpoint : counted16(*endpoints)) {
      setNameSpaceAndHost(endpoint, nameSpace);
      deliverPair<Found>(operation, elementSettingData, parts, endpoint, operation.ref);
    }
  }
  return end(operation);
}

}  // namespace ZV

ZV_ASSOCIATION_PROVIDER(DNSGenEndPointElementSettingDataProvider, DNSGenEndpointElementSettingData, elementSettingData)
