// ZORVA_DNSHostedAccessPoint: the computer system that hosts each DNS endpoint. Instance and association provider; the
// computer systems are served elsewhere and asked for through the broker.
//
// A system's Name is compared with an endpoint's SystemName. The builder takes a part of the Name for a match too; the
// names, the associators and the references want it whole; the associators of a system moreover leave out what hangs on
// the service processor.
#include <strings.h>

#include "factory/DNSClientObjFactory.h"
#include "providers/AssociationSteps.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSHostAccessPoint = "Zorvagent.DNSHostedAccessPointProvider";
static const char* const computerSystemClass = "ZORVA_ComputerSystem";
static const char* const dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
static const char* const dnsHostedAccessPointClass = "ZORVA_DNSHostedAccessPoint";

static unsigned short DNSHostedAccessPointCMPIInstances(const CMPIObjectPath* ref, const char** properties,
                                                        const CMPIContext* context,
                                                        std::vector<CMPIInstance*>& instances) {
  ZV_PROVIDER_ENTRY(loggerDNSHostAccessPoint);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* systemClass = newPath(broker, nameSpace, computerSystemClass, &status);
  if (isMissing(systemClass, loggerDNSHostAccessPoint, ZV_HERE, "Create CMPIObjectPath failed for ComputerSystem.")) {
    return 1;
  }
  const CMPIEnumeration* systems = enumerateInstanceNames(broker, context, systemClass, &status);
  if (status.rc != CMPI_RC_OK) {
    logError(loggerDNSHostAccessPoint, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
    return 1;
  }
  while (hasNext(systems, &status)) {
    const CMPIObjectPath* system = nextPath(systems, &status);
    const std::string name = keyText(system, "Name", &status);
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, ref, endpoints, &status) != 0) {
      logError(loggerDNSHostAccessPoint, ZV_HERE,
               "***Can't get DNS Client ObjectPaths.                 Exiting EnumerateInstanceNames***");
      return 1;
    }
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      CMPIObjectPath* endpoint = endpoints.at(i);
      if (isMissing(endpoint, loggerDNSHostAccessPoint, ZV_HERE, "CMPIObjectPath is NULL for DNS Client")) return 1;
      if (name.find(keyText(endpoint, "SystemName", &status)) == std::string::npos) continue;  // a part will do
      setNameSpace(endpoint, nameSpace);
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsHostedAccessPointClass, &status);
      if (isMissing(path, loggerDNSHostAccessPoint, ZV_HERE,
                    "Create CMPIObjectPath failed for                     dnsHostedAccessPointClass.")) {
        return 1;
      }
      CMPIInstance* instance = newInstance(broker, path, &status);
      if (isGood(instance)) {
        setPropertyFilter(instance, properties, {"Antecedent", "Dependent"});
        setReference(instance, "Antecedent", system);
        setReference(instance, "Dependent", endpoint);
      }
      instances.push_back(instance);  // good or not
    }
  }
  ZV_PROVIDER_EXIT(loggerDNSHostAccessPoint);
  return 0;
}

// Delivers each path at once: a failure further on leaves what went out, and the result open.
static CMPIStatus DNSHostedAccessPoint_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                         const CMPIResult* result, const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSHostAccessPoint);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* systemClass = newPath(broker, nameSpace, computerSystemClass, &status);
  if (isMissing(systemClass, loggerDNSHostAccessPoint, ZV_HERE, "Create CMPIObjectPath failed for ComputerSystem.")) {
    return status;
  }
  const CMPIEnumeration* systems = enumerateInstanceNames(broker, context, systemClass, &status);
  if (status.rc != CMPI_RC_OK) {
    logError(loggerDNSHostAccessPoint, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
    return status;
  }
  while (hasNext(systems, &status)) {
    const CMPIObjectPath* system = nextPath(systems, &status);
    const std::string name = keyText(system, "Name", &status);
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, ref, endpoints, &status) != 0) {
      logError(loggerDNSHostAccessPoint, ZV_HERE,  // one blank more than the builder's text
               "***Can't get DNS Client ObjectPaths.                  Exiting EnumerateInstanceNames***");
      return status;
    }
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      CMPIObjectPath* endpoint = endpoints.at(i);
      if (isMissing(endpoint, loggerDNSHostAccessPoint, ZV_HERE, "CMPIObjectPath is NULL for DNS Client")) {
        return status;
      }
      if (name != keyText(endpoint, "SystemName", &status)) continue;  // stricter than the builder
      setNameSpace(endpoint, nameSpace);
      CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsHostedAccessPointClass, &status);
      if (isMissing(path, loggerDNSHostAccessPoint, ZV_HERE,
                    "Create CMPIObjectPath failed for                     dnsHostedAccessPointClass.")) {
        return status;
      }
      addReferenceKey(path, "Antecedent", system);
      addReferenceKey(path, "Dependent", endpoint);
      returnObjectPath(result, path);
    }
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSHostAccessPoint);
  return status;
}

