// ZORVA_DNSGeneralElementSettingData: the host-wide DNS settings of the computer system. Instance and association
// provider; the computer systems are served by another provider and read through the broker.
//
// The enumerations pair a system with settings whose InstanceID contains its Name. The association operations compare
// no key.

#include "factory/DNSClientObjFactory.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSGeneralElementSettingData = "Zorvagent.DNSGeneralElementSettingDataProvider";
static const char* const computerSystemClass = "ZORVA_ComputerSystem";
static const char* const dnsGeneralSettingDataClass = "ZORVA_DNSGeneralSettingData";
static const char* const dnsGeneralElementSettingDataClass = "ZORVA_DNSGeneralElementSettingData";

// Both references and the flags: 1 here, 2 for the settings of single endpoints.
static void setAll(const CMPIInstance* instance, const CMPIObjectPath* system, const CMPIObjectPath* setting) {
  setPair(instance, "ManagedElement", system, "SettingData", setting);
  setUint16(instance, "IsCurrent", 1);
  setUint16(instance, "IsDefault", 1);
}

static unsigned short DNSGeneralElementSettingDataCMPIInstances(const CMPIContext* context, const CMPIObjectPath* ref,
                                                                const char** properties,
                                                                std::vector<CMPIInstance*>& instances) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralElementSettingData, context, nullptr, ref);
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  const CMPIEnumeration* systems = nullptr;
  if (!askForNames(operation, nameSpace, computerSystemClass, "Create CMPIObjectPath failed for ComputerSystem.",
                   systems)) {
    return 1;
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &operation.status) != 0) {
    return failAndLeaveBuilder(operation, "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
  }
  while (hasNext(systems, &operation.status)) {
    const CMPIObjectPath* system = nextPath(systems, &operation.status);
    const std::string name = keyText(system, "Name", &operation.status);
    for (CMPIObjectPath* setting : counted16(settings)) {
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNS Client")) return 1;
      if (keyText(setting, "InstanceID", &operation.status).find(name) == std::string::npos) continue;
      setNameSpaceAndHost(setting, nameSpace);
      CMPIInstance* instance = nullptr;
      if (!newBuilt(operation, nameSpace, dnsGeneralElementSettingDataClass,
                    "Create CMPIObjectPath failed for                         DNSGeneralElementSettingData.",
                    instance)) {
        return 1;
      }
      if (isGood(instance)) {
        setPropertyFilter(instance, properties, {"ManagedElement", "SettingData"});
        setAll(instance, system, setting);
        instances.push_back(instance);
      } else {
        complain(operation, "Key is not matched");
      }
    }
  }
  markExit(operation);
  return 0;
}

// Returns each path at once: after a later failure these paths are already delivered, and the result stays open.
static CMPIStatus DNSGeneralElementSettingData_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                                 const CMPIResult* result, const CMPIObjectPath* ref) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralElementSettingData, context, result, ref);
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  const CMPIEnumeration* systems = nullptr;
  if (!askForNames(operation, nameSpace, computerSystemClass, "Create CMPIObjectPath failed for computerSystemClass.",
                   systems)) {
    return operation.status;
  }
  std::vector<CMPIObjectPath*> settings;
  if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, &settings, &operation.status) != 0) {
    return fail(operation, "getAllDNSGeneralSettingDataCMPIObjectPaths failed");
  }
  while (hasNext(systems, &operation.status)) {
    const CMPIObjectPath* system = nextPath(systems, &operation.status);
    const std::string name = keyText(system, "Name", &operation.status);
    for (CMPIObjectPath* setting : counted16(settings)) {
      if (keyText(setting, "InstanceID", &operation.status).find(name) == std::string::npos) {
        complain(operation, "Key is not matched");
        continue;
      }
      // Checked only after its key was read.
      if (isMissing(operation, setting, "CMPIObjectPath is NULL for DNSGeneralSettingData")) return operation.status;
      setNameSpace(setting, nameSpace);  // the host is set only in the builder
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsGeneralElementSettingDataClass, &operation.status);
      if (isMissing(operation, path,
                    "Create CMPIObjectPath failed for                         DNSGeneralElementSettingData Class")) {
        return operation.status;
      }
      returnPairPath(operation, path, "ManagedElement", system, "SettingData", setting);
    }
  }
  return end(operation);
}

static CMPIStatus DNSGeneralElementSettingData_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                             const CMPIResult* result, const CMPIObjectPath* ref,
                                                             const char** properties) {
  const Operation operation = ZV_OPERATION(loggerDNSGeneralElementSettingData, context, result, ref);
  returnBuilt(operation, DNSGeneralElementSettingDataCMPIInstances, properties);
  return end(operation);
}

