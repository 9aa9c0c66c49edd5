// ZORVA_DNSGenOrderedComponent: the host-wide DNS settings as a component of each IP assignment setting. Instance and
// association provider; the IP assignment settings are served elsewhere and asked for through the broker. No key
// decides what belongs together.
#include <stdexcept>

#include "factory/DNSClientObjFactory.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "providers/AssociationSteps.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSGeneralOrderedComponent = "Zorvagent.DNSGeneralOrderedComponentProvider";
static const char* const dnsGeneralSettingDataClass = "ZORVA_DNSGeneralSettingData";
static const char* const dnsGenOrderedComponentClass = "ZORVA_DNSGenOrderedComponent";
static const char* const ipAssignmentSettingDataClass = "ZORVA_IPAssignmentSettingData";

static constexpr CMPIUint64 kAssignedSequence = 1;  // the interface's own settings come second

// Throws out of range where there are none; the provider lets that pass, and a server reports a failed operation with
// this text.
static CMPIObjectPath* firstOf(const std::vector<CMPIObjectPath*>& settings) {
  if (settings.empty()) throw std::out_of_range("vector::_M_range_check");
  return settings.front();
}

// Without host-wide settings, and with an IP assignment to pair them with, std::out_of_range leaves this function.
static unsigned short DNSGeneralOrderedComponentCMPIInstances(const CMPIObjectPath* ref, const char** properties,
                                                              const CMPIContext* context,
                                                              std::vector<CMPIInstance*>& instances) {
  // Two equal signs in this source alone.
  logEntry(loggerDNSGeneralOrderedComponent, ZV_HERE, " ref==", ref, " properties==", properties, " ctx==", context,
           " instances==", &instances);
  CMPIStatus status = kStatusOk;
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* assignmentClass = newPath(broker, nameSpace, ipAssignmentSettingDataClass, &status);
  if (isMissing(assignmentClass, loggerDNSGeneralOrderedComponent, ZV_HERE,
                "Create CMPIObjectPath failed for ipAssignmentSettingDataClass.")) {
    return 1;
  }
  const CMPIEnumeration* assignments = enumerateInstanceNames(broker, context, assignmentClass, &status);
  if (status.rc != CMPI_RC_OK) {
    logError(loggerDNSGeneralOrderedComponent, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
    return 1;
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
    logError(loggerDNSGeneralOrderedComponent, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
    ZV_PROVIDER_EXIT(loggerDNSGeneralOrderedComponent);
    return 1;
  }
  while (hasNext(assignments, &status)) {
    const CMPIObjectPath* assignment = nextPath(assignments, &status);
    keyText(assignment, "InstanceID", &status);  // read, as the other below, and compared with nothing
    CMPIObjectPath* setting = firstOf(settings);
    if (isMissing(setting, loggerDNSGeneralOrderedComponent, ZV_HERE, "CMPIObjectPath is NULL for DNS Client")) {
      return 1;
    }
    keyText(setting, "InstanceID", &status);
    setNameSpaceAndHost(setting, nameSpace);
    CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsGenOrderedComponentClass, &status);
    if (isMissing(path, loggerDNSGeneralOrderedComponent, ZV_HERE,
                  "Create CMPIObjectPath failed for                     DNSGeneralOrderedComponent.")) {
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
  logExit(loggerDNSGeneralOrderedComponent, ZV_HERE, " ref==", ref, " properties==", properties, " ctx==", context,
          " instances==", &instances);
  return 0;
}

// Unlike most siblings by way of the builder: nothing goes out before all is built.
static CMPIStatus DNSGeneralOrderedComponent_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                               const CMPIResult* result, const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralOrderedComponent);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (DNSGeneralOrderedComponentCMPIInstances(ref, nullptr, context, instances) == 0) {
    returnPathsOf(result, instances, &status);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralOrderedComponent);
  return status;
}

static CMPIStatus DNSGeneralOrderedComponent_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                           const CMPIResult* result, const CMPIObjectPath* ref,
                                                           const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralOrderedComponent);
  std::vector<CMPIInstance*> instances;
  if (DNSGeneralOrderedComponentCMPIInstances(ref, properties, context, instances) == 0) {
    returnAll(result, instances);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralOrderedComponent);
  return kStatusOk;
}

