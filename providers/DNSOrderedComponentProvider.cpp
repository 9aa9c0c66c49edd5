// ZORVA_DNSOrderedComponent: an interface's DNS settings as a component of its IP assignment settings. Instance and
// association provider; the IP assignment settings are served elsewhere and asked for through the broker.
//
// An IP assignment's InstanceID is the DNS setting's, a "%" and a part of its own: up to its last "%" it must equal the
// DNS setting's. Without a "%" the builder takes it whole; the association operations stop at it.
#include "factory/DNSClientObjFactory.h"
#include "factory/DNSSettingDataObjects.h"
#include "providers/AssociationSteps.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSOrderedComponent = "Zorvagent.DNSOrderedComponentProvider";
static const char* const dnsSettingDataClass = "ZORVA_DNSSettingData";
static const char* const dnsOrderedComponentClass = "ZORVA_DNSOrderedComponent";
static const char* const ipAssignmentSettingDataClass = "ZORVA_IPAssignmentSettingData";

static constexpr CMPIUint64 kAssignedSequence = 2;  // the host-wide settings come first

namespace {

// The DNS setting's InstanceID in that of an IP assignment; false where the operation cannot go on without a "%".
bool requireTarget(const std::string& instanceID, std::string& target, const LogSite& site) {
  const std::size_t cut = instanceID.rfind('%');
  if (cut == std::string::npos) {
    logError(loggerDNSOrderedComponent, site, "Invalid InstanceId");
    return false;
  }
  target = instanceID.substr(0, cut);
  return true;
}

}  // namespace

static unsigned short DNSOrderedComponentCMPIInstances(const CMPIObjectPath* ref, const char** properties,
                                                       const CMPIContext* context,
                                                       std::vector<CMPIInstance*>& instances) {
  logEntry(loggerDNSOrderedComponent, ZV_HERE, " ref=", ref, " properties=", properties, " ctx=", context,
           " instances=", &instances);
  CMPIStatus status = kStatusOk;
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* assignmentClass = newPath(broker, nameSpace, ipAssignmentSettingDataClass, &status);
  if (isMissing(assignmentClass, loggerDNSOrderedComponent, ZV_HERE,
                "Create CMPIObjectPath failed for ipAssignmentSettingDataClass.")) {
    return 1;
  }
  const CMPIEnumeration* assignments = enumerateInstanceNames(broker, context, assignmentClass, &status);
  if (status.rc != CMPI_RC_OK) {
    logError(loggerDNSOrderedComponent, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
    return 1;
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
    logError(loggerDNSOrderedComponent, ZV_HERE, "getAllDNSSettingDataCMPIObjectPaths failed");
    ZV_PROVIDER_EXIT(loggerDNSOrderedComponent);
    return 1;
  }
  while (hasNext(assignments, &status)) {
    const CMPIObjectPath* assignment = nextPath(assignments, &status);
    const std::string instanceID = keyText(assignment, "InstanceID", &status);
    const std::string target = instanceID.substr(0, instanceID.rfind('%'));  // without a "%" the whole text
    logVariable(loggerDNSOrderedComponent, ZV_HERE, "target", target);
    for (unsigned short i = 0; i < count16(settings); ++i) {
      CMPIObjectPath* setting = settings.at(i);
      if (isMissing(setting, loggerDNSOrderedComponent, ZV_HERE, "CMPIObjectPath is NULL for DNS Client")) {
        return 1;  // the text says Client, though the path is of setting data
      }
      if (keyText(setting, "InstanceID", &status) != target) continue;
      setNameSpaceAndHost(setting, nameSpace);
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsOrderedComponentClass, &status);
      if (isMissing(path, loggerDNSOrderedComponent, ZV_HERE,
                    "Create CMPIObjectPath failed for                         DNSOrderedComponent.")) {
        return 1;
      }
      CMPIInstance* instance = newInstance(broker, path, nullptr);
      if (!isGood(instance)) continue;
      setPropertyFilter(instance, properties, {"GroupComponent", "PartComponent"});
      setReference(instance, "GroupComponent", assignment);
      setReference(instance, "PartComponent", setting);
      setUint64(instance, "AssignedSequence", kAssignedSequence);
      instances.push_back(instance);
    }
  }
  logExit(loggerDNSOrderedComponent, ZV_HERE, " ref=", ref, " properties=", properties, " ctx=", context,
          " instances=", &instances);
  return 0;
}

// Unlike most siblings by way of the builder: nothing goes out before all is built.
static CMPIStatus DNSOrderedComponent_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                        const CMPIResult* result, const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSOrderedComponent);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (DNSOrderedComponentCMPIInstances(ref, nullptr, context, instances) == 0) {
    returnPathsOf(result, instances, &status);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSOrderedComponent);
  return status;
}

