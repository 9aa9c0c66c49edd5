// ZORVA_DNSGeneralElementSettingData: the host-wide DNS settings of the computer system. Instance and association
// provider; the computer systems are served by another provider and read through the broker.
//
// The enumerations pair a system with settings whose InstanceID contains its Name. The association operations compare
// no key.

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

static const Association elementSettingData = {"Zorvagent.DNSGeneralElementSettingDataProvider",
                                               dnsGeneralElementSettingDataClass, kPathsWithoutHost, kElementAndSetting,
                                               setFlags};

static unsigned short DNSGeneralElementSettingDataCMPIInstances(Operation operation,
                                                                std::vector<CMPIInstance*>& instances) {
  operation = enter(operation, elementSettingData.category);
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  const auto systems = askForAll<CMPIObjectPath>(operation, nameSpace, computerSystemClass,
                                                 "Create CMPIObjectPath failed for ComputerSystem.");
  if (!systems) return 1;
  const auto settings = fetchGeneralSettings<CMPIObjectPath>(operation, operation.ref,
                                                             "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
  if (!settings) return leaveBuilder(operation);
  while (hasNext(*systems, &operation.status)) {
    const CMPIObjectPath* system = nextPath(*systems, &operation.status);
    const std::string name = keyText(system, "Name", &operation.status);
    for (CMPIObjectPath* setting : counted16(*settings)) {
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNS Client")) return 1;
      if (keyText(setting, "InstanceID", &operation.status).find(name) == std::string::npos) continue;
      setNameSpaceAndHost(setting, nameSpace);
      if (!addBuilt(operation, elementSettingData, nameSpace,
                    "Create CMPIObjectPath failed for                         DNSGeneralElementSettingData.", system,
                    setting, instances, "Key is not matched"))
        return 1;
    }
  }
  return endBuilder(operation);
}

ZV_BUILT_INSTANCES(DNSGeneralElementSettingData, elementSettingData, DNSGeneralElementSettingDataCMPIInstances)

// Returns each path at once: after a later failure these paths are already delivered, and the result stays open.
static CMPIStatus DNSGeneralElementSettingData_EnumInstanceNames(Operation operation) {
  operation = enter(operation, elementSettingData.category);
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  const auto systems = askForAll<CMPIObjectPath>(operation, nameSpace, computerSystemClass,
                                                 "Create CMPIObjectPath failed for computerSystemClass.");
  if (!systems) return operation.status;
  const auto settings = fetchGeneralSettings<CMPIObjectPath>(operation, operation.ref,
                                                             "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
  if (!settings) return operation.status;
  while (hasNext(*systems, &operation.status)) {
    const CMPIObjectPath* system = nextPath(*systems, &operation.status);
    const std::string name = keyText(system, "Name", &operation.status);
    for (CMPIObjectPath* setting : counted16(*settings)) {
      if (keyText(setting, "InstanceID", &operation.status).find(name) == std::string::npos) {
        complain(operation, "Key is not matched");
        continue;
      }
      // Checked only after its key was read.
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNSGeneralSettingData")) return operation.status;
      setNameSpace(setting, nameSpace);  // the host is set only in the builder
      if (!returnPair(operation, elementSettingData, nameSpace,
                      "Create CMPIObjectPath failed for                         DNSGeneralElementSettingData Class",
                      system, setting)) {
        return operation.status;
      }
    }
  }
  return end(operation);
}

// The four operations below read no key of the source: every object of the far end counts.

template <typename Found>
static CMPIStatus associate(Operation& operation, DNSClientObjFactory&, const FarEnd& farEnd) {
  if (farEnd.className == computerSystemClass) {
    if (!passesResultClass(operation.resultClass, computerSystemClass, "CIM_ComputerSystem")) return operation.status;
    const auto systems = askForAll<Found>(operation, nameSpaceOf(operation.ref, &operation.status), computerSystemClass,
                                          "Create CMPIObjectPath failed for ComputerSystem.");
    if (!systems) return operation.status;
    while (hasNext(*systems, &operation.status)) returnOne(operation, next<Found>(operation, *systems));
  } else if (farEnd.className == dnsGeneralSettingDataClass) {
    if (!returnGeneralSettings<Found>(operation)) return operation.status;
  }
  return end(operation);
}

template <typename Found>
static CMPIStatus refer(Operation& operation, DNSClientObjFactory&, const ReferenceParts& parts) {
  const auto& [farEnd, nameSpace, association] = parts;
  if (farEnd.className == dnsGeneralSettingDataClass) {
    const auto settings = fetchGeneralSettings<CMPIObjectPath>(operation, farEnd.path);
    if (!settings) return operation.status;
    for (CMPIObjectPath* setting : counted16(*settings)) {
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setNameSpaceAndHost(setting, nameSpace);
      setPair(reference, elementSettingData, operation.ref, setting);
      deliver<Found>(operation, reference, nameSpace);
    }
  } else if (farEnd.className == computerSystemClass) {
    const auto systems = askFor<CMPIObjectPath>(operation, farEnd.path);
    if (!systems) return operation.status;
    while (hasNext(*systems, &operation.status)) {
      nextPath(*systems, &operation.status);  // only counted: each reference names the far end's class without keys
      deliverPair<Found>(operation, elementSettingData, parts, farEnd.path, operation.ref);
    }
  }
  return end(operation);
}

}  // namespace ZV

ZV_ASSOCIATION_PROVIDER(DNSGeneralElementSettingDataProvider, DNSGeneralElementSettingData, elementSettingData)