static CMPIStatus DNSGeneralOrderedComponent_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                         const CMPIResult* result, const CMPIObjectPath* ref,
                                                         const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralOrderedComponent);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (keyCountOf(ref, &status) == 0) {
    logError(loggerDNSGeneralOrderedComponent, ZV_HERE, "At least one key should be passed");
  } else if (DNSGeneralOrderedComponentCMPIInstances(ref, properties, context, instances) == 0) {
    returnFirstEqual(result, ref, instances, true, &status);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralOrderedComponent);
  return status;
}

// No key of the source is read in the four operations below: every object of the far end counts.

static CMPIStatus DNSGeneralOrderedComponent_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                         const CMPIResult* result, const CMPIObjectPath* ref,
                                                         const char* assocClass, const char* resultClass, const char*,
                                                         const char*, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralOrderedComponent);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsGenOrderedComponentClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSGeneralOrderedComponent, ZV_HERE, "Object Path is NULL in Associators.")) {
    return status;
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == ipAssignmentSettingDataClass) {
    if (!passesResultClass(resultClass, ipAssignmentSettingDataClass, "CIM_IPAssignmentSettingData")) return status;
    CMPIObjectPath* assignmentClass = newPath(broker, nameSpaceOf(ref, &status), ipAssignmentSettingDataClass, &status);
    if (isMissing(assignmentClass, loggerDNSGeneralOrderedComponent, ZV_HERE,
                  "Create CMPIObjectPath failed for ipAssignmentSettingDataClass.")) {
      return status;
    }
    const CMPIEnumeration* assignments = enumerateInstances(broker, context, assignmentClass, &status);
    if (status.rc != CMPI_RC_OK) {  // the text names the other call
      logError(loggerDNSGeneralOrderedComponent, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(assignments, &status)) returnInstance(result, nextInstance(assignments, &status));
  } else if (farEndClass == dnsGeneralSettingDataClass) {
    if (!passesResultClass(resultClass, dnsGeneralSettingDataClass, "CIM_DNSGeneralSettingData")) return status;
    std::vector<CMPIInstance*> settings;
    if (getAllDNSGeneralSettingDataCMPIInstances(broker, ref, properties, &settings, &status) != 0) {
      logError(loggerDNSGeneralOrderedComponent, ZV_HERE, "getAllDNSGeneralSettingDataCMPIInstances Failed");
      return status;
    }
    returnAll(result, settings);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralOrderedComponent);
  return status;
}

static CMPIStatus DNSGeneralOrderedComponent_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                             const CMPIResult* result, const CMPIObjectPath* ref,
                                                             const char* assocClass, const char* resultClass,
                                                             const char*, const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralOrderedComponent);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsGenOrderedComponentClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSGeneralOrderedComponent, ZV_HERE, "Object Path is NULL in Associators.")) {
    return status;  // the text of the associators
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == ipAssignmentSettingDataClass) {
    if (!passesResultClass(resultClass, ipAssignmentSettingDataClass, "CIM_IPAssignmentSettingData")) return status;
    CMPIObjectPath* assignmentClass = newPath(broker, nameSpaceOf(ref, &status), ipAssignmentSettingDataClass, &status);
    if (isMissing(assignmentClass, loggerDNSGeneralOrderedComponent, ZV_HERE,  // a class that is not touched here
                  "Create CMPIObjectPath failed for ComputerSystem.")) {
      return status;
    }
    const CMPIEnumeration* assignments = enumerateInstanceNames(broker, context, assignmentClass, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSGeneralOrderedComponent, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(assignments, &status)) returnObjectPath(result, nextPath(assignments, &status));
  } else if (farEndClass == dnsGeneralSettingDataClass) {
    if (!passesResultClass(resultClass, dnsGeneralSettingDataClass, "CIM_DNSGeneralSettingData")) return status;
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
      logError(loggerDNSGeneralOrderedComponent, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
      return status;
    }
    returnAll(result, settings);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralOrderedComponent);
  return status;
}

