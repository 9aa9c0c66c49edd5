// ZORVA_DNSGeneralElementSettingData: the host-wide DNS settings of the computer system. Instance and association
// provider; the computer systems are served elsewhere and asked for through the broker.
//
// The enumerations pair what belongs together: a system whose Name stands anywhere in the settings' InstanceID. The
// association operations apply no key at all.
#include "factory/DNSClientObjFactory.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "providers/AssociationSteps.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSGeneralElementSettingData = "Zorvagent.DNSGeneralElementSettingDataProvider";
static const char* const computerSystemClass = "ZORVA_ComputerSystem";
static const char* const dnsGeneralSettingDataClass = "ZORVA_DNSGeneralSettingData";
static const char* const dnsGeneralElementSettingDataClass = "ZORVA_DNSGeneralElementSettingData";

// 1, where the settings of single endpoints have 2.
static void setFlags(const CMPIInstance* instance) {
  setUint16(instance, "IsCurrent", 1);
  setUint16(instance, "IsDefault", 1);
}

static unsigned short DNSGeneralElementSettingDataCMPIInstances(const CMPIObjectPath* ref, const char** properties,
                                                                const CMPIContext* context,
                                                                std::vector<CMPIInstance*>& instances) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralElementSettingData);
  CMPIStatus status = kStatusOk;
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* systemClass = newPath(broker, nameSpace, computerSystemClass, &status);
  if (isMissing(systemClass, loggerDNSGeneralElementSettingData, ZV_HERE,
                "Create CMPIObjectPath failed for ComputerSystem.")) {
    return 1;
  }
  const CMPIEnumeration* systems = enumerateInstanceNames(broker, context, systemClass, &status);
  if (status.rc != CMPI_RC_OK) {
    logError(loggerDNSGeneralElementSettingData, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
    return 1;
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
    logError(loggerDNSGeneralElementSettingData, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
    ZV_PROVIDER_EXIT(loggerDNSGeneralElementSettingData);
    return 1;
  }
  while (hasNext(systems, &status)) {
    const CMPIObjectPath* system = nextPath(systems, &status);
    const std::string name = keyText(system, "Name", &status);
    for (unsigned short i = 0; i < count16(settings); ++i) {
      CMPIObjectPath* setting = settings.at(i);
      if (isMissing(setting, loggerDNSGeneralElementSettingData, ZV_HERE, "CMPIObjectPath is NULL for DNS Client")) {
        return 1;  // the text says Client, though the path is of setting data
      }
      if (keyText(setting, "InstanceID", &status).find(name) == std::string::npos) continue;  // without a word
      setNameSpaceAndHost(setting, nameSpace);
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsGeneralElementSettingDataClass, &status);
      if (isMissing(path, loggerDNSGeneralElementSettingData, ZV_HERE,
                    "Create CMPIObjectPath failed for                         DNSGeneralElementSettingData.")) {
        return 1;
      }
      CMPIInstance* instance = newInstance(broker, path, nullptr);
      if (!isGood(instance)) {
        logError(loggerDNSGeneralElementSettingData, ZV_HERE, "Key is not matched");
        continue;
      }
      setPropertyFilter(instance, properties, {"ManagedElement", "SettingData"});
      setReference(instance, "ManagedElement", system);
      setReference(instance, "SettingData", setting);
      setFlags(instance);
      instances.push_back(instance);
    }
  }
  ZV_PROVIDER_EXIT(loggerDNSGeneralElementSettingData);
  return 0;
}

