// ZORVA_DNSOrderedComponent: an interface's DNS settings as a component of its IP assignment settings. Instance and
// association provider; the IP assignment settings are served by another provider and read through the broker.
//
// An IP assignment's InstanceID is the DNS setting's, a "%" and one more part: the text before its last "%" must equal
// the DNS setting's InstanceID. If it has no "%", the builder uses the whole text; the association operations stop at
// it.

#include "factory/DNSClientObjFactory.h"
#include "factory/DNSSettingDataObjects.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSOrderedComponent = "Zorvagent.DNSOrderedComponentProvider";
static const char* const dnsSettingDataClass = "ZORVA_DNSSettingData";
static const char* const dnsOrderedComponentClass = "ZORVA_DNSOrderedComponent";
static const char* const ipAssignmentSettingDataClass = "ZORVA_IPAssignmentSettingData";

namespace {

// Both references and the position: the host-wide settings come first.
void setAll(const CMPIInstance* instance, const CMPIObjectPath* group, const CMPIObjectPath* part) {
  setPair(instance, "GroupComponent", group, "PartComponent", part);
  setUint64(instance, "AssignedSequence", 2);
}

std::string pathKey(Operation& operation, const CMPIInstance* instance) {
  return keyText(objectPathOf(instance, &operation.status), "InstanceID", &operation.status);
}

// The DNS setting's InstanceID within that of an IP assignment; false if the operation cannot continue without a "%".
bool requireTarget(const Operation& operation, const std::string& instanceID, std::string& target,
                   const Place& place = Place::here()) {
  const std::size_t cut = instanceID.rfind('%');
  if (cut == std::string::npos) return complain(operation, "Invalid InstanceId", place);
  target = instanceID.substr(0, cut);
  return true;
}

}  // namespace

static unsigned short DNSOrderedComponentCMPIInstances(const CMPIContext* context, const CMPIObjectPath* ref,
                                                       const char** properties, std::vector<CMPIInstance*>& instances) {
  Operation operation = ZV_UNMARKED_OPERATION(loggerDNSOrderedComponent, context, nullptr, ref);
  const FlowLog flow(loggerDNSOrderedComponent, ZV_HERE, " ref=", ref, " properties=", properties, " ctx=", context,
                     " instances=", &instances);
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  const CMPIEnumeration* assignments = nullptr;
  if (!askForNames(operation, nameSpace, ipAssignmentSettingDataClass,
                   "Create CMPIObjectPath failed for ipAssignmentSettingDataClass.", assignments)) {
    return 1;
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSSettingDataCMPIObjectPaths(broker, ref, &settings, &operation.status) != 0) {
    return failAndLeaveBuilder(operation, "getAllDNSSettingDataCMPIObjectPaths failed");
  }
  while (hasNext(assignments, &operation.status)) {
    const CMPIObjectPath* assignment = nextPath(assignments, &operation.status);
    const std::string instanceID = keyText(assignment, "InstanceID", &operation.status);
    const std::string target = instanceID.substr(0, instanceID.rfind('%'));  // without a "%" the whole text
    logValue(operation, "target", target);
    for (CMPIObjectPath* setting : counted16(settings)) {
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNS Client")) return 1;
      if (keyText(setting, "InstanceID", &operation.status) != target) continue;
      setNameSpaceAndHost(setting, nameSpace);
      CMPIInstance* instance = nullptr;
      if (!newBuilt(operation, nameSpace, dnsOrderedComponentClass,
                    "Create CMPIObjectPath failed for                         DNSOrderedComponent.", instance)) {
        return 1;
      }
      if (!isGood(instance)) continue;
      setPropertyFilter(instance, properties, {"GroupComponent", "PartComponent"});
      setAll(instance, assignment, setting);
      instances.push_back(instance);
    }
  }
  flow.exit();
  return 0;
}

