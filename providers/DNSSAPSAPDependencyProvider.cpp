// ZORVA_DNSSAPSAPDependency: the IP endpoint below each DNS endpoint. Instance and association provider; the IP
// endpoints are served by another provider and read through the broker.
//
// There are two rules for matching. The enumerations, and the associators of an IP endpoint, compare whole names. The
// references, and the associators of a DNS endpoint, compare the first part of the IP endpoint's name, up to a "_",
// with the DNS endpoint's name: an interface's further addresses are named that way.

#include "factory/ClassNames.h"
#include "factory/DNSClientObjFactory.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"

namespace ZV {

static const Association sapDependency = {"Zorvagent.DNSSAPSAPDependencyProvider", dnsSAPSAPDependencyClass,
                                          kPathsOnThisHost, kAntecedentAndDependent};

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
                  CMPIInstance*& endpoint, const Place& place = Place::here()) {
  endpoint = nullptr;
  const CMPIString* name = stringOf(getKey(ipEndpoint, "Name", &operation.status));
  if (!isGood(name)) return true;
  return factory.getDNSClientCMPIInstanceFromIPInterface(broker, operation.ref, textOf(name, &operation.status),
                                                         endpoint, isObjPath, operation.properties,
                                                         &operation.status) == 0 ||
         complain(operation, "getDNSClientCMPIInstanceFromIPInterface Failed", place);
}

}  // namespace

static unsigned short DNSSAPSAPDependencyCMPIInstances(Operation operation, std::vector<CMPIInstance*>& instances) {
  operation = enter(operation, sapDependency.category);
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  const auto ipEndpoints = askForAll<CMPIObjectPath>(operation, nameSpace, ipInterfaceClass,
                                                     "Create CMPIObjectPath failed for IpInterfaceClass.");
  if (!ipEndpoints) return 1;
  while (hasNext(*ipEndpoints, &operation.status)) {
    const CMPIObjectPath* ipEndpoint = nextPath(*ipEndpoints, &operation.status);
    CMPIInstance* endpoint = nullptr;
    if (!findEndpoint(operation, factory, ipEndpoint, false, endpoint)) return 1;
    if (!isGood(endpoint)) continue;
    CMPIObjectPath* endpointPath = objectPathOf(endpoint, &operation.status);
    if (isMissing(operation, endpointPath, "CMPIObjectPath is NULL for DNS Client")) return 1;
    setNameSpaceAndHost(endpointPath, nameSpace);
    CMPIObjectPath* path = newHostPath(broker, nameSpace, sapDependency.className, &operation.status);
    if (isMissing(operation, path, "Create CMPIObjectPath failed for \t\t\t\tDNSSAPSAPDependency.")) return 1;
    CMPIInstance* instance = newInstance(broker, path, &operation.status);
    if (!isGood(instance)) continue;
    setPairFilter(operation, sapDependency, instance);
    setPair(instance, sapDependency, ipEndpoint, endpointPath);
    instances.push_back(instance);
  }
  return endBuilder(operation);
}

ZV_BUILT_INSTANCES(DNSSAPSAPDependency, sapDependency, DNSSAPSAPDependencyCMPIInstances)

// Returns each path at once: after a later failure these paths are already delivered, and the result stays open.
static CMPIStatus DNSSAPSAPDependency_EnumInstanceNames(Operation operation) {
  operation = enter(operation, sapDependency.category);
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  const auto ipEndpoints = askForAll<CMPIObjectPath>(operation, nameSpace, ipInterfaceClass,
                                                     "Create CMPIObjectPath failed for IpInterfaceClass.");
  if (!ipEndpoints) return operation.status;
  while (hasNext(*ipEndpoints, &operation.status)) {
    const CMPIObjectPath* ipEndpoint = nextPath(*ipEndpoints, &operation.status);
    CMPIInstance* endpoint = nullptr;
    if (!findEndpoint(operation, factory, ipEndpoint, true, endpoint)) return operation.status;
    if (!isGood(endpoint)) continue;
    CMPIObjectPath* endpointPath = objectPathOf(endpoint, &operation.status);
    if (isMissing(operation, endpointPath, "CMPIObjectPath is NULL for DNS Client")) return operation.status;
    setNameSpaceAndHost(endpointPath, nameSpace);
    if (!returnPair(operation, sapDependency, nameSpace,
                    "Create CMPIObjectPath failed for \t\t\t\tdnsSAPSAPDependencyClass.", ipEndpoint, endpointPath)) {
      return operation.status;
    }
  }
  return end(operation);
}

