// ZORVA_DNSGenOrderedComponent: the host-wide DNS settings as a component of each IP assignment setting. Instance and
// association provider; the IP assignment settings are served by another provider and read through the broker. No key
// is compared: every pair belongs together.

#include <stdexcept>

#include "factory/DNSClientObjFactory.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSGeneralOrderedComponent = "Zorvagent.DNSGeneralOrderedComponentProvider";
static const char* const dnsGeneralSettingDataClass = "ZORVA_DNSGeneralSettingData";
static const char* const dnsGenOrderedComponentClass = "ZORVA_DNSGenOrderedComponent";
static const char* const ipAssignmentSettingDataClass = "ZORVA_IPAssignmentSettingData";

// Both references and the position: the interface's own settings come second.
static void setAll(const CMPIInstance* instance, const CMPIObjectPath* group, const CMPIObjectPath* part) {
  setPair(instance, "GroupComponent", group, "PartComponent", part);
  setUint64(instance, "AssignedSequence", 1);
}

// Throws std::out_of_range if there are none. The provider does not catch it, and a server reports a failed operation
// with this text.
static CMPIObjectPath* firstOf(const std::vector<CMPIObjectPath*>& settings) {
  if (settings.empty()) throw std::out_of_range("vector::_M_range_check");
  return settings.front();
}

// If there is an IP assignment but no host-wide settings, std::out_of_range leaves this function.
static unsigned short DNSGeneralOrderedComponentCMPIInstances(const CMPIContext* context, const CMPIObjectPath* ref,
                                                              const char** properties,
                                                              std::vector<CMPIInstance*>& instances) {
  Operation operation = ZV_UNMARKED_OPERATION(loggerDNSGeneralOrderedComponent, context, nullptr, ref);
  const FlowLog flow(loggerDNSGeneralOrderedComponent, ZV_HERE, " ref==", ref, " properties==", properties,
                     " ctx==", context, " instances==", &instances);
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  const CMPIEnumeration* assignments = nullptr;
  if (!askForNames(operation, nameSpace, ipAssignmentSettingDataClass,
                   "Create CMPIObjectPath failed for ipAssignmentSettingDataClass.", assignments)) {
    return 1;
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &operation.status) != 0) {
    return failAndLeaveBuilder(operation, "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
  }
  while (hasNext(assignments, &operation.status)) {
    const CMPIObjectPath* assignment = nextPath(assignments, &operation.status);
    keyText(assignment, "InstanceID", &operation.status);  // read, like the other key below, but not compared
    CMPIObjectPath* setting = firstOf(settings);
    if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNS Client")) return 1;
    keyText(setting, "InstanceID", &operation.status);
    setNameSpaceAndHost(setting, nameSpace);
    CMPIInstance* instance = nullptr;
    if (!newBuilt(operation, nameSpace, dnsGenOrderedComponentClass,
                  "Create CMPIObjectPath failed for                     DNSGeneralOrderedComponent.", instance)) {
      return 1;
    }
    if (!isGood(instance)) continue;
    setPropertyFilter(instance, properties, {"GroupComponent", "PartComponent"});
    setAll(instance, assignment, setting);
    instances.push_back(instance);
  }
  flow.exit();
  return 0;
}

// The paths of the built instances: none is returned before all are built.
static CMPIStatus DNSGeneralOrderedComponent_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                               const CMPIResult* result, const CMPIObjectPath* ref) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralOrderedComponent, context, result, ref);
  returnPathsOfBuilt(operation, DNSGeneralOrderedComponentCMPIInstances);
  return end(operation);
}

static CMPIStatus DNSGeneralOrderedComponent_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                           const CMPIResult* result, const CMPIObjectPath* ref,
                                                           const char** properties) {
  const Operation operation = ZV_OPERATION(loggerDNSGeneralOrderedComponent, context, result, ref);
  returnBuilt(operation, DNSGeneralOrderedComponentCMPIInstances, properties);
  return end(operation);
}

static CMPIStatus DNSGeneralOrderedComponent_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                         const CMPIResult* result, const CMPIObjectPath* ref,
                                                         const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralOrderedComponent, context, result, ref);
  returnEqualBuilt(operation, DNSGeneralOrderedComponentCMPIInstances, properties);
  return end(operation);
}

// The four operations below read no key of the source: every object of the far end counts.

