// ZORVA_RemoteAccessAvailableToElement: every DNS server is available to every endpoint. Instance and association
// provider; all objects come from the factory.

#include "factory/DNSClientObjFactory.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSRemoteAccess = "Zorvagent.DNSRemoteAccessAvailableToElementProvider";
static const char* const dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
static const char* const remoteServiceAccessPointClass = "ZORVA_RemoteServiceAccessPoint";
static const char* const remoteAccessAvailableToElementClass = "ZORVA_RemoteAccessAvailableToElement";

static unsigned short RemoteAccessAvailableToElementCMPIInstances(const CMPIContext* context, const CMPIObjectPath* ref,
                                                                  const char** properties,
                                                                  std::vector<CMPIInstance*>& instances) {
  Operation operation = ZV_UNMARKED_OPERATION(loggerDNSRemoteAccess, context, nullptr, ref);
  const FlowLog flow(loggerDNSRemoteAccess, ZV_HERE, " ref=", ref, " properties=", properties,
                     " instances=", &instances);
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> servers;
  if (!fetchServers(operation, factory, ref, servers)) {
    return failBuilder(operation, "***Can't get DNS Server ObjectPaths.             Exiting EnumerateInstanceNames***");
  }
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  for (CMPIObjectPath* server : counted16(servers)) {
    if (isMissing(operation, server, "CMPIObjectPath is NULL for DNS Server")) return 1;
    std::vector<CMPIObjectPath*> clients;  // made again for every server
    if (!fetchEndpoints(operation, factory, ref, clients)) {
      return failBuilder(operation,
                         "***Can't get ObjectPaths for DNSClient.                 Exiting EnumerateInstanceNames***");
    }
    for (const CMPIObjectPath* client : counted16(clients)) {
      if (isMissing(operation, client, "CMPIObjectPath is NULL for DNSClient")) return 1;
      CMPIObjectPath* path = newHostPath(broker, nameSpace, remoteAccessAvailableToElementClass, nullptr);
      if (isMissing(operation, path, "Create CMPIObjectPath failed for RemoteAccessAvailableToElement.")) return 1;
      CMPIInstance* instance = newInstance(broker, path, nullptr);
      instances.push_back(instance);  // good or not
      if (!isGood(instance)) continue;
      setPropertyFilter(instance, properties, {"Antecedent", "Dependent"});
      setPair(instance, "Antecedent", server, "Dependent", client);
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

// Returns each path at once: after a later failure these paths are already delivered, and the result stays open.
static CMPIStatus DNSRemoteAccessAvailableToElement_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext* context,
                                                                      const CMPIResult* result,
                                                                      const CMPIObjectPath* ref) {
  Operation operation = ZV_OPERATION(loggerDNSRemoteAccess, context, result, ref);
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> servers;
  if (!fetchServers(operation, factory, ref, servers)) {
    return fail(operation, "***Can't get DNS Server's ObjectPaths.             Exiting EnumerateInstanceNames***");
  }
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  for (CMPIObjectPath* server : counted16(servers)) {
    if (isMissing(operation, server, "CMPIObjectPath is NULL for DNS Server")) return operation.status;
    setNameSpace(server, nameSpace);
    std::vector<CMPIObjectPath*> clients;
    if (!fetchEndpoints(operation, factory, ref, clients)) {
      return fail(operation,
                  "***Can't get ObjectPaths for DNSClient.                 Exiting EnumerateInstanceNames***");
    }
    for (CMPIObjectPath* client : counted16(clients)) {
      if (isMissing(operation, client, "CMPIObjectPath is NULL for DNSClient")) return operation.status;
      setNameSpace(client, nameSpace);
      CMPIObjectPath* path = newHostPath(broker, nameSpace, remoteAccessAvailableToElementClass, &operation.status);
      if (isMissing(operation, path, "Create CMPIObjectPath failed for RemoteAccessAvailableToElement.")) {
        return operation.status;
      }
      returnPairPath(operation, path, "Antecedent", server, "Dependent", client);
    }
  }
  return endEnumeration(operation);
}

static CMPIStatus DNSRemoteAccessAvailableToElement_EnumInstances(CMPIInstanceMI*, const CMPIContext* context,
                                                                  const CMPIResult* result, const CMPIObjectPath* ref,
                                                                  const char** properties) {
  const Operation operation = ZV_OPERATION(loggerDNSRemoteAccess, context, result, ref);
  returnBuilt(operation, RemoteAccessAvailableToElementCMPIInstances, properties);
  return endEnumeration(operation);
}

static CMPIStatus DNSRemoteAccessAvailableToElement_GetInstance(CMPIInstanceMI*, const CMPIContext* context,
                                                                const CMPIResult* result, const CMPIObjectPath* ref,
                                                                const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSRemoteAccess, context, result, ref);
  returnEqualBuilt(operation, RemoteAccessAvailableToElementCMPIInstances, properties);
  return end(operation);
}

// The four operations below never call returnDone.

// Returns the objects of the far end that are on the source's system.
static CMPIStatus DNSRemoteAccessAvailableToElement_Associators(CMPIAssociationMI*, const CMPIContext* context,
                                                                const CMPIResult* result, const CMPIObjectPath* ref,
                                                                const char* assocClass, const char* resultClass,
                                                                const char*, const char*, const char** properties) {
  Operation operation = ZV_OPERATION(loggerDNSRemoteAccess, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd =
      resolveFarEnd(operation, factory, associationOr(assocClass, remoteAccessAvailableToElementClass), resultClass,
                    "Object Path is NULL in Associators.");
  if (!isGood(farEnd.path)) return operation.status;
  const std::string systemName = sourceKey(operation, "SystemName");
  std::vector<CMPIInstance*> instances;
  if (farEnd.className == remoteServiceAccessPointClass) {
    if (!passesResultClass(resultClass, remoteServiceAccessPointClass, "CIM_RemoteServiceAccessPoint")) {
      return operation.status;
    }
    if (!fetchServers(operation, factory, farEnd.path, properties, instances)) return operation.status;
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndPoint")) return operation.status;
    if (!fetchEndpoints(operation, factory, farEnd.path, properties, instances)) {
      return fail(operation, "getAllDNSClientCMPIInstances Failed");
    }
  }
  for (const CMPIInstance* instance : counted16(instances)) {
    if (propertyText(instance, "SystemName", &operation.status) == systemName) returnInstance(result, instance);
  }
  return endWithoutDone(operation);
}

static CMPIStatus DNSRemoteAccessAvailableToElement_AssociatorNames(CMPIAssociationMI*, const CMPIContext* context,
                                                                    const CMPIResult* result, const CMPIObjectPath* ref,
                                                                    const char* assocClass, const char* resultClass,
                                                                    const char*, const char*) {
  Operation operation = ZV_OPERATION(loggerDNSRemoteAccess, context, result, ref);
  DNSClientObjFactory factory;
  const FarEnd farEnd =
      resolveFarEnd(operation, factory, associationOr(assocClass, remoteAccessAvailableToElementClass), resultClass,
                    "Object Path is NULL in AssociatorNames.");
  if (!isGood(farEnd.path)) return operation.status;
  const std::string systemName = sourceKey(operation, "SystemName");
  std::vector<CMPIObjectPath*> paths;
  if (farEnd.className == remoteServiceAccessPointClass) {
    if (!passesResultClass(resultClass, remoteServiceAccessPointClass, "CIM_RemoteServiceAccessPoint")) {
      return operation.status;
    }
    if (!fetchServers(operation, factory, farEnd.path, paths)) return operation.status;
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndPoint")) return operation.status;
    if (!fetchEndpoints(operation, factory, farEnd.path, paths)) return operation.status;
  }
  const std::string nameSpace = nameSpaceOf(ref, &operation.status);
  for (CMPIObjectPath* path : counted16(paths)) {
    if (keyText(path, "SystemName", &operation.status) != systemName) continue;
    setNameSpaceAndHost(path, nameSpace);
    returnObjectPath(result, path);
  }
  return endWithoutDone(operation);
}

// A reference to one object of the far end: the server is the antecedent and the endpoint the dependent.
static void setEnds(const CMPIInstance* reference, const FarEnd& farEnd, const CMPIObjectPath* source,
                    const CMPIObjectPath* target) {
  const bool farEndIsServer = farEnd.className == remoteServiceAccessPointClass;
  setPair(reference, "Antecedent", farEndIsServer ? target : source, "Dependent", farEndIsServer ? source : target);
}

// References and ReferenceNames have separate walks, because the first makes instances with keys only and takes their
// paths. Neither filters: the source need not exist. Only the enumerations set OrderOfAccess.

static CMPIStatus DNSRemoteAccessAvailableToElement_References(CMPIAssociationMI*, const CMPIContext* context,
                                                               const CMPIResult* result, const CMPIObjectPath* ref,
                                                               const char*, const char*, const char**) {
  Operation operation = ZV_OPERATION(loggerDNSRemoteAccess, context, result, ref);
  DNSClientObjFactory factory;
  const auto [farEnd, nameSpace, association] =
      resolveReferences(operation, factory, remoteAccessAvailableToElementClass, newHostPath,
                        remoteAccessAvailableToElementClass, "Object Path is NULL in References.");
  if (!isGood(farEnd.path)) return operation.status;
  std::vector<CMPIInstance*> keys;
  if (farEnd.className == remoteServiceAccessPointClass) {
    keys.reserve(factory.getNumberOfDNSServerInstances());
    if (factory.getAllDNSServerCMPIInstances(broker, farEnd.path, nullptr, true, keys, &operation.status) != 0) {
      return fail(operation, "getAllDNSServerCMPIInstances Failed");
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    keys.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIInstances(broker, farEnd.path, nullptr, true, keys, &operation.status) != 0) {
      return fail(operation, "getAllDNSClientCMPIInstances Failed");
    }
  }
  for (const CMPIInstance* key : counted16(keys)) {
    const CMPIInstance* reference = newInstance(broker, association, &operation.status);
    setEnds(reference, farEnd, ref, objectPathOf(key, &operation.status));
    deliverInstance(operation, reference, nameSpace);
  }
  return endWithoutDone(operation);
}

static CMPIStatus DNSRemoteAccessAvailableToElement_ReferenceNames(CMPIAssociationMI*, const CMPIContext* context,
                                                                   const CMPIResult* result, const CMPIObjectPath* ref,
                                                                   const char*, const char*) {
  Operation operation = ZV_OPERATION(loggerDNSRemoteAccess, context, result, ref);
  DNSClientObjFactory factory;
  const auto [farEnd, nameSpace, association] =
      resolveReferences(operation, factory, remoteAccessAvailableToElementClass, newHostPath,
                        remoteAccessAvailableToElementClass, "Object Path is NULL in ReferenceNames.");
  if (!isGood(farEnd.path)) return operation.status;
  std::vector<CMPIObjectPath*> paths;
  if (farEnd.className == remoteServiceAccessPointClass) {
    if (!fetchServers(operation, factory, farEnd.path, paths)) {
      return fail(operation, "getAllDNSServerCMPIObjPaths Failed");
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    if (!fetchEndpoints(operation, factory, farEnd.path, paths)) {
      return fail(operation, "getAllDNSClientCMPIObjPaths Failed");
    }
  }
  for (const CMPIObjectPath* path : counted16(paths)) {
    const CMPIInstance* reference = newInstance(broker, association, &operation.status);
    setEnds(reference, farEnd, ref, path);
    deliverPathOnThisHost(operation, reference, nameSpace);
  }
  return endWithoutDone(operation);
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSRemoteAccessAvailableToElement)
ZV_REFUSED_MODIFICATION(DNSRemoteAccessAvailableToElement)
ZV_ASSOCIATION_CLEANUP(DNSRemoteAccessAvailableToElement)

}  // namespace ZV

ZV_INSTANCE_MI(DNSRemoteAccessAvailableToElementProvider, DNSRemoteAccessAvailableToElement)
ZV_ASSOCIATION_MI(DNSRemoteAccessAvailableToElementProvider, DNSRemoteAccessAvailableToElement)