static CMPIStatus DNSGeneralElementSettingData_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                           const CMPIResult* result, const CMPIObjectPath* ref,
                                                           const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralElementSettingData, context, result, ref);
  returnEqualBuilt(operation, DNSGeneralElementSettingDataCMPIInstances, properties);
  return end(operation);
}

// The four operations below read no key of the source: every object of the far end counts.

static CMPIStatus DNSGeneralElementSettingData_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                           const CMPIResult* result, const CMPIObjectPath* ref,
                                                           const char* assocClass, const char* resultClass, const char*,
                                                           const char*, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralElementSettingData, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsGeneralElementSettingDataClass),
                                      resultClass, "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == computerSystemClass) {
    if (!passesResultClass(resultClass, computerSystemClass, "CIM_ComputerSystem")) return operation.status;
    const CMPIEnumeration* systems = nullptr;
    if (!askForInstances(operation, nameSpaceOf(ref, &operation.status), computerSystemClass,
                         "Create CMPIObjectPath failed for ComputerSystem.", systems)) {
      return operation.status;
    }
    while (hasNext(systems, &operation.status)) returnInstance(result, nextInstance(systems, &operation.status));
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

static CMPIStatus DNSGeneralElementSettingData_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                               const CMPIResult* result, const CMPIObjectPath* ref,
                                                               const char* assocClass, const char* resultClass,
                                                               const char*, const char*) {
  Operation operation = ZV_OPERATION(loggerDNSGeneralElementSettingData, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsGeneralElementSettingDataClass),
                                      resultClass, "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == computerSystemClass) {
    if (!passesResultClass(resultClass, computerSystemClass, "CIM_ComputerSystem")) return operation.status;
    const CMPIEnumeration* systems = nullptr;
    if (!askForNames(operation, nameSpaceOf(ref, &operation.status), computerSystemClass,
                     "Create CMPIObjectPath failed for ComputerSystem.", systems)) {
      return operation.status;
    }
    while (hasNext(systems, &operation.status)) returnObjectPath(result, nextPath(systems, &operation.status));
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
      resolveReferences(operation, factory, dnsGeneralElementSettingDataClass, newPath,
                        dnsGeneralElementSettingDataClass, "Object Path is NULL in References.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == dnsGeneralSettingDataClass) {
    std::vector<CMPIObjectPath*> settings;
    if (getAllDNSGeneralSettingDataCMPIObjectPaths(broker, farEnd.path, &settings, &operation.status) != 0) {
      return fail(operation, "getAllDNSGeneralSettingDataCMPIObjectPaths Failed");
    }
    for (CMPIObjectPath* setting : counted16(settings)) {
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setNameSpaceAndHost(setting, nameSpace);
      setAll(reference, operation.ref, setting);
      deliver(operation, reference, nameSpace);
    }
  } else if (farEnd.className == computerSystemClass) {
    const CMPIEnumeration* systems = nullptr;
    if (!askForNames(operation, farEnd.path, systems)) return operation.status;
    while (hasNext(systems, &operation.status)) {
      nextPath(systems, &operation.status);  // only counted: each reference names the far end's class without keys
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setAll(reference, farEnd.path, operation.ref);
      deliver(operation, reference, nameSpace);
    }
  }
  return end(operation);
}

static CMPIStatus DNSGeneralElementSettingData_References(CMPIAssociationMI*, const CMPIContext* context,
                                                          const CMPIResult* result, const CMPIObjectPath* ref,
                                                          const char*, const char*, const char**) {
  return refer(ZV_OPERATION(loggerDNSGeneralElementSettingData, context, result, ref), deliverInstance);
}

static CMPIStatus DNSGeneralElementSettingData_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                              const CMPIResult* result, const CMPIObjectPath* ref,
                                                              const char*, const char*) {
  return refer(ZV_OPERATION(loggerDNSGeneralElementSettingData, context, result, ref), deliverPath);
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSGeneralElementSettingData)
ZV_REFUSED_MODIFICATION(DNSGeneralElementSettingData)
ZV_ASSOCIATION_CLEANUP(DNSGeneralElementSettingData)

}  // namespace ZV

ZV_INSTANCE_MI(DNSGeneralElementSettingDataProvider, DNSGeneralElementSettingData)
ZV_ASSOCIATION_MI(DNSGeneralElementSettingDataProvider, DNSGeneralElementSettingData)