// Delivers each path at once: a failure further on leaves what went out, and the result open.
static CMPIStatus DNSGeneralElementSettingData_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                                 const CMPIResult* result, const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralElementSettingData);
  CMPIStatus status = kStatusOk;
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* systemClass = newPath(broker, nameSpace, computerSystemClass, &status);
  if (isMissing(systemClass, loggerDNSGeneralElementSettingData, ZV_HERE,
                "Create CMPIObjectPath failed for computerSystemClass.")) {
    return status;
  }
  const CMPIEnumeration* systems = enumerateInstanceNames(broker, context, systemClass, &status);
  if (status.rc != CMPI_RC_OK) {
    logError(loggerDNSGeneralElementSettingData, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
    return status;
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
    logError(loggerDNSGeneralElementSettingData, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
    return status;
  }
  while (hasNext(systems, &status)) {
    const CMPIObjectPath* system = nextPath(systems, &status);
    const std::string name = keyText(system, "Name", &status);
    for (unsigned short i = 0; i < count16(settings); ++i) {
      CMPIObjectPath* setting = settings.at(i);
      if (keyText(setting, "InstanceID", &status).find(name) == std::string::npos) {
        logError(loggerDNSGeneralElementSettingData, ZV_HERE, "Key is not matched");
        continue;
      }
      if (isMissing(setting, loggerDNSGeneralElementSettingData, ZV_HERE,  // only after its key was read
                    "CMPIObjectPath is NULL for DNSGeneralSettingData")) {
        return status;
      }
      setNameSpace(setting, nameSpace);  // no host, unlike in the builder
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsGeneralElementSettingDataClass, &status);
      if (isMissing(path, loggerDNSGeneralElementSettingData, ZV_HERE,
                    "Create CMPIObjectPath failed for                         DNSGeneralElementSettingData Class")) {
        return status;
      }
      addReferenceKey(path, "ManagedElement", system);
      addReferenceKey(path, "SettingData", setting);
      returnObjectPath(result, path);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralElementSettingData);
  return status;
}

static CMPIStatus DNSGeneralElementSettingData_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                             const CMPIResult* result, const CMPIObjectPath* ref,
                                                             const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralElementSettingData);
  std::vector<CMPIInstance*> instances;
  if (DNSGeneralElementSettingDataCMPIInstances(ref, properties, context, instances) == 0) {
    returnAll(result, instances);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralElementSettingData);
  return kStatusOk;
}

static CMPIStatus DNSGeneralElementSettingData_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                           const CMPIResult* result, const CMPIObjectPath* ref,
                                                           const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralElementSettingData);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (keyCountOf(ref, &status) == 0) {
    logError(loggerDNSGeneralElementSettingData, ZV_HERE, "At least one key should be passed");
  } else if (DNSGeneralElementSettingDataCMPIInstances(ref, properties, context, instances) == 0) {
    returnFirstEqual(result, ref, instances, true, &status);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralElementSettingData);
  return status;
}

// No key of the source is read in the four operations below: every object of the far end counts.

static CMPIStatus DNSGeneralElementSettingData_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                           const CMPIResult* result, const CMPIObjectPath* ref,
                                                           const char* assocClass, const char* resultClass, const char*,
                                                           const char*, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsGeneralElementSettingDataClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSGeneralElementSettingData, ZV_HERE, "Object Path is NULL in Associators.")) {
    return status;
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == computerSystemClass) {
    if (!passesResultClass(resultClass, computerSystemClass, "CIM_ComputerSystem")) return status;
    CMPIObjectPath* systemClass = newPath(broker, nameSpaceOf(ref, &status), computerSystemClass, &status);
    if (isMissing(systemClass, loggerDNSGeneralElementSettingData, ZV_HERE,
                  "Create CMPIObjectPath failed for ComputerSystem.")) {
      return status;
    }
    const CMPIEnumeration* systems = enumerateInstances(broker, context, systemClass, &status);
    if (status.rc != CMPI_RC_OK) {  // the text names the other call
      logError(loggerDNSGeneralElementSettingData, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(systems, &status)) returnInstance(result, nextInstance(systems, &status));
  } else if (farEndClass == dnsGeneralSettingDataClass) {
    if (!passesResultClass(resultClass, dnsGeneralSettingDataClass, "CIM_DNSGeneralSettingData")) return status;
    std::vector<CMPIInstance*> settings;
    if (getAllDNSGeneralSettingDataCMPIInstances(broker, ref, properties, &settings, &status) != 0) {
      logError(loggerDNSGeneralElementSettingData, ZV_HERE, "getAllDNSGeneralSettingDataCMPIInstances Failed");
      return status;
    }
    returnAll(result, settings);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralElementSettingData);
  return status;
}