static CMPIStatus DNSGeneralOrderedComponent_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                         const CMPIResult* result, const CMPIObjectPath* ref,
                                                         const char* assocClass, const char* resultClass, const char*,
                                                         const char*, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralOrderedComponent, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsGenOrderedComponentClass),
                                      resultClass, "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == ipAssignmentSettingDataClass) {
    if (!passesResultClass(resultClass, ipAssignmentSettingDataClass, "CIM_IPAssignmentSettingData")) {
      return operation.status;
    }
    const CMPIEnumeration* assignments = nullptr;
    if (!askForInstances(operation, nameSpaceOf(ref, &operation.status), ipAssignmentSettingDataClass,
                         "Create CMPIObjectPath failed for ipAssignmentSettingDataClass.", assignments)) {
      return operation.status;
    }
    while (hasNext(assignments, &operation.status))
      returnInstance(result, nextInstance(assignments, &operation.status));
  } else if (farEnd.className == dnsGeneralSettingDataClass) {
    if (!passesResultClass(resultClass, dnsGeneralSettingDataClass, "CIM_DNSGeneralSettingData")) {
      return operation.status;
    }
    std::vector<CMPIInstance*> settings;
    if (getAllDNSGeneralSettingDataCMPIInstances(broker, ref, properties, &settings, &operation.status) != 0) {
      return fail(operation, "getAllDNSGeneralSettingDataCMPIInstances Failed");
    }
    returnAll(result, settings);
  }
  return end(operation);
}

static CMPIStatus DNSGeneralOrderedComponent_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                             const CMPIResult* result, const CMPIObjectPath* ref,
                                                             const char* assocClass, const char* resultClass,
                                                             const char*, const char*) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralOrderedComponent, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsGenOrderedComponentClass),
                                      resultClass, "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == ipAssignmentSettingDataClass) {
    if (!passesResultClass(resultClass, ipAssignmentSettingDataClass, "CIM_IPAssignmentSettingData")) {
      return operation.status;
    }
    const CMPIEnumeration* assignments = nullptr;
    if (!askForNames(operation, nameSpaceOf(ref, &operation.status), ipAssignmentSettingDataClass,
                     "Create CMPIObjectPath failed for ComputerSystem.", assignments)) {
      return operation.status;
    }
    while (hasNext(assignments, &operation.status)) returnObjectPath(result, nextPath(assignments, &operation.status));
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

static CMPIStatus refer(Operation operation, Deliver deliver) {
  DNSClientObjFactory factory;
  const auto [farEnd, nameSpace, association] =
      resolveReferences(operation, factory, dnsGenOrderedComponentClass, newPath, dnsGenOrderedComponentClass,
                        "Object Path is NULL in References.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == dnsGeneralSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, farEnd.path, &settings, &operation.status) != 0) {
      return fail(operation, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
    }
    for (CMPIObjectPath* setting : counted16(settings)) {  // every one; the builder uses only the first
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setNameSpaceAndHost(setting, nameSpace);
      setAll(reference, operation.ref, setting);
      deliver(operation, reference, nameSpace);
    }
  } else if (farEnd.className == ipAssignmentSettingDataClass) {
    const CMPIEnumeration* assignments = nullptr;
    if (!askForNames(operation, farEnd.path, assignments)) return operation.status;
    while (hasNext(assignments, &operation.status)) {
      nextPath(assignments, &operation.status);  // only counted: each part is the far end's class without keys
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setAll(reference, operation.ref,
             farEnd.path);  // the source is the group; the builder has them the other way round
      deliver(operation, reference, nameSpace);
    }
  }
  return end(operation);
}

static CMPIStatus DNSGeneralOrderedComponent_References(CMPIAssociationMI*, const CMPIContext* context,
                                                        const CMPIResult* result, const CMPIObjectPath* ref,
                                                        const char*, const char*, const char**) {
  return refer(ZV_OPERATION(loggerDNSGeneralOrderedComponent, context, result, ref), deliverInstance);
}

static CMPIStatus DNSGeneralOrderedComponent_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                            const CMPIResult* result, const CMPIObjectPath* ref,
                                                            const char*, const char*) {
  return refer(ZV_OPERATION(loggerDNSGeneralOrderedComponent, context, result, ref), deliverPath);
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSGeneralOrderedComponent)
ZV_REFUSED_MODIFICATION(DNSGeneralOrderedComponent)
ZV_ASSOCIATION_CLEANUP(DNSGeneralOrderedComponent)

}  // namespace ZV

ZV_INSTANCE_MI(DNSGeneralOrderedComponentProvider, DNSGeneralOrderedComponent)
ZV_ASSOCIATION_MI(DNSGeneralOrderedComponentProvider, DNSGeneralOrderedComponent)
