// ZORVA_DNSSAPSAPDependency: the IP endpoint beneath each DNS endpoint. Instance and association provider; the IP
// endpoints are served elsewhere and asked for through the broker.
//
// Two rules tell what belongs together. The enumerations, and the associators of an IP endpoint, compare whole names.
// The references, and the associators of a DNS endpoint, compare the first part of the IP endpoint's name, up to a "_",
// with the DNS endpoint's: an interface's further addresses are named that way.
#include "factory/DNSClientObjFactory.h"
#include "providers/AssociationSteps.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSSAPDependency = "Zorvagent.DNSSAPSAPDependencyProvider";
static const char* const dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
static const char* const dnsSAPSAPDependencyClass = "ZORVA_DNSSAPSAPDependency";
static const char* const ipInterfaceClass = "ZORVA_IPProtocolEndpoint";

namespace {

// A name without a token matches nothing.
bool firstTokenEquals(const std::string& ipName, const std::string& dnsName) {
  std::vector<std::string> tokens;
  Tokenize(ipName, tokens, "_");
  return !tokens.empty() && tokens.front() == dnsName;
}

// Looks for the DNS endpoint of an IP endpoint's whole name: null where the path has no name or no endpoint has it.
// False, with a line to the log, where the look-up fails.
bool findEndpoint(DNSClientObjFactory& factory, const CMPIObjectPath* ref, const CMPIObjectPath* ipEndpoint,
                  bool isObjPath, const char** properties, const LogSite& site, CMPIInstance*& endpoint,
                  CMPIStatus* status) {
  endpoint = nullptr;
  const CMPIString* name = stringOf(getKey(ipEndpoint, "Name", status));
  if (!isGood(name)) return true;
  if (factory.getDNSClientCMPIInstanceFromIPInterface(broker, ref, textOf(name, status), endpoint, isObjPath,
                                                      properties, status) == 0) {
    return true;
  }
  logError(loggerDNSSAPDependency, site, "getDNSClientCMPIInstanceFromIPInterface Failed");
  return false;
}

}  // namespace

static unsigned short DNSSAPSAPDependencyCMPIInstances(const CMPIObjectPath* ref, const char** properties,
                                                       const CMPIContext* context,
                                                       std::vector<CMPIInstance*>& instances) {
  ZV_PROVIDER_ENTRY(loggerDNSSAPDependency);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* ipClass = newPath(broker, nameSpace, ipInterfaceClass, &status);
  if (isMissing(ipClass, loggerDNSSAPDependency, ZV_HERE, "Create CMPIObjectPath failed for IpInterfaceClass.")) {
    return 1;
  }
  const CMPIEnumeration* ipEndpoints = enumerateInstanceNames(broker, context, ipClass, &status);
  if (status.rc != CMPI_RC_OK) {
    logError(loggerDNSSAPDependency, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
    return 1;
  }
  while (hasNext(ipEndpoints, &status)) {
    const CMPIObjectPath* ipEndpoint = nextPath(ipEndpoints, &status);
    CMPIInstance* endpoint = nullptr;
    if (!findEndpoint(factory, ref, ipEndpoint, false, properties, ZV_HERE, endpoint, &status)) return 1;
    if (!isGood(endpoint)) continue;
    CMPIObjectPath* endpointPath = objectPathOf(endpoint, &status);
    if (isMissing(endpointPath, loggerDNSSAPDependency, ZV_HERE, "CMPIObjectPath is NULL for DNS Client")) return 1;
    setNameSpaceAndHost(endpointPath, nameSpace);
    CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsSAPSAPDependencyClass, &status);
    if (isMissing(path, loggerDNSSAPDependency, ZV_HERE,
                  "Create CMPIObjectPath failed for \t\t\t\tDNSSAPSAPDependency.")) {
      return 1;
    }
    CMPIInstance* instance = newInstance(broker, path, &status);
    if (!isGood(instance)) continue;
    setPropertyFilter(instance, properties, {"Antecedent", "Dependent"});
    setReference(instance, "Antecedent", ipEndpoint);
    setReference(instance, "Dependent", endpointPath);
    instances.push_back(instance);
  }
  ZV_PROVIDER_EXIT(loggerDNSSAPDependency);
  return 0;
}