// The paths of the built instances: none is returned before all are built.
static CMPIStatus DNSOrderedComponent_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                        const CMPIResult* result, const CMPIObjectPath* ref) {
  Operation operation = ZV_OPERATION(loggerDNSOrderedComponent, context, result, ref);
  returnPathsOfBuilt(operation, DNSOrderedComponentCMPIInstances);
  return end(operation);
}

static CMPIStatus DNSOrderedComponent_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                    const CMPIResult* result, const CMPIObjectPath* ref,
                                                    const char** properties) {
  const Operation operation = ZV_OPERATION(loggerDNSOrderedComponent, context, result, ref);
  returnBuilt(operation, DNSOrderedComponentCMPIInstances, properties);
  return end(operation);
}

static CMPIStatus DNSOrderedComponent_GetInstance(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                                  const CMPIObjectPath* ref, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSOrderedComponent, context, result, ref);
  returnEqualBuilt(operation, DNSOrderedComponentCMPIInstances, properties);
  return end(operation);
}

static CMPIStatus DNSOrderedComponent_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                  const CMPIResult* result, const CMPIObjectPath* ref,
                                                  const char* assocClass, const char* resultClass, const char*,
                                                  const char*, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSOrderedComponent, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsOrderedComponentClass),
                                      resultClass, "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  const std::string sourceID = sourceKey(operation, "InstanceID");
  std::string target;
  if (farEnd.className == ipAssignmentSettingDataClass) {
    if (!passesResultClass(resultClass, ipAssignmentSettingDataClass, "CIM_IPAssignmentSettingData")) {
      return operation.status;
    }
    const CMPIEnumeration* assignments = nullptr;
    if (!askForInstances(operation, nameSpaceOf(ref, &operation.status), ipAssignmentSettingDataClass,
                         "Create CMPIObjectPath failed for ipAssignmentSettingDataClass.", assignments)) {
      return operation.status;
    }
    while (hasNext(assignments, &operation.status)) {
      const CMPIInstance* assignment = nextInstance(assignments, &operation.status);
      if (!requireTarget(operation, pathKey(operation, assignment), target)) return operation.status;
      if (target == sourceID) returnInstance(result, assignment);
    }
  } else if (farEnd.className == dnsSettingDataClass) {
    if (!passesResultClass(resultClass, dnsSettingDataClass, "CIM_DNSSettingData")) return operation.status;
    std::vector<CMPIInstance*> settings;
    if (getAllDNSSettingDataCMPIInstances(broker, ref, properties, &settings, &operation.status) != 0) {
      return fail(operation, "getAllDNSSettingDataCMPIInstances Failed");
    }
    for (const CMPIInstance* setting : counted16(settings)) {
      const std::string instanceID = pathKey(operation, setting);
      if (!requireTarget(operation, sourceID, target)) return operation.status;  // only if there is a candidate
      if (target == instanceID) returnInstance(result, setting);
    }
  }
  return end(operation);
}

static CMPIStatus DNSOrderedComponent_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                      const CMPIResult* result, const CMPIObjectPath* ref,
                                                      const char* assocClass, const char* resultClass, const char*,
                                                      const char*) {
  Operation operation = ZV_OPERATION(loggerDNSOrderedComponent, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsOrderedComponentClass),
                                      resultClass, "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  const std::string sourceID = sourceKey(operation, "InstanceID");
  std::string target;
  if (farEnd.className == ipAssignmentSettingDataClass) {
    if (!passesResultClass(resultClass, ipAssignmentSettingDataClass, "CIM_IPAssignmentSettingData")) {
      return operation.status;
    }
    const CMPIEnumeration* assignments = nullptr;
    if (!askForNames(operation, nameSpaceOf(ref, &operation.status), ipAssignmentSettingDataClass,
                     "Create CMPIObjectPath failed for ComputerSystem.", assignments)) {
      return operation.status;
    }
    while (hasNext(assignments, &operation.status)) {
      const CMPIObjectPath* assignment = nextPath(assignments, &operation.status);
      const std::string instanceID = keyText(assignment, "InstanceID", &operation.status);
      if (!requireTarget(operation, instanceID, target)) return operation.status;
      if (target == sourceID) returnObjectPath(result, assignment);
    }
  } else if (farEnd.className == dnsSettingDataClass) {
    if (!passesResultClass(resultClass, dnsSettingDataClass, "CIM_DNSSettingData")) return operation.status;
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSSettingDataCMPIObjectPaths(broker, ref, &settings, &operation.status) != 0) {
      return fail(operation, "getAllDNSSettingDataCMPIObjectPaths Failed");
    }
    for (const CMPIObjectPath* setting : counted16(settings)) {
      const std::string instanceID = keyText(setting, "InstanceID", &operation.status);
      if (!requireTarget(operation, sourceID, target)) return operation.status;
      if (target == instanceID) returnObjectPath(result, setting);
    }
  }
  return end(operation);
}

