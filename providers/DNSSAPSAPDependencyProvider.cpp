// ZORVA_DNSSAPSAPDependency: the IP endpoint below each DNS endpoint. Instance and association provider; the IP
// endpoints are served by another provider and read through the broker.
//
// There are two rules for matching. The enumerations, and the associators of an IP endpoint, compare whole names. The
// references, and the associators of a DNS endpoint, compare the first part of the IP endpoint's name, up to a "_",
// with the DNS endpoint's name: an interface's further addresses are named that way.

#include "factory/DNSClientObjFactory.h"
#include "providers/AssociationOperation.h"
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

// Finds the DNS endpoint with an IP endpoint's whole name: null if the path has no name or no endpoint has it. False,
// with an error, if the look-up fails.
bool findEndpoint(Operation& operation, DNSClientObjFactory& factory, const CMPIObjectPath* ipEndpoint, bool isObjPath,
                  const char** properties, CMPIInstance*& endpoint, const Place& place = Place::here()) {
  endpoint = nullptr;
  const CMPIString* name = stringOf(getKey(ipEndpoint, "Name", &operation.status));
  if (!isGood(name)) return true;
  return factory.getDNSClientCMPIInstanceFromIPInterface(broker, operation.ref, textOf(name, &operation.status),
                                                         endpoint, isObjPath, properties, &operation.status) == 0 ||
         complain(operation, "getDNSClientCMPIInstanceFromIPInterface Failed", place);
}

}  // namespace

static unsigned short DNSSAPSAPDependencyCMPIInstances(const CMPIContext* context, const CMPIObjectPath* ref,
                                                       const char** properties, std::vector<CMPIInstance*>& instances) {
  Operation operation = ZV_OPERATION(loggerDNSSAPDependency, context, nullptr, ref);
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  const CMPIEnumeration* ipEndpoints = nullptr;
  if (!askForNames(operation, nameSpace, ipInterfaceClass, "Create CMPIObjectPath failed for IpInterfaceClass.",
                   ipEndpoints)) {
    return 1;
  }
  while (hasNext(ipEndpoints, &operation.status)) {
    const CMPIObjectPath* ipEndpoint = nextPath(ipEndpoints, &operation.status);
    CMPIInstance* endpoint = nullptr;
    if (!findEndpoint(operation, factory, ipEndpoint, false, properties, endpoint)) return 1;
    if (!isGood(endpoint)) continue;
    CMPIObjectPath* endpointPath = objectPathOf(endpoint, &operation.status);
    if (isMissing(operation, endpointPath, "CMPIObjectPath is NULL for DNS Client")) return 1;
    setNameSpaceAndHost(endpointPath, nameSpace);
    CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsSAPSAPDependencyClass, &operation.status);
    if (isMissing(operation, path, "Create CMPIObjectPath failed for \t\t\t\tDNSSAPSAPDependency.")) return 1;
    CMPIInstance* instance = newInstance(broker, path, &operation.status);
    if (!isGood(instance)) continue;
    setPropertyFilter(instance, properties, {"Antecedent", "Dependent"});
    setPair(instance, "Antecedent", ipEndpoint, "Dependent", endpointPath);
    instances.push_back(instance);
  }
  markExit(operation);
  return 0;
}

// Returns each path at once: after a later failure these paths are already delivered, and the result stays open.
static CMPIStatus DNSSAPSAPDependency_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                        const CMPIResult* result, const CMPIObjectPath* ref) {
  Operation operation = ZV_OPERATION(loggerDNSSAPDependency, context, result, ref);
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  const CMPIEnumeration* ipEndpoints = nullptr;
  if (!askForNames(operation, nameSpace, ipInterfaceClass, "Create CMPIObjectPath failed for IpInterfaceClass.",
                   ipEndpoints)) {
    return operation.status;
  }
  while (hasNext(ipEndpoints, &operation.status)) {
    const CMPIObjectPath* ipEndpoint = nextPath(ipEndpoints, &operation.status);
    CMPIInstance* endpoint = nullptr;
    if (!findEndpoint(operation, factory, ipEndpoint, true, nullptr, endpoint)) return operation.status;
    if (!isGood(endpoint)) continue;
    CMPIObjectPath* endpointPath = objectPathOf(endpoint, &operation.status);
    if (isMissing(operation, endpointPath, "CMPIObjectPath is NULL for DNS Client")) return operation.status;
    setNameSpaceAndHost(endpointPath, nameSpace);
    CMPIObjectPath* path = newHostPath(broker, nameSpace, dnsSAPSAPDependencyClass, &operation.status);
    if (isMissing(operation, path, "Create CMPIObjectPath failed for \t\t\t\tdnsSAPSAPDependencyClass.")) {
      return operation.status;
    }
    returnPairPath(operation, path, "Antecedent", ipEndpoint, "Dependent", endpointPath);
  }
  return end(operation);
}

static CMPIStatus DNSSAPSAPDependency_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                    const CMPIResult* result, const CMPIObjectPath* ref,
                                                    const char** properties) {
  const Operation operation = ZV_OPERATION(loggerDNSSAPDependency, context, result, ref);
  returnBuilt(operation, DNSSAPSAPDependencyCMPIInstances, properties);
  return end(operation);
}

static CMPIStatus DNSSAPSAPDependency_GetInstance(CMPIInstanceMI*, const CMPIContext* context, const CMPIResult* result,
                                                  const CMPIObjectPath* ref, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSSAPDependency, context, result, ref);
  returnEqualBuilt(operation, DNSSAPSAPDependencyCMPIInstances, properties);
  return end(operation);
}

// The four operations below never call returnDone.