static CMPIStatus DNSOrderedComponent_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                    const CMPIResult* result, const CMPIObjectPath* ref,
                                                    const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSOrderedComponent);
  std::vector<CMPIInstance*> instances;
  if (DNSOrderedComponentCMPIInstances(ref, properties, context, instances) == 0) returnAll(result, instances);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSOrderedComponent);
  return kStatusOk;
}

static CMPIStatus DNSOrderedComponent_GetInstance(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                                  const CMPIObjectPath* ref, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSOrderedComponent);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (keyCountOf(ref, &status) == 0) {
    logError(loggerDNSOrderedComponent, ZV_HERE, "At least one key should be passed");
  } else if (DNSOrderedComponentCMPIInstances(ref, properties, context, instances) == 0) {
    returnFirstEqual(result, ref, instances, true, &status);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSOrderedComponent);
  return status;
}

static CMPIStatus DNSOrderedComponent_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                  const CMPIResult* result, const CMPIObjectPath* ref,
                                                  const char* assocClass, const char* resultClass, const char*,
                                                  const char*, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSOrderedComponent);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsOrderedComponentClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSOrderedComponent, ZV_HERE, "Object Path is NULL in Associators.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  const std::string sourceID = keyText(ref, "InstanceID", &status);
  std::string target;
  if (farEndClass == ipAssignmentSettingDataClass) {
    if (!passesResultClass(resultClass, ipAssignmentSettingDataClass, "CIM_IPAssignmentSettingData")) return status;
    CMPIObjectPath* assignmentClass = newPath(broker, nameSpaceOf(ref, &status), ipAssignmentSettingDataClass, &status);
    if (isMissing(assignmentClass, loggerDNSOrderedComponent, ZV_HERE,
                  "Create CMPIObjectPath failed for ipAssignmentSettingDataClass.")) {
      return status;
    }
    const CMPIEnumeration* assignments = enumerateInstances(broker, context, assignmentClass, &status);
    if (status.rc != CMPI_RC_OK) {  // the text names the other call
      logError(loggerDNSOrderedComponent, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(assignments, &status)) {
      const CMPIInstance* assignment = nextInstance(assignments, &status);
      const std::string instanceID = keyText(objectPathOf(assignment, &status), "InstanceID", &status);
      if (!requireTarget(instanceID, target, ZV_HERE)) return status;
      if (target == sourceID) returnInstance(result, assignment);
    }
  } else if (farEndClass == dnsSettingDataClass) {
    if (!passesResultClass(resultClass, dnsSettingDataClass, "CIM_DNSSettingData")) return status;
    std::vector<CMPIInstance*> settings;
    if (getAllDNSSettingDataCMPIInstances(broker, ref, properties, &settings, &status) != 0) {
      logError(loggerDNSOrderedComponent, ZV_HERE, "getAllDNSSettingDataCMPIInstances Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      const CMPIInstance* setting = settings.at(i);
      const std::string instanceID = keyText(objectPathOf(setting, &status), "InstanceID", &status);
      if (!requireTarget(sourceID, target, ZV_HERE)) return status;  // tested only once there is a candidate
      if (target == instanceID) returnInstance(result, setting);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSOrderedComponent);
  return status;
}

static CMPIStatus DNSOrderedComponent_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                      const CMPIResult* result, const CMPIObjectPath* ref,
                                                      const char* assocClass, const char* resultClass, const char*,
                                                      const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSOrderedComponent);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsOrderedComponentClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSOrderedComponent, ZV_HERE, "Object Path is NULL in Associators.")) {
    return status;  // the text of the associators
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  const std::string sourceID = keyText(ref, "InstanceID", &status);
  std::string target;
  if (farEndClass == ipAssignmentSettingDataClass) {
    if (!passesResultClass(resultClass, ipAssignmentSettingDataClass, "CIM_IPAssignmentSettingData")) return status;
    CMPIObjectPath* assignmentClass = newPath(broker, nameSpaceOf(ref, &status), ipAssignmentSettingDataClass, &status);
    if (isMissing(assignmentClass, loggerDNSOrderedComponent, ZV_HERE,  // a class that is not touched here
                  "Create CMPIObjectPath failed for ComputerSystem.")) {
      return status;
    }
    const CMPIEnumeration* assignments = enumerateInstanceNames(broker, context, assignmentClass, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSOrderedComponent, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(assignments, &status)) {
      const CMPIObjectPath* assignment = nextPath(assignments, &status);
      if (!requireTarget(keyText(assignment, "InstanceID", &status), target, ZV_HERE)) return status;
      if (target == sourceID) returnObjectPath(result, assignment);
    }
  } else if (farEndClass == dnsSettingDataClass) {
    if (!passesResultClass(resultClass, dnsSettingDataClass, "CIM_DNSSettingData")) return status;
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
      logError(loggerDNSOrderedComponent, ZV_HERE, "getAllDNSSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      const CMPIObjectPath* setting = settings.at(i);
      const std::string instanceID = keyText(setting, "InstanceID", &status);
      if (!requireTarget(sourceID, target, ZV_HERE)) return status;
      if (target == instanceID) returnObjectPath(result, setting);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSOrderedComponent);
  return status;
}

static CMPIStatus DNSOrderedComponent_References(CMPIAssociationMI*, const CMPIContext* context,
                                                 const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                 const char*, const char**) {
  ZV_PROVIDER_ENTRY(loggerDNSOrderedComponent);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsOrderedComponentClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newPath(broker, nameSpace, dnsOrderedComponentClass, &status);  // no host
  if (isMissing(farEnd, loggerDNSOrderedComponent, ZV_HERE, "Object Path is NULL in References.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  const std::string sourceID = keyText(ref, "InstanceID", &status);
  std::string target;
  if (farEndClass == dnsSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSSettingDataCMPIObjectPaths(broker, farEnd, &settings, &status) != 0) {
      logError(loggerDNSOrderedComponent, ZV_HERE, "getAllDNSSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      CMPIObjectPath* setting = settings.at(i);
      CMPIInstance* reference = newInstance(broker, association, &status);  // for every candidate, matched or not
      const std::string instanceID = keyText(setting, "InstanceID", &status);
      if (!requireTarget(sourceID, target, ZV_HERE)) return status;
      if (target != instanceID) continue;
      setNameSpaceAndHost(setting, nameSpace);
      setReference(reference, "GroupComponent", ref);
      setReference(reference, "PartComponent", setting);
      setUint64(reference, "AssignedSequence", kAssignedSequence);
      returnInstance(result, reference);
    }
  } else if (farEndClass == ipAssignmentSettingDataClass) {
    const CMPIEnumeration* assignments = enumerateInstanceNames(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSOrderedComponent, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(assignments, &status)) {
      const CMPIObjectPath* assignment = nextPath(assignments, &status);
      if (!requireTarget(keyText(assignment, "InstanceID", &status), target, ZV_HERE)) return status;
      if (target != sourceID) continue;
      // The part is the far end's class without keys, not the source; the reference names have the source.
      CMPIInstance* reference =
          newPair(broker, association, "GroupComponent", assignment, "PartComponent", farEnd, &status);
      setUint64(reference, "AssignedSequence", kAssignedSequence);
      returnInstance(result, reference);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSOrderedComponent);
  return status;
}

static CMPIStatus DNSOrderedComponent_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                     const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                     const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSOrderedComponent);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsOrderedComponentClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newPath(broker, nameSpace, dnsOrderedComponentClass, &status);
  if (isMissing(farEnd, loggerDNSOrderedComponent, ZV_HERE, "Object Path is NULL in References.")) {
    return status;  // the text of the references
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  const std::string sourceID = keyText(ref, "InstanceID", &status);
  std::string target;
  if (farEndClass == dnsSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSSettingDataCMPIObjectPaths(broker, farEnd, &settings, &status) != 0) {
      logError(loggerDNSOrderedComponent, ZV_HERE, "getAllDNSSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      CMPIObjectPath* setting = settings.at(i);
      CMPIInstance* reference = newInstance(broker, association, &status);  // for every candidate, matched or not
      const std::string instanceID = keyText(setting, "InstanceID", &status);
      if (!requireTarget(sourceID, target, ZV_HERE)) return status;
      if (target != instanceID) continue;
      setNameSpaceAndHost(setting, nameSpace);
      setReference(reference, "GroupComponent", ref);
      setReference(reference, "PartComponent", setting);
      setUint64(reference, "AssignedSequence", kAssignedSequence);
      CMPIObjectPath* path = objectPathOf(reference, &status);
      setNameSpace(path, nameSpace);
      returnObjectPath(result, path);
    }
  } else if (farEndClass == ipAssignmentSettingDataClass) {
    const CMPIEnumeration* assignments = enumerateInstanceNames(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSOrderedComponent, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(assignments, &status)) {
      const CMPIObjectPath* assignment = nextPath(assignments, &status);
      if (!requireTarget(keyText(assignment, "InstanceID", &status), target, ZV_HERE)) return status;
      if (target != sourceID) continue;
      CMPIInstance* reference =
          newPair(broker, association, "GroupComponent", assignment, "PartComponent", ref, &status);
      setUint64(reference, "AssignedSequence", kAssignedSequence);
      CMPIObjectPath* path = objectPathOf(reference, &status);
      setNameSpace(path, nameSpace);
      returnObjectPath(result, path);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSOrderedComponent);
  return status;
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSOrderedComponent)
ZV_REFUSED_MODIFICATION(DNSOrderedComponent)
ZV_ASSOCIATION_CLEANUP(DNSOrderedComponent)

}  // namespace ZV

ZV_INSTANCE_MI(DNSOrderedComponentProvider, DNSOrderedComponent)
ZV_ASSOCIATION_MI(DNSOrderedComponentProvider, DNSOrderedComponent)