// The four operations below never call returnDone.

template <typename Found>
static CMPIStatus associate(Operation& operation, DNSClientObjFactory& factory, const FarEnd& farEnd) {
  if (farEnd.className == ipInterfaceClass) {
    if (!passesResultClass(operation.resultClass, ipInterfaceClass, "CIM_IPProtocolEndPoint")) return operation.status;
    const std::string name = sourceKey(operation, "Name");
    const auto ipEndpoints = askFor<Found>(operation, farEnd.path,
                                           either<Found>("Call to CBEnumInstances of target Class Failed.",
                                                         "CBEnumInstanceNames Failed for the target Class"));
    if (!ipEndpoints) return operation.status;
    while (hasNext(*ipEndpoints, &operation.status)) {
      Found* ipEndpoint = next<Found>(operation, *ipEndpoints);
      if (!firstTokenEquals(textIn(operation, ipEndpoint, "Name"), name)) continue;
      returnOne(operation, ipEndpoint);
      break;  // only the first match; the references return all
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(operation.resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndPoint")) {
      return operation.status;
    }
    CMPIInstance* endpoint = nullptr;
    if (!findEndpoint(operation, factory, operation.ref, !kReturnsInstances<Found>, endpoint)) return operation.status;
    if (endpoint == nullptr) return endWithoutDone(operation);
    if constexpr (kReturnsInstances<Found>) {
      returnOne(operation, endpoint);
    } else {
      returnOne(operation, objectPathOf(endpoint, &operation.status));
    }
  }
  return endWithoutDone(operation);
}

template <typename Found>
static CMPIStatus refer(Operation& operation, DNSClientObjFactory& factory, const ReferenceParts& parts) {
  const auto& [farEnd, nameSpace, association] = parts;
  if (farEnd.className == dnsProtocolEndPointClass) {
    const auto endpoints = fetchEndpoints<CMPIObjectPath>(operation, factory, farEnd.path);
    if (!endpoints) {
      return fail(operation, "getAllDNSClientCMPIObjPaths Failed");
    }
    for (CMPIObjectPath* endpoint : counted16(*endpoints)) {
      const std::string sourceName = sourceKey(operation, "Name");
      if (!firstTokenEquals(sourceName, keyText(endpoint, "Name", &operation.status))) continue;
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setNameSpaceAndHost(endpoint, nameSpace);
      setPair(reference, sapDependency, operation.ref, endpoint);
      deliverOnThisHost<Found>(operation, reference, nameSpace);
    }
  } else if (farEnd.className == ipInterfaceClass) {
    const auto ipEndpoints = askFor<CMPIObjectPath>(operation, farEnd.path);
    if (!ipEndpoints) return operation.status;
    while (hasNext(*ipEndpoints, &operation.status)) {
      const CMPIObjectPath* ipEndpoint = nextPath(*ipEndpoints, &operation.status);
      const std::string ipName = keyText(ipEndpoint, "Name", &operation.status);
      if (!firstTokenEquals(ipName, sourceKey(operation, "Name"))) continue;
      deliverOnThisHost<Found>(operation, newPair(operation, sapDependency, association, ipEndpoint, operation.ref),
                               nameSpace);
    }
  }
  return endWithoutDone(operation);
}

}  // namespace ZV

ZV_ASSOCIATION_PROVIDER(DNSSAPSAPDependencyProvider, DNSSAPSAPDependency, sapDependency)