static CMPIStatus DNSGeneralElementSettingData_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                               const CMPIResult* result, const CMPIObjectPath* ref,
                                                               const char* assocClass, const char* resultClass,
                                                               const char*, const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsGeneralElementSettingDataClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSGeneralElementSettingData, ZV_HERE, "Object Path is NULL in Associators.")) {
    return status;  // the text of the associators
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == computerSystemClass) {
    if (!passesResultClass(resultClass, computerSystemClass, "CIM_ComputerSystem")) return status;
    CMPIObjectPath* systemClass = newPath(broker, nameSpaceOf(ref, &status), computerSystemClass, &status);
    if (isMissing(systemClass, loggerDNSGeneralElementSettingData, ZV_HERE,
                  "Create CMPIObjectPath failed for ComputerSystem.")) {
      return status;
    }
    const CMPIEnumeration* systems = enumerateInstanceNames(broker, context, systemClass, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSGeneralElementSettingData, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(systems, &status)) returnObjectPath(result, nextPath(systems, &status));
  } else if (farEndClass == dnsGeneralSettingDataClass) {
    if (!passesResultClass(resultClass, dnsGeneralSettingDataClass, "CIM_DNSGeneralSettingData")) return status;
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &status) != 0) {
      logError(loggerDNSGeneralElementSettingData, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
      return status;
    }
    returnAll(result, settings);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralElementSettingData);
  return status;
}

static CMPIStatus DNSGeneralElementSettingData_References(CMPIAssociationMI*, const CMPIContext* context,
                                                          const CMPIResult* result, const CMPIObjectPath* ref,
                                                          const char*, const char*, const char**) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsGeneralElementSettingDataClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newPath(broker, nameSpace, dnsGeneralElementSettingDataClass, &status);  // no host
  if (isMissing(farEnd, loggerDNSGeneralElementSettingData, ZV_HERE, "Object Path is NULL in References.")) {
    return status;
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == dnsGeneralSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, farEnd, &settings, &status) != 0) {
      logError(loggerDNSGeneralElementSettingData, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      CMPIObjectPath* setting = settings.at(i);
      CMPIInstance* reference = newInstance(broker, association, &status);
      setNameSpaceAndHost(setting, nameSpace);
      setReference(reference, "ManagedElement", ref);
      setReference(reference, "SettingData", setting);
      setFlags(reference);
      returnInstance(result, reference);
    }
  } else if (farEndClass == computerSystemClass) {
    const CMPIEnumeration* systems = enumerateInstanceNames(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSGeneralElementSettingData, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(systems, &status)) {
      nextPath(systems, &status);  // only counted: each reference names the far end's class without keys
      CMPIInstance* reference = newPair(broker, association, "ManagedElement", farEnd, "SettingData", ref, &status);
      setFlags(reference);
      returnInstance(result, reference);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralElementSettingData);
  return status;
}

static CMPIStatus DNSGeneralElementSettingData_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                              const CMPIResult* result, const CMPIObjectPath* ref,
                                                              const char*, const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSGeneralElementSettingData);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsGeneralElementSettingDataClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newPath(broker, nameSpace, dnsGeneralElementSettingDataClass, &status);
  if (isMissing(farEnd, loggerDNSGeneralElementSettingData, ZV_HERE, "Object Path is NULL in References.")) {
    return status;  // the text of the references
  }
  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == dnsGeneralSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, farEnd, &settings, &status) != 0) {
      logError(loggerDNSGeneralElementSettingData, ZV_HERE, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(settings); ++i) {
      CMPIObjectPath* setting = settings.at(i);
      CMPIInstance* reference = newInstance(broker, association, &status);
      setNameSpaceAndHost(setting, nameSpace);
      setReference(reference, "ManagedElement", ref);
      setReference(reference, "SettingData", setting);
      setFlags(reference);
      CMPIObjectPath* path = objectPathOf(reference, &status);
      setNameSpace(path, nameSpace);
      returnObjectPath(result, path);
    }
  } else if (farEndClass == computerSystemClass) {
    const CMPIEnumeration* systems = enumerateInstanceNames(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSGeneralElementSettingData, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(systems, &status)) {
      nextPath(systems, &status);  // as in the references
      CMPIInstance* reference = newPair(broker, association, "ManagedElement", farEnd, "SettingData", ref, &status);
      setFlags(reference);
      CMPIObjectPath* path = objectPathOf(reference, &status);
      setNameSpace(path, nameSpace);
      returnObjectPath(result, path);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSGeneralElementSettingData);
  return status;
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSGeneralElementSettingData)
ZV_REFUSED_MODIFICATION(DNSGeneralElementSettingData)
ZV_ASSOCIATION_CLEANUP(DNSGeneralElementSettingData)

}  // namespace ZV

ZV_INSTANCE_MI(DNSGeneralElementSettingDataProvider, DNSGeneralElementSettingData)
ZV_ASSOCIATION_MI(DNSGeneralElementSettingDataProvider, DNSGeneralElementSettingData)