// Delivers each path at once: a failure further on leaves what went out, and the result open.
static CMPIStatus DNSSAPSAPDependency_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                        const CMPIResult* result, const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSSAPDependency);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* ipClass = newPath(broker, nameSpace, ipInterfaceClass, &status);
  if (isMissing(ipClass, loggerDNSSAPDependency, ZV_HERE, "Create CMPIObjectPath failed for IpInterfaceClass.")) {
    return status;
  }
  const CMPIEnumeration* ipEndpoints = enumerateInstanceNames(broker, context, ipClass, &status);
  if (status.rc != CMPI_RC_OK) {
    logError(loggerDNSSAPDependency, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
    return status;
  }
  while (hasNext(ipEndpoints, &status)) {
    const CMPIObjectPath* ipEndpoint = nextPath(ipEndpoints, &status);
    CMPIInstance* endpoint = nullptr;
    if (!findEndpoint(factory, ref, ipEndpoint, true, nullptr, ZV_HERE, endpoint, &status)) return status;
    if (!isGood(endpoint)) continue;
    CMPIObjectPath* endpointPath = objectPathOf(endpoint, &status);
    if (isMissing(endpointPath, loggerDNSSAPDependency, ZV_HERE, "CMPIObjectPath is NULL for DNS Client")) {
      return status;
    }
    setNameSpaceAndHost(endpointPath, nameSpace);
    CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsSAPSAPDependencyClass, &status);
    if (isMissing(path, loggerDNSSAPDependency, ZV_HERE,
                  "Create CMPIObjectPath failed for \t\t\t\tdnsSAPSAPDependencyClass.")) {
      return status;
    }
    addReferenceKey(path, "Antecedent", ipEndpoint);
    addReferenceKey(path, "Dependent", endpointPath);
    returnObjectPath(result, path);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSSAPDependency);
  return status;
}

static CMPIStatus DNSSAPSAPDependency_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                    const CMPIResult* result, const CMPIObjectPath* ref,
                                                    const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSSAPDependency);
  std::vector<CMPIInstance*> instances;
  if (DNSSAPSAPDependencyCMPIInstances(ref, properties, context, instances) == 0) returnAll(result, instances);
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSSAPDependency);
  return kStatusOk;
}

static CMPIStatus DNSSAPSAPDependency_GetInstance(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                                  const CMPIObjectPath* ref, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSSAPDependency);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (keyCountOf(ref, &status) == 0) {
    logError(loggerDNSSAPDependency, ZV_HERE, "At least one key should be passed");
  } else if (DNSSAPSAPDependencyCMPIInstances(ref, properties, context, instances) == 0) {
    returnFirstEqual(result, ref, instances, true, &status);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSSAPDependency);
  return status;
}

// The four operations below never call returnDone.

static CMPIStatus DNSSAPSAPDependency_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                  const CMPIResult* result, const CMPIObjectPath* ref,
                                                  const char* assocClass, const char* resultClass, const char*,
                                                  const char*, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSSAPDependency);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsSAPSAPDependencyClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSSAPDependency, ZV_HERE, "Object Path is NULL in Associators.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == ipInterfaceClass) {
    if (!passesResultClass(resultClass, ipInterfaceClass, "CIM_IPProtocolEndPoint")) return status;
    const std::string name = keyText(ref, "Name", &status);
    const CMPIEnumeration* ipEndpoints = enumerateInstances(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSSAPDependency, ZV_HERE, "Call to CBEnumInstances of target Class Failed.");
      return status;
    }
    while (hasNext(ipEndpoints, &status)) {
      const CMPIInstance* ipEndpoint = nextInstance(ipEndpoints, &status);
      if (!firstTokenEquals(propertyText(ipEndpoint, "Name", &status), name)) continue;
      returnInstance(result, ipEndpoint);
      break;  // the first match alone, where the references give all
    }
  } else if (farEndClass == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndPoint")) return status;
    CMPIInstance* endpoint = nullptr;
    if (!findEndpoint(factory, ref, ref, false, properties, ZV_HERE, endpoint, &status)) return status;
    if (endpoint != nullptr) returnInstance(result, endpoint);
  }
  ZV_PROVIDER_EXIT(loggerDNSSAPDependency);
  return status;
}

static CMPIStatus DNSSAPSAPDependency_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                      const CMPIResult* result, const CMPIObjectPath* ref,
                                                      const char* assocClass, const char* resultClass, const char*,
                                                      const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSSAPDependency);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, dnsSAPSAPDependencyClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSSAPDependency, ZV_HERE, "Object Path is NULL in AssociatorNames.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == ipInterfaceClass) {
    if (!passesResultClass(resultClass, ipInterfaceClass, "CIM_IPProtocolEndPoint")) return status;
    const std::string name = keyText(ref, "Name", &status);
    const CMPIEnumeration* ipEndpoints = enumerateInstanceNames(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSSAPDependency, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(ipEndpoints, &status)) {
      const CMPIObjectPath* ipEndpoint = nextPath(ipEndpoints, &status);
      if (!firstTokenEquals(keyText(ipEndpoint, "Name", &status), name)) continue;
      returnObjectPath(result, ipEndpoint);  // as it came from the broker
      break;
    }
  } else if (farEndClass == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndPoint")) return status;
    CMPIInstance* endpoint = nullptr;
    if (!findEndpoint(factory, ref, ref, true, nullptr, ZV_HERE, endpoint, &status)) return status;
    if (endpoint != nullptr) returnObjectPath(result, objectPathOf(endpoint, &status));
  }
  ZV_PROVIDER_EXIT(loggerDNSSAPDependency);
  return status;
}

