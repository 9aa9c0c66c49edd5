// ZORVA_DNSHostedAccessPoint: the computer system that hosts each DNS endpoint. Instance and association provider; the
// computer systems are served by another provider and read through the broker.
//
// A system's Name is compared with an endpoint's SystemName. For the builder a part of the Name matches too; the names,
// the associators and the references need the whole Name. The associators of a system also leave out the endpoints of
// the service processor.

#include <strings.h>

#include "factory/DNSClientObjFactory.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSHostAccessPoint = "Zorvagent.DNSHostedAccessPointProvider";
static const char* const computerSystemClass = "ZORVA_ComputerSystem";
static const char* const dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
static const char* const dnsHostedAccessPointClass = "ZORVA_DNSHostedAccessPoint";

static unsigned short DNSHostedAccessPointCMPIInstances(const CMPIContext* context, const CMPIObjectPath* ref,
                                                        const char** properties,
                                                        std::vector<CMPIInstance*>& instances) {
  Operation operation = ZV_OPERATION(loggerDNSHostAccessPoint, context, nullptr, ref);
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  const CMPIEnumeration* systems = nullptr;
  if (!askForNames(operation, nameSpace, computerSystemClass, "Create CMPIObjectPath failed for ComputerSystem.",
                   systems)) {
    return 1;
  }
  while (hasNext(systems, &operation.status)) {
    const CMPIObjectPath* system = nextPath(systems, &operation.status);
    const std::string name = keyText(system, "Name", &operation.status);
    std::vector<CMPIObjectPath*> endpoints;
    if (!fetchEndpoints(operation, factory, ref, endpoints)) {
      return failBuilder(operation,
                         "***Can't get DNS Client ObjectPaths.                 Exiting EnumerateInstanceNames***");
    }
    for (CMPIObjectPath* endpoint : counted16(endpoints)) {
      if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Client")) return 1;
      if (name.find(keyText(endpoint, "SystemName", &operation.status)) == std::string::npos) continue;
      setNameSpace(endpoint, nameSpace);
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsHostedAccessPointClass, &operation.status);
      if (isMissing(operation, path,
                    "Create CMPIObjectPath failed for                     dnsHostedAccessPointClass.")) {
        return 1;
      }
      CMPIInstance* instance = newInstance(broker, path, &operation.status);
      setPropertyFilter(instance, properties, {"Antecedent", "Dependent"});
      setPair(instance, "Antecedent", system, "Dependent", endpoint);
      instances.push_back(instance);  // good or not
    }
  }
  markExit(operation);
  return 0;
}

// Returns each path at once: after a later failure these paths are already delivered, and the result stays open.
static CMPIStatus DNSHostedAccessPoint_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                         const CMPIResult* result, const CMPIObjectPath* ref) {
  Operation operation = ZV_OPERATION(loggerDNSHostAccessPoint, context, result, ref);
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  const CMPIEnumeration* systems = nullptr;
  if (!askForNames(operation, nameSpace, computerSystemClass, "Create CMPIObjectPath failed for ComputerSystem.",
                   systems)) {
    return operation.status;
  }
  while (hasNext(systems, &operation.status)) {
    const CMPIObjectPath* system = nextPath(systems, &operation.status);
    const std::string name = keyText(system, "Name", &operation.status);
    std::vector<CMPIObjectPath*> endpoints;
    if (!fetchEndpoints(operation, factory, ref, endpoints)) {
      return fail(operation, "***Can't get DNS Client ObjectPaths.                  Exiting EnumerateInstanceNames***");
    }
    for (CMPIObjectPath* endpoint : counted16(endpoints)) {
      if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Client")) return operation.status;
      if (name != keyText(endpoint, "SystemName", &operation.status)) continue;  // the builder also accepts a part
      setNameSpace(endpoint, nameSpace);
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsHostedAccessPointClass, &operation.status);
      if (isMissing(operation, path,
                    "Create CMPIObjectPath failed for                     dnsHostedAccessPointClass.")) {
        return operation.status;
      }
      returnPairPath(operation, path, "Antecedent", system, "Dependent", endpoint);
    }
  }
  return end(operation);
}

static CMPIStatus DNSHostedAccessPoint_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                     const CMPIResult* result, const CMPIObjectPath* ref,
                                                     const char** properties) {
  const Operation operation = ZV_OPERATION(loggerDNSHostAccessPoint, context, result, ref);
  returnBuilt(operation, DNSHostedAccessPointCMPIInstances, properties);
  return end(operation);
}

static CMPIStatus DNSHostedAccessPoint_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                   const CMPIResult* result, const CMPIObjectPath* ref,
                                                   const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSHostAccessPoint, context, result, ref);
  returnEqualBuilt(operation, DNSHostedAccessPointCMPIInstances, properties);
  return end(operation);
}

// The four operations below never call returnDone.

static bool isOfComputerSystem(const std::string& systemCreationClassName) {
  return strcasecmp(systemCreationClassName.c_str(), computerSystemClass) == 0;
}