static CMPIStatus DNSHostedAccessPoint_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                     const CMPIResult* result, const CMPIObjectPath* ref,
                                                     const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSHostAccessPoint);
  std::vector<CMPIInstance*> instances;
  if (DNSHostedAccessPointCMPIInstances(ref, properties, context, instances) == 0) returnAll(result, instances);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSHostAccessPoint);
  return kStatusOk;
}

static CMPIStatus DNSHostedAccessPoint_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                   const CMPIResult* result, const CMPIObjectPath* ref,
                                                   const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSHostAccessPoint);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (keyCountOf(ref, &status) == 0) {
    logError(loggerDNSHostAccessPoint, ZV_HERE, "At least one key should be passed");
  } else if (DNSHostedAccessPointCMPIInstances(ref, properties, context, instances) == 0) {
    returnFirstEqual(result, ref, instances, true, &status);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSHostAccessPoint);
  return status;
}

// The four operations below never call returnDone.

namespace {

bool isOfComputerSystem(const std::string& systemCreationClassName) {
  return strcasecmp(systemCreationClassName.c_str(), computerSystemClass) == 0;
}

}  // namespace

static CMPIStatus DNSHostedAccessPoint_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                   const CMPIResult* result, const CMPIObjectPath* ref,
                                                   const char* assocClass, const char* resultClass, const char*,
                                                   const char*, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSHostAccessPoint);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsHostedAccessPointClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSHostAccessPoint, ZV_HERE, "Object Path is NULL in Associators.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == computerSystemClass) {
    const std::string systemName = keyText(ref, "SystemName", &status);
    if (!passesResultClass(resultClass, computerSystemClass, "CIM_ComputerSystem")) return status;
    const CMPIEnumeration* systems = enumerateInstances(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSHostAccessPoint, ZV_HERE, "CBEnumInstances Failed for the target Class");
      return status;
    }
    while (hasNext(systems, &status)) {
      const CMPIInstance* system = nextInstance(systems, &status);
      if (keyText(objectPathOf(system, &status), "Name", &status) == systemName) returnInstance(result, system);
    }
  } else if (farEndClass == dnsProtocolEndPointClass) {
    const std::string name = keyText(ref, "Name", &status);
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return status;
    std::vector<CMPIInstance*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIInstances(broker, farEnd, properties, false, endpoints, &status) != 0) {
      logError(loggerDNSHostAccessPoint, ZV_HERE,
               "***Can't get DNS Client ObjectPaths.                 Exiting Associators***");
      return status;
    }
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      const CMPIInstance* endpoint = endpoints.at(i);
      if (propertyText(endpoint, "SystemName", &status) != name) continue;
      if (!isOfComputerSystem(propertyText(endpoint, "SystemCreationClassName", &status))) continue;
      returnInstance(result, endpoint);
    }
  }
  ZV_PROVIDER_EXIT(loggerDNSHostAccessPoint);
  return status;
}

static CMPIStatus DNSHostedAccessPoint_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                       const CMPIResult* result, const CMPIObjectPath* ref,
                                                       const char* assocClass, const char* resultClass, const char*,
                                                       const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSHostAccessPoint);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsHostedAccessPointClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSHostAccessPoint, ZV_HERE, "Object Path is NULL in AssociatorNames.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == computerSystemClass) {
    const std::string systemName = keyText(ref, "SystemName", &status);
    if (!passesResultClass(resultClass, computerSystemClass, "CIM_ComputerSystem")) return status;
    const CMPIEnumeration* systems = enumerateInstanceNames(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSHostAccessPoint, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(systems, &status)) {
      const CMPIObjectPath* system = nextPath(systems, &status);
      if (keyText(system, "Name", &status) == systemName) returnObjectPath(result, system);
    }
  } else if (farEndClass == dnsProtocolEndPointClass) {
    const std::string name = keyText(ref, "Name", &status);
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) return status;
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, endpoints, &status) != 0) {
      logError(loggerDNSHostAccessPoint, ZV_HERE,  // the text tells of another object than the one that failed
               "***Can't get Service processor ObjectPaths.                 Exiting AssociatorNames***");
      return status;
    }
    const std::string nameSpace = nameSpaceOf(ref, &status);
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      CMPIObjectPath* endpoint = endpoints.at(i);
      if (keyText(endpoint, "SystemName", &status) != name) continue;
      if (!isOfComputerSystem(keyText(endpoint, "SystemCreationClassName", &status))) continue;
      setNameSpaceAndHost(endpoint, nameSpace);
      returnObjectPath(result, endpoint);
    }
  }
  ZV_PROVIDER_EXIT(loggerDNSHostAccessPoint);
  return status;
}

