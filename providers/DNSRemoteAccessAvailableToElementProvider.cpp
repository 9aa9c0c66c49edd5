// ZORVA_RemoteAccessAvailableToElement: every DNS server is available to every endpoint. Instance and association
// provider; all objects come from the factory.

#include "factory/ClassNames.h"
#include "factory/DNSClientObjFactory.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"

namespace ZV {

static const Association remoteAccess = {"Zorvagent.DNSRemoteAccessAvailableToElementProvider",
                                         remoteAccessAvailableToElementClass, kPathsOnThisHost,
                                         kAntecedentAndDependent};

static unsigned short RemoteAccessAvailableToElementCMPIInstances(Operation operation,
                                                                  std::vector<CMPIInstance*>& instances) {
  operation = named(operation, remoteAccess.category);
  const FlowLog flow(remoteAccess.category, ZV_HERE, " ref=", operation.ref, " properties=", operation.properties,
                     " instances=", &instances);
  DNSClientObjFactory factory;
  const auto servers = fetchServers<CMPIObjectPath>(operation, factory, operation.ref);
  if (!servers) {
    return failBuilder(operation, "***Can't get DNS Server ObjectPaths.             Exiting EnumerateInstanceNames***");
  }
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  for (CMPIObjectPath* server : counted16(*servers)) {
    if (isMissing(operation, server, "CMPIObjectPath is NULL for DNS Server")) return 1;
    const auto clients = fetchEndpoints<CMPIObjectPath>(operation, factory, operation.ref);  // again for every server
    if (!clients) {
      return failBuilder(operation,
                         "***Can't get ObjectPaths for DNSClient.                 Exiting EnumerateInstanceNames***");
    }
    for (const CMPIObjectPath* client : counted16(*clients)) {
      if (isMissing(operation, client, "CMPIObjectPath is NULL for DNSClient")) return 1;
      CMPIObjectPath* path = newHostPath(broker, nameSpace, remoteAccess.className, nullptr);
      if (isMissing(operation, path, "Create CMPIObjectPath failed for RemoteAccessAvailableToElement.")) return 1;
      CMPIInstance* instance = newInstance(broker, path, nullptr);
      instances.push_back(instance);  // good or not
      if (!isGood(instance)) continue;
      setPairFilter(operation, remoteAccess, instance);
      setPair(instance, remoteAccess, server, client);
      setUint16(instance, "OrderOfAccess", factory.getOrderOfAccess(broker, server, &operation.status));
    }
  }
  flow.exit();
  return 0;
}

// Only the enumerations call returnDone after the exit is logged.
static CMPIStatus endEnumeration(const Operation& operation, const Place& place = Place::here()) {
  markExit(operation, place);
  returnDone(operation.result);
  return operation.status;
}

static CMPIStatus DNSRemoteAccessAvailableToElement_EnumInstances(Operation operation) {
  operation = enter(operation, remoteAccess.category);
  returnBuilt(operation, RemoteAccessAvailableToElementCMPIInstances);
  return endEnumeration(operation);
}

static CMPIStatus DNSRemoteAccessAvailableToElement_GetInstance(Operation operation) {
  operation = enter(operation, remoteAccess.category);
  returnEqualBuilt(operation, RemoteAccessAvailableToElementCMPIInstances);
  return end(operation);
}

// Returns each path at once: after a later failure these paths are already delivered, and the result stays open.
static CMPIStatus DNSRemoteAccessAvailableToElement_EnumInstanceNames(Operation operation) {
  operation = enter(operation, remoteAccess.category);
  DNSClientObjFactory factory;
  const auto servers = fetchServers<CMPIObjectPath>(operation, factory, operation.ref);
  if (!servers) {
    return fail(operation, "***Can't get DNS Server's ObjectPaths.             Exiting EnumerateInstanceNames***");
  }
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  for (CMPIObjectPath* server : counted16(*servers)) {
    if (isMissing(operation, server, "CMPIObjectPath is NULL for DNS Server")) return operation.status;
    setNameSpace(server, nameSpace);
    const auto clients = fetchEndpoints<CMPIObjectPath>(operation, factory, operation.ref);
    if (!clients) {
      return fail(operation,
                  "***Can't get ObjectPaths for DNSClient.                 Exiting EnumerateInstanceNames***");
    }
    for (CMPIObjectPath* client : counted16(*clients)) {
      if (isMissing(operation, client, "CMPIObjectPath is NULL for DNSClient")) return operation.status;
      setNameSpace(client, nameSpace);
      if (!returnPair(operation, remoteAccess, nameSpace,
                      "Create CMPIObjectPath failed for RemoteAccessAvailableToElement.", server, client)) {
        return operation.status;
      }
    }
  }
  return endEnumeration(operation);
}

// The four operations below never call returnDone.

// Returns the objects of the far end that are on the source's system.
template <typename Found>
static CMPIStatus associate(Operation& operation, DNSClientObjFactory& factory, const FarEnd& farEnd) {
  const std::string systemName = sourceKey(operation, "SystemName");
  std::optional<std::vector<Found*>> objects(std::in_place);
  if (farEnd.className == remoteServiceAccessPointClass) {
    if (!passesResultClass(operation.resultClass, remoteServiceAccessPointClass, "CIM_RemoteServiceAccessPoint")) {
      return operation.status;
    }
    objects = fetchServers<Found>(operation, factory, farEnd.path);
    if (!objects) return operation.status;
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(operation.resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndPoint")) {
      return operation.status;
    }
    objects = fetchEndpoints<Found>(operation, factory, farEnd.path);
    if (!objects) {
      // The names do not log it.
      if (kReturnsInstances<Found>) complain(operation, "getAllDNSClientCMPIInstances Failed");
      return operation.status;
    }
  }
  const std::string nameSpace = nameSpaceForPaths<Found>(operation);
  for (Found* object : counted16(*objects)) {
    if (textIn(operation, object, "SystemName") == systemName) returnOnThisHost(operation, object, nameSpace);
  }
  return endWithoutDone(operation);
}

// A reference to one object of the far end: the server is the antecedent and the endpoint the dependent.
static void setEnds(const CMPIInstance* reference, const FarEnd& farEnd, const CMPIObjectPath* source,
                    const CMPIObjectPath* target) {
  const bool farEndIsServer = farEnd.className == remoteServiceAccessPointClass;
  setPair(reference, remoteAccess, farEndIsServer ? target : source, farEndIsServer ? source : target);
}

// The ends of References are instances with keys only, whose paths are taken; those of ReferenceNames are paths.
// Nothing is filtered: the source need not exist. Only the builder sets OrderOfAccess.
template <typename Found>
static CMPIStatus refer(Operation& operation, DNSClientObjFactory& factory, const ReferenceParts& parts) {
  const auto& [farEnd, nameSpace, association] = parts;
  std::optional<std::vector<Found*>> ends(std::in_place);
  if (farEnd.className == remoteServiceAccessPointClass) {
    ends = fetchServers<Found>(operation, factory, farEnd.path, true);
    if (!ends) {
      return fail(operation,
                  either<Found>("getAllDNSServerCMPIInstances Failed", "getAllDNSServerCMPIObjPaths Failed"));
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    ends = fetchEndpoints<Found>(operation, factory, farEnd.path, true);
    if (!ends) {
      return fail(operation,
                  either<Found>("getAllDNSClientCMPIInstances Failed", "getAllDNSClientCMPIObjPaths Failed"));
    }
  }
  for (Found* found : counted16(*ends)) {
    const CMPIInstance* reference = newInstance(broker, association, &operation.status);
    setEnds(reference, farEnd, operation.ref, pathOf(operation, found));
    deliverOnThisHost<Found>(operation, reference, nameSpace);
  }
  return endWithoutDone(operation);
}

}  // namespace ZV

ZV_ASSOCIATION_PROVIDER(DNSRemoteAccessAvailableToElementProvider, DNSRemoteAccessAvailableToElement, remoteAccess)