static CMPIStatus DNSGeneralOrderedComponent_References(CMPIAssociationMI*, const CMPIContext* context,
                                                        const CMPIResult* result, const CMPIObjectPath* ref,
                                                        const char*, const char*, const char**) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralOrderedComponent);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsGenOrderedComponentClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newPath(broker, nameSpace, dnsGenOrderedComponentClass, &status);  // no host
  if (isMissing(farEnd, loggerDNSGeneralOrderedComponent, ZV_HERE, "Object Path is NULL in References.")) {
    return status;
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == dnsGeneralSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, farEnd, &settings, &status) != 0) {
      logError(loggerDNSGeneralOrderedComponent, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {  // every one, not only the first as in the builder
      CMPIObjectPath* setting = settings.at(i);
      CMPIInstance* reference = newInstance(broker, association, &status);
      setNameSpaceAndHost(setting, nameSpace);
      setReference(reference, "GroupComponent", ref);
      setReference(reference, "PartComponent", setting);
      setUint64(reference, "AssignedSequence", kAssignedSequence);
      returnInstance(result, reference);
    }
  } else if (farEndClass == ipAssignmentSettingDataClass) {
    const CMPIEnumeration* assignments = enumerateInstanceNames(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSGeneralOrderedComponent, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(assignments, &status)) {
      nextPath(assignments, &status);  // only counted: each part is the far end's class without keys, and the source
                                       // stands as the group, the reverse of the builder
      CMPIInstance* reference = newPair(broker, association, "GroupComponent", ref, "PartComponent", farEnd, &status);
      setUint64(reference, "AssignedSequence", kAssignedSequence);
      returnInstance(result, reference);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralOrderedComponent);
  return status;
}

static CMPIStatus DNSGeneralOrderedComponent_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                            const CMPIResult* result, const CMPIObjectPath* ref,
                                                            const char*, const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralOrderedComponent);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsGenOrderedComponentClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newPath(broker, nameSpace, dnsGenOrderedComponentClass, &status);
  if (isMissing(farEnd, loggerDNSGeneralOrderedComponent, ZV_HERE, "Object Path is NULL in References.")) {
    return status;  // the text of the references
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == dnsGeneralSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, farEnd, &settings, &status) != 0) {
      logError(loggerDNSGeneralOrderedComponent, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      CMPIObjectPath* setting = settings.at(i);
      CMPIInstance* reference = newInstance(broker, association, &status);
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
      logError(loggerDNSGeneralOrderedComponent, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(assignments, &status)) {
      nextPath(assignments, &status);  // as in the references
      CMPIInstance* reference = newPair(broker, association, "GroupComponent", ref, "PartComponent", farEnd, &status);
      setUint64(reference, "AssignedSequence", kAssignedSequence);
      CMPIObjectPath* path = objectPathOf(reference, &status);
      setNameSpace(path, nameSpace);
      returnObjectPath(result, path);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralOrderedComponent);
  return status;
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSGeneralOrderedComponent)
ZV_REFUSED_MODIFICATION(DNSGeneralOrderedComponent)
ZV_ASSOCIATION_CLEANUP(DNSGeneralOrderedComponent)

}  // namespace ZV

ZV_INSTANCE_MI(DNSGeneralOrderedComponentProvider, DNSGeneralOrderedComponent)
ZV_ASSOCIATION_MI(DNSGeneralOrderedComponentProvider, DNSGeneralOrderedComponent)
