// ZORVA_DNSGenOrderedComponent: the host-wide DNS settings as a component of each IP assignment setting. Instance and
// association provider; the IP assignment settings are served by another provider and read through the broker. No key
// is compared: every pair belongs together.

#include <stdexcept>

#include "factory/ClassNames.h"
#include "factory/DNSClientObjFactory.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"

namespace ZV {

// The position: the interface's own settings come second.
static void setPosition(const CMPIInstance* instance) { setUint64(instance, "AssignedSequence", 1); }

static const Association orderedComponent = {"Zorvagent.DNSGeneralOrderedComponentProvider",
                                             dnsGenOrderedComponentClass, kPathsWithoutHost, kGroupAndPart,
                                             setPosition};

// Throws std::out_of_range if there are none. The provider does not catch it, and a server reports a failed operation
// with this text.
static CMPIObjectPath* firstOf(const std::vector<CMPIObjectPath*>& settings) {
  if (settings.empty()) throw std::out_of_range("vector::_M_range_check");
  return settings.front();
}

// If there is an IP assignment but no host-wide settings, std::out_of_range leaves this function.
static unsigned short DNSGeneralOrderedComponentCMPIInstances(Operation operation,
                                                              std::vector<CMPIInstance*>& instances) {
  operation = named(operation, orderedComponent.category);
  const FlowLog flow(orderedComponent.category, ZV_HERE, " ref==", operation.ref, " properties==", operation.properties,
                     " ctx==", operation.context, " instances==", &instances);
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  const auto assignments = askForAll<CMPIObjectPath>(operation, nameSpace, ipAssignmentSettingDataClass,
                                                     "Create CMPIObjectPath failed for ipAssignmentSettingDataClass.");
  if (!assignments) return 1;
  const auto settings = fetchGeneralSettings<CMPIObjectPath>(operation, operation.ref,
                                                             "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
  if (!settings) return leaveBuilder(operation);
  while (hasNext(*assignments, &operation.status)) {
    const CMPIObjectPath* assignment = nextPath(*assignments, &operation.status);
    keyText(assignment, "InstanceID", &operation.status);  // read, like the other key below, but not compared
    CMPIObjectPath* setting = firstOf(*settings);
    if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNS Client")) return 1;
    keyText(setting, "InstanceID", &operation.status);
    setNameSpaceAndHost(setting, nameSpace);
    if (!addBuilt(operation, orderedComponent, nameSpace,
                  "Create CMPIObjectPath failed for                     DNSGeneralOrderedComponent.", assignment,
                  setting, instances)) {
      return 1;
    }
  }
  flow.exit();
  return 0;
}

ZV_BUILT_INSTANCES(DNSGeneralOrderedComponent, orderedComponent, DNSGeneralOrderedComponentCMPIInstances)

// The paths of the built instances: none is returned before all are built.
static CMPIStatus DNSGeneralOrderedComponent_EnumInstanceNames(Operation operation) {
  operation = enter(operation, orderedComponent.category);
  returnPathsOfBuilt(operation, DNSGeneralOrderedComponentCMPIInstances);
  return end(operation);
}

// The four operations below read no key of the source: every object of the far end counts.

template <typename Found>
static CMPIStatus associate(Operation& operation, DNSClientObjFactory&, const FarEnd& farEnd) {
  if (farEnd.className == ipAssignmentSettingDataClass) {
    if (!passesResultClass(operation.resultClass, ipAssignmentSettingDataClass, "CIM_IPAssignmentSettingData")) {
      return operation.status;
    }
    const auto assignments =
        askForAll<Found>(operation, nameSpaceOf(operation.ref, &operation.status), ipAssignmentSettingDataClass,
                         either<Found>("Create CMPIObjectPath failed for ipAssignmentSettingDataClass.",
                                       "Create CMPIObjectPath failed for ComputerSystem."));
    if (!assignments) return operation.status;
    while (hasNext(*assignments, &operation.status)) returnOne(operation, next<Found>(operation, *assignments));
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
    for (CMPIObjectPath* setting : counted16(*settings)) {  // every one; the builder uses only the first
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setNameSpaceAndHost(setting, nameSpace);
      setPair(reference, orderedComponent, operation.ref, setting);
      deliver<Found>(operation, reference, nameSpace);
    }
  } else if (farEnd.className == ipAssignmentSettingDataClass) {
    const auto assignments = askFor<CMPIObjectPath>(operation, farEnd.path);
    if (!assignments) return operation.status;
    while (hasNext(*assignments, &operation.status)) {
      nextPath(*assignments, &operation.status);  // only counted: each part is the far end's class without keys
                                                  // The source is the group; the builder has them the other way round.
      deliverPair<Found>(operation, orderedComponent, parts, operation.ref, farEnd.path);
    }
  }
  return end(operation);
}

}  // namespace ZV

ZV_ASSOCIATION_PROVIDER(DNSGeneralOrderedComponentProvider, DNSGeneralOrderedComponent, orderedComponent)