static CMPIStatus DNSSAPSAPDependency_References(CMPIAssociationMI*, const CMPIContext* context,
                                                 const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                 const char*, const char**) {
  ZV_PROVIDER_ENTRY(loggerDNSSAPDependency);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsSAPSAPDependencyClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newHostPath(broker, nameSpace, dnsSAPSAPDependencyClass, &status);
  if (isMissing(farEnd, loggerDNSSAPDependency, ZV_HERE, "Object Path is NULL in References.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == dnsProtocolEndPointClass) {
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, endpoints, &status) != 0) {
      logError(loggerDNSSAPDependency, ZV_HERE, "getAllDNSClientCMPIObjPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      CMPIObjectPath* endpoint = endpoints.at(i);
      const std::string sourceName = keyText(ref, "Name", &status);
      if (!firstTokenEquals(sourceName, keyText(endpoint, "Name", &status))) continue;
      CMPIInstance* reference = newInstance(broker, association, &status);
      setNameSpaceAndHost(endpoint, nameSpace);
      setReference(reference, "Antecedent", ref);
      setReference(reference, "Dependent", endpoint);
      returnInstance(result, reference);
    }
  } else if (farEndClass == ipInterfaceClass) {
    const CMPIEnumeration* ipEndpoints = enumerateInstanceNames(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSSAPDependency, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(ipEndpoints, &status)) {
      const CMPIObjectPath* ipEndpoint = nextPath(ipEndpoints, &status);
      const std::string ipName = keyText(ipEndpoint, "Name", &status);
      if (!firstTokenEquals(ipName, keyText(ref, "Name", &status))) continue;
      returnInstance(result, newPair(broker, association, "Antecedent", ipEndpoint, "Dependent", ref, &status));
    }
  }
  ZV_PROVIDER_EXIT(loggerDNSSAPDependency);
  return status;
}

static CMPIStatus DNSSAPSAPDependency_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                     const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                     const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSSAPDependency);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, dnsSAPSAPDependencyClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newHostPath(broker, nameSpace, dnsSAPSAPDependencyClass, &status);
  if (isMissing(farEnd, loggerDNSSAPDependency, ZV_HERE, "Object Path is NULL in ReferenceNames.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  if (farEndClass == dnsProtocolEndPointClass) {
    std::vector<CMPIObjectPath*> endpoints;
    endpoints.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, endpoints, &status) != 0) {
      logError(loggerDNSSAPDependency, ZV_HERE, "getAllDNSClientCMPIObjPaths Failed");
      return status;
    }
    for (unsigned short i = 0; i < count16(endpoints); ++i) {
      CMPIObjectPath* endpoint = endpoints.at(i);
      const std::string sourceName = keyText(ref, "Name", &status);
      if (!firstTokenEquals(sourceName, keyText(endpoint, "Name", &status))) continue;
      CMPIInstance* reference = newInstance(broker, association, &status);
      setNameSpaceAndHost(endpoint, nameSpace);
      setReference(reference, "Antecedent", ref);
      setReference(reference, "Dependent", endpoint);
      CMPIObjectPath* path = objectPathOf(reference, &status);
      setNameSpaceAndHost(path, nameSpace);
      returnObjectPath(result, path);
    }
  } else if (farEndClass == ipInterfaceClass) {
    const CMPIEnumeration* ipEndpoints = enumerateInstanceNames(broker, context, farEnd, &status);
    if (status.rc != CMPI_RC_OK) {
      logError(loggerDNSSAPDependency, ZV_HERE, "CBEnumInstanceNames Failed for the target Class");
      return status;
    }
    while (hasNext(ipEndpoints, &status)) {
      const CMPIObjectPath* ipEndpoint = nextPath(ipEndpoints, &status);
      const std::string ipName = keyText(ipEndpoint, "Name", &status);
      if (!firstTokenEquals(ipName, keyText(ref, "Name", &status))) continue;
      CMPIObjectPath* path =
          objectPathOf(newPair(broker, association, "Antecedent", ipEndpoint, "Dependent", ref, &status), &status);
      setNameSpaceAndHost(path, nameSpace);
      returnObjectPath(result, path);
    }
  }
  ZV_PROVIDER_EXIT(loggerDNSSAPDependency);
  return status;
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSSAPSAPDependency)
ZV_REFUSED_MODIFICATION(DNSSAPSAPDependency)
ZV_ASSOCIATION_CLEANUP(DNSSAPSAPDependency)

}  // namespace ZV

ZV_INSTANCE_MI(DNSSAPSAPDependencyProvider, DNSSAPSAPDependency)
ZV_ASSOCIATION_MI(DNSSAPSAPDependencyProvider, DNSSAPSAPDependency)
