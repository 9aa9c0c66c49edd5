// ZORVA_DNSEndPointElementSettingData: the DNS settings of each endpoint's own interface. Instance and association
// provider, all objects come from the factory.
//
// An endpoint and a setting data belong together where the InstanceID, split at "%", has the endpoint's name as its
// second part. The enumerations skip an InstanceID with fewer parts; the association operations stop at it.

#include "factory/ClassNames.h"
#include "factory/DNSClientObjFactory.h"
#include "factory/DNSSettingDataObjects.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"

namespace ZV {

// The flags: 2 here, 1 for the host-wide settings.
static void setFlags(const CMPIInstance* instance) {
  setUint16(instance, "IsCurrent", 2);
  setUint16(instance, "IsDefault", 2);
}

static const Association elementSettingData = {"Zorvagent.DNSEndpointElementSettingDataProvider",
                                               dnsEndpointElementSettingDataClass, kPathsWithoutHost,
                                               kElementAndSetting, setFlags};

namespace {

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

static unsigned short DNSEndpointElementSettingDataCMPIInstances(Operation operation,
                                                                 std::vector<CMPIInstance*>& instances) {
  operation = enter(operation, elementSettingData.category);
  DNSClientObjFactory factory;
  const auto endpoints = fetchEndpoints<CMPIObjectPath>(operation, factory, operation.ref);
  if (!endpoints) {
    return failBuilder(operation, "Can't get ObjectPaths for DNSClient.             Exiting EnumerateInstanceNames");
  }
  const auto settings =
      fetchSettings<CMPIObjectPath>(operation, operation.ref, "getAllDNSSettingDataCMPIObjectPaths failed");
  if (!settings) return leaveBuilder(operation);
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  for (CMPIObjectPath* endpoint : counted16(*endpoints)) {
    if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Server")) return 1;
    setNameSpace(endpoint, nameSpace);  // its host is not changed
    const std::string name = keyText(endpoint, "Name", &operation.status);
    for (CMPIObjectPath* setting : counted16(*settings)) {
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNS Client")) return 1;
      std::string interfaceName;
      if (!interfaceOf(keyText(setting, "InstanceID", &operation.status), interfaceName)) continue;
      logValue(operation, "instance_tokens[1]", interfaceName);
      if (interfaceName != name) continue;
      setNameSpaceAndHost(setting, nameSpace);
      if (!addBuilt(operation, elementSettingData, nameSpace,
                    "Create CMPIObjectPath failed for                     DNSEndpointElementSettingData.", endpoint,
                    setting, instances)) {
        return 1;
      }
    }
  }
  return endBuilder(operation);
}

ZV_BUILT_INSTANCES(DNSEndpointElementSettingData, elementSettingData, DNSEndpointElementSettingDataCMPIInstances)

// The paths of the built instances: none is returned before all are built.
static CMPIStatus DNSEndpointElementSettingData_EnumInstanceNames(Operation operation) {
  operation = enter(operation, elementSettingData.category);
  returnPathsOfBuilt(operation, DNSEndpointElementSettingDataCMPIInstances);
  return end(operation);
}

// Only Associators logs the interface's name.
template <typename Found>
static void logInterface(const Operation& operation, const std::string& name, const Place& place = Place::here()) {
  if (kReturnsInstances<Found>) logValue(operation, "instance_tokens[1]", name, place);
}

template <typename Found>
static CMPIStatus associate(Operation& operation, DNSClientObjFactory& factory, const FarEnd& farEnd) {
  std::string interfaceName;
  if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(operation.resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) {
      return operation.status;
    }
    if (!requireInterfaceOf(operation, sourceKey(operation, "InstanceID"), interfaceName)) return operation.status;
    logInterface<Found>(operation, interfaceName);
    const auto endpoints = fetchEndpoints<Found>(operation, factory, farEnd.path);
    if (!endpoints) return operation.status;
    const std::string nameSpace = nameSpaceForPaths<Found>(operation);
    for (Found* endpoint : counted16(*endpoints)) {
      if (textIn(operation, endpoint, "Name") == interfaceName) returnOnThisHost(operation, endpoint, nameSpace);
    }
  } else if (farEnd.className == dnsSettingDataClass) {
    if (!passesResultClass(operation.resultClass, dnsSettingDataClass, "CIM_DNSSettingData")) return operation.status;
    const std::string name = sourceKey(operation, "Name");
    const auto settings = fetchSettings<Found>(operation, operation.ref);
    if (!settings) return operation.status;
    for (const Found* setting : counted16(*settings)) {
      const std::string instanceID = textIn(operation, setting, "InstanceID");
      if (!requireInterfaceOf(operation, instanceID, interfaceName)) return operation.status;
      logInterface<Found>(operation, interfaceName);
      if (interfaceName == name) returnOne(operation, setting);
    }
  }
  return end(operation);
}

template <typename Found>
static CMPIStatus refer(Operation& operation, DNSClientObjFactory& factory, const ReferenceParts& parts) {
  const auto& [farEnd, nameSpace, association] = parts;
  std::string interfaceName;
  if (farEnd.className == dnsSettingDataClass) {
    const std::string name = sourceKey(operation, "Name");
    const auto settings = fetchSettings<CMPIObjectPath>(operation, farEnd.path);
    if (!settings) return operation.status;
    for (CMPIObjectPath* setting : counted16(*settings)) {
      const CMPIInstance* reference = nullptr;
      // ReferenceNames makes an instance for every candidate, matching or not.
      if (!kReturnsInstances<Found>) reference = newInstance(broker, association, &operation.status);
      const std::string instanceID = keyText(setting, "InstanceID", &operation.status);
      if (!requireInterfaceOf(operation, instanceID, interfaceName)) return operation.status;
      if (interfaceName != name) continue;
      setNameSpaceAndHost(setting, nameSpace);
      if (kReturnsInstances<Found>) reference = newInstance(broker, association, &operation.status);
      setPair(reference, elementSettingData, operation.ref, setting);
      deliver<Found>(operation, reference, nameSpace);
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    if (!requireInterfaceOf(operation, sourceKey(operation, "InstanceID"), interfaceName)) return operation.status;
    const auto endpoints = fetchEndpoints<CMPIObjectPath>(operation, factory, farEnd.path);
    if (!endpoints) return operation.status;
    for (CMPIObjectPath* endpoint : counted16(*endpoints)) {
      if (keyText(endpoint, "Name", &operation.status) != interfaceName) continue;
      setNameSpaceAndHost(endpoint, nameSpace);
      deliverPair<Found>(operation, elementSettingData, parts, endpoint, operation.ref);
    }
  }
  return end(operation);
}

}  // namespace ZV

ZV_ASSOCIATION_PROVIDER(DNSEndPointElementSettingDataProvider, DNSEndpointElementSettingData, elementSettingData)