// The part of a reference to an IP assignment: the far end's class without keys in the references, the source in their
// names.
using PartOf = const CMPIObjectPath* (*)(const Operation& operation, const FarEnd& farEnd);
static const CMPIObjectPath* farEndOf(const Operation&, const FarEnd& farEnd) { return farEnd.path; }
static const CMPIObjectPath* sourceOf(const Operation& operation, const FarEnd&) { return operation.ref; }

static CMPIStatus refer(Operation operation, PartOf partOf, Deliver deliver) {
  DNSClientObjFactory factory;
  const auto [farEnd, nameSpace, association] =
      resolveReferences(operation, factory, dnsOrderedComponentClass, newPath, dnsOrderedComponentClass,
                        "Object Path is NULL in References.");
  if (!isGood(farEnd.path)) return operation.status;
  const std::string sourceID = sourceKey(operation, "InstanceID");
  std::string target;
  if (farEnd.className == dnsSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSSettingDataCMPIObjectPaths(broker, farEnd.path, &settings, &operation.status) != 0) {
      return fail(operation, "getAllDNSSettingDataCMPIObjectPaths Failed");
    }
    for (CMPIObjectPath* setting : counted16(settings)) {
      const CMPIInstance* reference =
          newInstance(broker, association, &operation.status);  // made whether it matches or not
      const std::string instanceID = keyText(setting, "InstanceID", &operation.status);
      if (!requireTarget(operation, sourceID, target)) return operation.status;
      if (target != instanceID) continue;
      setNameSpaceAndHost(setting, nameSpace);
      setAll(reference, operation.ref, setting);
      deliver(operation, reference, nameSpace);
    }
  } else if (farEnd.className == ipAssignmentSettingDataClass) {
    const CMPIEnumeration* assignments = nullptr;
    if (!askForNames(operation, farEnd.path, assignments)) return operation.status;
    while (hasNext(assignments, &operation.status)) {
      const CMPIObjectPath* assignment = nextPath(assignments, &operation.status);
      const std::string instanceID = keyText(assignment, "InstanceID", &operation.status);
      if (!requireTarget(operation, instanceID, target)) return operation.status;
      if (target != sourceID) continue;
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setAll(reference, assignment, partOf(operation, farEnd));
      deliver(operation, reference, nameSpace);
    }
  }
  return end(operation);
}

static CMPIStatus DNSOrderedComponent_References(CMPIAssociationMI*, const CMPIContext* context,
                                                 const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                 const char*, const char**) {
  return refer(ZV_OPERATION(loggerDNSOrderedComponent, context, result, ref), farEndOf, deliverInstance);
}

static CMPIStatus DNSOrderedComponent_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                     const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                     const char*) {
  return refer(ZV_OPERATION(loggerDNSOrderedComponent, context, result, ref), sourceOf, deliverPath);
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSOrderedComponent)
ZV_REFUSED_MODIFICATION(DNSOrderedComponent)
ZV_ASSOCIATION_CLEANUP(DNSOrderedComponent)

}  // namespace ZV

ZV_INSTANCE_MI(DNSOrderedComponentProvider, DNSOrderedComponent)
ZV_ASSOCIATION_MI(DNSOrderedComponentProvider, DNSOrderedComponent)