static CMPIStatus DNSHostedAccessPoint_References(CMPIAssociationMI*, const CMPIContext* context,
                                                  const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                  const char*, const char**) {
  ZV_PROVIDER_ENTRY(loggerDNSHostAccessPoint);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsHostedAccessPointClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newHostPath(broker, nameSpace, dnsHostedAccessPointClass, &status);
  if (isMissing(farEnd, loggerDNSHostAccessPoint, ZV_HERE, "Object Path is NULL in References.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == dnsProtocolEndPointClass) {
    const std::string name = keyText(ref, "Name", &status);
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, endpoints, &status) != 0) {
      logError(loggerDNSHostAccessPoint, ZV_HERE,
               "***Can't get DNS Client instances                 Exiting References***");
      return status;
    }
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      CMPIObjectPath* endpoint = endpoints.at(i);
      if (keyText(endpoint, "SystemName", &status) != name) continue;
      CMPIInstance* reference = newInstance(broker, association, &status);
      setNameSpaceAndHost(endpoint, nameSpace);
      setReference(reference, "Antecedent", ref);
      setReference(reference, "Dependent", endpoint);
      returnInstance(result, reference);
    }
  } else if (farEndClass == computerSystemClass) {
    const std::string systemName = keyText(ref, "SystemName", &status);
    const CMPIEnumeration* systems = enumerateInstanceNames(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSHostAccessPoint, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(systems, &status)) {
      const CMPIObjectPath* system = nextPath(systems, &status);
      if (keyText(system, "Name", &status) != systemName) continue;
      returnInstance(result, newPair(broker, association, "Antecedent", system, "Dependent", ref, &status));
    }
  }
  ZV_PROVIDER_EXIT(loggerDNSHostAccessPoint);
  return status;
}

static CMPIStatus DNSHostedAccessPoint_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                      const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                      const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSHostAccessPoint);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsHostedAccessPointClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newHostPath(broker, nameSpace, dnsHostedAccessPointClass, &status);
  if (isMissing(farEnd, loggerDNSHostAccessPoint, ZV_HERE, "Object Path is NULL in ReferenceNames.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == dnsProtocolEndPointClass) {
    const std::string name = keyText(ref, "Name", &status);
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, endpoints, &status) != 0) {
      logError(loggerDNSHostAccessPoint, ZV_HERE,  // the text of the references
               "***Can't get DNS Client instances                 Exiting References***");
      return status;
    }
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      CMPIObjectPath* endpoint = endpoints.at(i);
      if (keyText(endpoint, "SystemName", &status) != name) continue;
      CMPIInstance* reference = newInstance(broker, association, &status);
      setNameSpaceAndHost(endpoint, nameSpace);
      setReference(reference, "Antecedent", ref);
      setReference(reference, "Dependent", endpoint);
      CMPIObjectPath* path = objectPathOf(reference, &status);
      setNameSpaceAndHost(path, nameSpace);
      returnObjectPath(result, path);
    }
  } else if (farEndClass == computerSystemClass) {
    const std::string systemName = keyText(ref, "SystemName", &status);
    const CMPIEnumeration* systems = enumerateInstanceNames(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSHostAccessPoint, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(systems, &status)) {
      const CMPIObjectPath* system = nextPath(systems, &status);
      if (keyText(system, "Name", &status) != systemName) continue;
      CMPIObjectPath* path =
          objectPathOf(newPair(broker, association, "Antecedent", system, "Dependent", ref, &status), &status);
      setNameSpaceAndHost(path, nameSpace);
      returnObjectPath(result, path);
    }
  }
  ZV_PROVIDER_EXIT(loggerDNSHostAccessPoint);
  return status;
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSHostedAccessPoint)
ZV_REFUSED_MODIFICATION(DNSHostedAccessPoint)
ZV_ASSOCIATION_CLEANUP(DNSHostedAccessPoint)

}  // namespace ZV

ZV_INSTANCE_MI(DNSHostedAccessPointProvider, DNSHostedAccessPoint)
ZV_ASSOCIATION_MI(DNSHostedAccessPointProvider, DNSHostedAccessPoint)