static CMPIStatus DNSHostedAccessPoint_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                   const CMPIResult* result, const CMPIObjectPath* ref,
                                                   const char* assocClass, const char* resultClass, const char*,
                                                   const char*, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSHostAccessPoint, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsHostedAccessPointClass),
                                      resultClass, "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == computerSystemClass) {
    const std::string systemName = sourceKey(operation, "SystemName");
    if (!passesResultClass(resultClass, computerSystemClass, "CIM_ComputerSystem")) return operation.status;
    const CMPIEnumeration* systems = nullptr;
    if (!askForInstances(operation, farEnd.path, "CBEnumInstances Failed for the target Class", systems)) {
      return operation.status;
    }
    while (hasNext(systems, &operation.status)) {
      const CMPIInstance* system = nextInstance(systems, &operation.status);
      const CMPIObjectPath* path = objectPathOf(system, &operation.status);
      if (keyText(path, "Name", &operation.status) == systemName) returnInstance(result, system);
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    const std::string name = sourceKey(operation, "Name");
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return operation.status;
    std::vector<CMPIInstance*> endpoints;
    if (!fetchEndpoints(operation, factory, farEnd.path, properties, endpoints)) {
      return fail(operation, "***Can't get DNS Client ObjectPaths.                 Exiting Associators***");
    }
    for (const CMPIInstance* endpoint : counted16(endpoints)) {
      if (propertyText(endpoint, "SystemName", &operation.status) != name) continue;
      if (!isOfComputerSystem(propertyText(endpoint, "SystemCreationClassName", &operation.status))) continue;
      returnInstance(result, endpoint);
    }
  }
  return endWithoutDone(operation);
}

static CMPIStatus DNSHostedAccessPoint_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                       const CMPIResult* result, const CMPIObjectPath* ref,
                                                       const char* assocClass, const char* resultClass, const char*,
                                                       const char*) {
  Operation operation = ZV_OPERATION(loggerDNSHostAccessPoint, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsHostedAccessPointClass),
                                      resultClass, "Object Path is NULL in AssociatorNames.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == computerSystemClass) {
    const std::string systemName = sourceKey(operation, "SystemName");
    if (!passesResultClass(resultClass, computerSystemClass, "CIM_ComputerSystem")) return operation.status;
    const CMPIEnumeration* systems = nullptr;
    if (!askForNames(operation, farEnd.path, systems)) return operation.status;
    while (hasNext(systems, &operation.status)) {
      const CMPIObjectPath* system = nextPath(systems, &operation.status);
      if (keyText(system, "Name", &operation.status) == systemName) returnObjectPath(result, system);
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    const std::string name = sourceKey(operation, "Name");
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return operation.status;
    std::vector<CMPIObjectPath*> endpoints;
    if (!fetchEndpoints(operation, factory, farEnd.path, endpoints)) {
      return fail(operation, "***Can't get Service processor ObjectPaths.                 Exiting AssociatorNames***");
    }
    const std::string nameSpace = nameSpaceOf(ref, &operation.status);
    for (CMPIObjectPath* endpoint : counted16(endpoints)) {
      if (keyText(endpoint, "SystemName", &operation.status) != name) continue;
      if (!isOfComputerSystem(keyText(endpoint, "SystemCreationClassName", &operation.status))) continue;
      setNameSpaceAndHost(endpoint, nameSpace);
      returnObjectPath(result, endpoint);
    }
  }
  return endWithoutDone(operation);
}

static CMPIStatus refer(Operation operation, const char* noFarEnd, Deliver deliver) {
  DNSClientObjFactory factory;
  const auto [farEnd, nameSpace, association] = resolveReferences(operation, factory, dnsHostedAccessPointClass,
                                                                  newHostPath, dnsHostedAccessPointClass, noFarEnd);
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == dnsProtocolEndPointClass) {
    const std::string name = sourceKey(operation, "Name");
    std::vector<CMPIObjectPath*> endpoints;
    if (!fetchEndpoints(operation, factory, farEnd.path, endpoints)) {
      return fail(operation, "***Can't get DNS Client instances                 Exiting References***");
    }
    for (CMPIObjectPath* endpoint : counted16(endpoints)) {
      if (keyText(endpoint, "SystemName", &operation.status) != name) continue;
      CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setNameSpaceAndHost(endpoint, nameSpace);
      setPair(reference, "Antecedent", operation.ref, "Dependent", endpoint);
      deliver(operation, reference, nameSpace);
    }
  } else if (farEnd.className == computerSystemClass) {
    const std::string systemName = sourceKey(operation, "SystemName");
    const CMPIEnumeration* systems = nullptr;
    if (!askForNames(operation, farEnd.path, systems)) return operation.status;
    while (hasNext(systems, &operation.status)) {
      const CMPIObjectPath* system = nextPath(systems, &operation.status);
      if (keyText(system, "Name", &operation.status) != systemName) continue;
      const CMPIInstance* reference = newPair(operation, association, "Antecedent", system, "Dependent", operation.ref);
      deliver(operation, reference, nameSpace);
    }
  }
  return endWithoutDone(operation);
}

static CMPIStatus DNSHostedAccessPoint_References(CMPIAssociationMI*, const CMPIContext* context,
                                                  const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                  const char*, const char**) {
  return refer(ZV_OPERATION(loggerDNSHostAccessPoint, context, result, ref), "Object Path is NULL in References.",
               deliverInstance);
}

static CMPIStatus DNSHostedAccessPoint_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                      const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                      const char*) {
  return refer(ZV_OPERATION(loggerDNSHostAccessPoint, context, result, ref), "Object Path is NULL in ReferenceNames.",
               deliverPathOnThisHost);
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSHostedAccessPoint)
ZV_REFUSED_MODIFICATION(DNSHostedAccessPoint)
ZV_ASSOCIATION_CLEANUP(DNSHostedAccessPoint)

}  // namespace ZV

ZV_INSTANCE_MI(DNSHostedAccessPointProvider, DNSHostedAccessPoint)
ZV_ASSOCIATION_MI(DNSHostedAccessPointProvider, DNSHostedAccessPoint)