static CMPIStatus DNSSAPSAPDependency_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                  const CMPIResult* result, const CMPIObjectPath* ref,
                                                  const char* assocClass, const char* resultClass, const char*,
                                                  const char*, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSSAPDependency, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsSAPSAPDependencyClass),
                                      resultClass, "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == ipInterfaceClass) {
    if (!passesResultClass(resultClass, ipInterfaceClass, "CIM_IPProtocolEndPoint")) return operation.status;
    const std::string name = sourceKey(operation, "Name");
    const CMPIEnumeration* ipEndpoints = nullptr;
    if (!askForInstances(operation, farEnd.path, "Call to CBEnumInstances of target Class Failed.", ipEndpoints)) {
      return operation.status;
    }
    while (hasNext(ipEndpoints, &operation.status)) {
      const CMPIInstance* ipEndpoint = nextInstance(ipEndpoints, &operation.status);
      if (!firstTokenEquals(propertyText(ipEndpoint, "Name", &operation.status), name)) continue;
      returnInstance(result, ipEndpoint);
      break;  // only the first match; the references return all
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndPoint")) return operation.status;
    CMPIInstance* endpoint = nullptr;
    if (!findEndpoint(operation, factory, ref, false, properties, endpoint)) return operation.status;
    if (endpoint != nullptr) returnInstance(result, endpoint);
  }
  return endWithoutDone(operation);
}

static CMPIStatus DNSSAPSAPDependency_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                      const CMPIResult* result, const CMPIObjectPath* ref,
                                                      const char* assocClass, const char* resultClass, const char*,
                                                      const char*) {
  Operation operation = ZV_OPERATION(loggerDNSSAPDependency, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd = resolveFarEnd(operation, factory, associationOr(assocClass, dnsSAPSAPDependencyClass),
                                      resultClass, "Object Path is NULL in AssociatorNames.");
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == ipInterfaceClass) {
    if (!passesResultClass(resultClass, ipInterfaceClass, "CIM_IPProtocolEndPoint")) return operation.status;
    const std::string name = sourceKey(operation, "Name");
    const CMPIEnumeration* ipEndpoints = nullptr;
    if (!askForNames(operation, farEnd.path, ipEndpoints)) return operation.status;
    while (hasNext(ipEndpoints, &operation.status)) {
      const CMPIObjectPath* ipEndpoint = nextPath(ipEndpoints, &operation.status);
      if (!firstTokenEquals(keyText(ipEndpoint, "Name", &operation.status), name)) continue;
      returnObjectPath(result, ipEndpoint);
      break;
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndPoint")) return operation.status;
    CMPIInstance* endpoint = nullptr;
    if (!findEndpoint(operation, factory, ref, true, nullptr, endpoint)) return operation.status;
    if (endpoint != nullptr) returnObjectPath(result, objectPathOf(endpoint, &operation.status));
  }
  return endWithoutDone(operation);
}

static CMPIStatus refer(Operation operation, const char* noFarEnd, Deliver deliver) {
  DNSClientObjFactory factory;
  const auto [farEnd, nameSpace, association] =
      resolveReferences(operation, factory, dnsSAPSAPDependencyClass, newHostPath, dnsSAPSAPDependencyClass, noFarEnd);
  if (!isGood(farEnd.path)) return operation.status;
  if (farEnd.className == dnsProtocolEndPointClass) {
    std::vector<CMPIObjectPath*> endpoints;
    if (!fetchEndpoints(operation, factory, farEnd.path, endpoints)) {
      return fail(operation, "getAllDNSClientCMPIObjPaths Failed");
    }
    for (CMPIObjectPath* endpoint : counted16(endpoints)) {
      const std::string sourceName = sourceKey(operation, "Name");
      if (!firstTokenEquals(sourceName, keyText(endpoint, "Name", &operation.status))) continue;
      CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setNameSpaceAndHost(endpoint, nameSpace);
      setPair(reference, "Antecedent", operation.ref, "Dependent", endpoint);
      deliver(operation, reference, nameSpace);
    }
  } else if (farEnd.className == ipInterfaceClass) {
    const CMPIEnumeration* ipEndpoints = nullptr;
    if (!askForNames(operation, farEnd.path, ipEndpoints)) return operation.status;
    while (hasNext(ipEndpoints, &operation.status)) {
      const CMPIObjectPath* ipEndpoint = nextPath(ipEndpoints, &operation.status);
      const std::string ipName = keyText(ipEndpoint, "Name", &operation.status);
      if (!firstTokenEquals(ipName, sourceKey(operation, "Name"))) continue;
      const CMPIInstance* reference =
          newPair(operation, association, "Antecedent", ipEndpoint, "Dependent", operation.ref);
      deliver(operation, reference, nameSpace);
    }
  }
  return endWithoutDone(operation);
}

static CMPIStatus DNSSAPSAPDependency_References(CMPIAssociationMI*, const CMPIContext* context,
                                                 const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                 const char*, const char**) {
  return refer(ZV_OPERATION(loggerDNSSAPDependency, context, result, ref), "Object Path is NULL in References.",
               deliverInstance);
}

static CMPIStatus DNSSAPSAPDependency_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                     const CMPIResult* result, const CMPIObjectPath* ref, const char*,
                                                     const char*) {
  return refer(ZV_OPERATION(loggerDNSSAPDependency, context, result, ref), "Object Path is NULL in ReferenceNames.",
               deliverPathOnThisHost);
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSSAPSAPDependency)
ZV_REFUSED_MODIFICATION(DNSSAPSAPDependency)
ZV_ASSOCIATION_CLEANUP(DNSSAPSAPDependency)

}  // namespace ZV

ZV_INSTANCE_MI(DNSSAPSAPDependencyProvider, DNSSAPSAPDependency)
ZV_ASSOCIATION_MI(DNSSAPSAPDependencyProvider, DNSSAPSAPDependency)
