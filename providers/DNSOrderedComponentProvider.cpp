// ZORVA_DNSOrderedComponent: an interface's DNS settings as a component of its IP assignment settings. Instance and
// association provider; the IP assignment settings are served by another provider and read through the broker.
//
// An IP assignment's InstanceID is the DNS setting's, a "%" and one more part: the text before its last "%" must equal
// the DNS setting's InstanceID. If it has no "%", the builder uses the whole text; the association operations stop at
// it.

#include "factory/ClassNames.h"
#include "factory/DNSClientObjFactory.h"
#include "factory/DNSSettingDataObjects.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"

namespace ZV {

// The position: the host-wide settings come first.
static void setPosition(const CMPIInstance* instance) { setUint64(instance, "AssignedSequence", 2); }

static const Association orderedComponent = {"Zorvagent.DNSOrderedComponentProvider", dnsOrderedComponentClass,
                                             kPathsWithoutHost, kGroupAndPart, setPosition};

namespace {

// The DNS setting's InstanceID within that of an IP assignment; false if the operation cannot continue without a "%".
bool requireTarget(const Operation& operation, const std::string& instanceID, std::string& target,
                   const Place& place = Place::here()) {
  const std::size_t cut = instanceID.rfind('%');
  if (cut == std::string::npos) return complain(operation, "Invalid InstanceId", place);
  target = instanceID.substr(0, cut);
  return true;
}

}  // namespace

static unsigned short DNSOrderedComponentCMPIInstances(Operation operation, std::vector<CMPIInstance*>& instances) {
  operation = named(operation, orderedComponent.category);
  const FlowLog flow(orderedComponent.category, ZV_HERE, " ref=", operation.ref, " properties=", operation.properties,
                     " ctx=", operation.context, " instances=", &instances);
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  const auto assignments = askForAll<CMPIObjectPath>(operation, nameSpace, ipAssignmentSettingDataClass,
                                                     "Create CMPIObjectPath failed for ipAssignmentSettingDataClass.");
  if (!assignments) return 1;
  const auto settings =
      fetchSettings<CMPIObjectPath>(operation, operation.ref, "getAllDNSSettingDataCMPIObjectPaths failed");
  if (!settings) return leaveBuilder(operation);
  while (hasNext(*assignments, &operation.status)) {
    const CMPIObjectPath* assignment = nextPath(*assignments, &operation.status);
    const std::string instanceID = keyText(assignment, "InstanceID", &operation.status);
    const std::string target = instanceID.substr(0, instanceID.rfind('%'));  // without a "%" the whole text
    logValue(operation, "target", target);
    for (CMPIObjectPath* setting : counted16(*settings)) {
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNS Client")) return 1;
      if (keyText(setting, "InstanceID", &operation.status) != target) continue;
      setNameSpaceAndHost(setting, nameSpace);
      if (!addBuilt(operation, orderedComponent, nameSpace,
                    "Create CMPIObjectPath failed for                         DNSOrderedComponent.", assignment,
                    setting, instances)) {
        return 1;
      }
    }
  }
  flow.exit();
  return 0;
}

ZV_BUILT_INSTANCES(DNSOrderedComponent, orderedComponent, DNSOrderedComponentCMPIInstances)

// The paths of the built instances: none is returned before all are built.
static CMPIStatus DNSOrderedComponent_EnumInstanceNames(Operation operation) {
  operation = enter(operation, orderedComponent.category);
  returnPathsOfBuilt(operation, DNSOrderedComponentCMPIInstances);
  return end(operation);
}

template <typename Found>
static CMPIStatus associate(Operation& operation, DNSClientObjFactory&, const FarEnd& farEnd) {
  const std::string sourceID = sourceKey(operation, "InstanceID");
  std::string target;
  if (farEnd.className == ipAssignmentSettingDataClass) {
    if (!passesResultClass(operation.resultClass, ipAssignmentSettingDataClass, "CIM_IPAssignmentSettingData")) {
      return operation.status;
    }
    const auto assignments =
        askForAll<Found>(operation, nameSpaceOf(operation.ref, &operation.status), ipAssignmentSettingDataClass,
                         either<Found>("Create CMPIObjectPath failed for ipAssignmentSettingDataClass.",
                                       "Create CMPIObjectPath failed for ComputerSystem."));
    if (!assignments) return operation.status;
    while (hasNext(*assignments, &operation.status)) {
      Found* assignment = next<Found>(operation, *assignments);
      const std::string instanceID = keyText(pathOf(operation, assignment), "InstanceID", &operation.status);
      if (!requireTarget(operation, instanceID, target)) return operation.status;
      if (target == sourceID) returnOne(operation, assignment);
    }
  } else if (farEnd.className == dnsSettingDataClass) {
    if (!passesResultClass(operation.resultClass, dnsSettingDataClass, "CIM_DNSSettingData")) return operation.status;
    const auto settings = fetchSettings<Found>(operation, operation.ref);
    if (!settings) return operation.status;
    for (Found* setting : counted16(*settings)) {
      const std::string instanceID = keyText(pathOf(operation, setting), "InstanceID", &operation.status);
      if (!requireTarget(operation, sourceID, target)) return operation.status;  // only if there is a candidate
      if (target == instanceID) returnOne(operation, setting);
    }
  }
  return end(operation);
}

template <typename Found>
static CMPIStatus refer(Operation& operation, DNSClientObjFactory&, const ReferenceParts& parts) {
  const auto& [farEnd, nameSpace, association] = parts;
  const std::string sourceID = sourceKey(operation, "InstanceID");
  std::string target;
  if (farEnd.className == dnsSettingDataClass) {
    const auto settings = fetchSettings<CMPIObjectPath>(operation, farEnd.path);
    if (!settings) return operation.status;
    for (CMPIObjectPath* setting : counted16(*settings)) {
      // Made whether it matches or not.
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      const std::string instanceID = keyText(setting, "InstanceID", &operation.status);
      if (!requireTarget(operation, sourceID, target)) return operation.status;
      if (target != instanceID) continue;
      setNameSpaceAndHost(setting, nameSpace);
      setPair(reference, orderedComponent, operation.ref, setting);
      deliver<Found>(operation, reference, nameSpace);
    }
  } else if (farEnd.className == ipAssignmentSettingDataClass) {
    const auto assignments = askFor<CMPIObjectPath>(operation, farEnd.path);
    if (!assignments) return operation.status;
    // The far end's class without keys in the references, the source in their names.
    const CMPIObjectPath* part = either<Found, const CMPIObjectPath*>(farEnd.path, operation.ref);
    while (hasNext(*assignments, &operation.status)) {
      const CMPIObjectPath* assignment = nextPath(*assignments, &operation.status);
      const std::string instanceID = keyText(assignment, "InstanceID", &operation.status);
      if (!requireTarget(operation, instanceID, target)) return operation.status;
      if (target != sourceID) continue;
      deliverPair<Found>(operation, orderedComponent, parts, assignment, part);
    }
  }
  return end(operation);
}

}  // namespace ZV

ZV_ASSOCIATION_PROVIDER(DNSOrderedComponentProvider, DNSOrderedComponent, orderedComponent)
