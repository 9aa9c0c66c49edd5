// ZORVA_RemoteAccessAvailableToElement: every DNS server is within reach of every endpoint. Instance and association
// provider, wholly from the factory.
#include "factory/DNSClientObjFactory.h"
#include "providers/AssociationSteps.h"
#include "providers/ProviderFrame.h"
#include "providers/Results.h"

namespace ZV {

static const std::string loggerDNSRemoteAccess = "Zorvagent.DNSRemoteAccessAvailableToElementProvider";
static const char* const dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
static const char* const remoteServiceAccessPointClass = "ZORVA_RemoteServiceAccessPoint";
static const char* const remoteAccessAvailableToElementClass = "ZORVA_RemoteAccessAvailableToElement";

static unsigned short RemoteAccessAvailableToElementCMPIInstances(const CMPIObjectPath* ref, const char** properties,
                                                                  std::vector<CMPIInstance*>& instances) {
  logEntry(loggerDNSRemoteAccess, ZV_HERE, " ref=", ref, " properties=", properties, " instances=", &instances);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> servers;
  servers.reserve(factory.getNumberOfDNSServerInstances());
  if (factory.getAllDNSServerCMPIObjPaths(broker, ref, servers, &status) != 0) {
    logError(loggerDNSRemoteAccess, ZV_HERE,
             "***Can't get DNS Server ObjectPaths.             Exiting EnumerateInstanceNames***");
    return 1;
  }
  const std::string nameSpace = nameSpaceOf(ref, &status);
  for (unsigned short s = 0; s < count16(servers); ++s) {
    CMPIObjectPath* server = servers.at(s);
    if (isMissing(server, loggerDNSRemoteAccess, ZV_HERE, "CMPIObjectPath is NULL for DNS Server")) return 1;
    std::vector<CMPIObjectPath*> clients;  // made afresh for every server
    clients.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, ref, clients, &status) != 0) {
      logError(loggerDNSRemoteAccess, ZV_HERE,
               "***Can't get ObjectPaths for DNSClient.                 Exiting EnumerateInstanceNames***");
      return 1;
    }
    for (unsigned short c = 0; c < count16(clients); ++c) {
      CMPIObjectPath* client = clients.at(c);
      if (isMissing(client, loggerDNSRemoteAccess, ZV_HERE, "CMPIObjectPath is NULL for DNSClient")) return 1;
      CMPIObjectPath* path = newHostPath(broker, nameSpace, remoteAccessAvailableToElementClass, nullptr);
      if (isMissing(path, loggerDNSRemoteAccess, ZV_HERE,
                    "Create CMPIObjectPath failed for RemoteAccessAvailableToElement.")) {
        return 1;
      }
      CMPIInstance* instance = newInstance(broker, path, nullptr);
      if (isGood(instance)) {
        setPropertyFilter(instance, properties, {"Antecedent", "Dependent"});
        setReference(instance, "Antecedent", server);
        setReference(instance, "Dependent", client);
        setUint16(instance, "OrderOfAccess", factory.getOrderOfAccess(broker, server, &status));
      }
      instances.push_back(instance);  // good or not
    }
  }
  logExit(loggerDNSRemoteAccess, ZV_HERE, " ref=", ref, " properties=", properties, " instances=", &instances);
  return 0;
}

// Delivers each path at once: a failure further on leaves what went out, and the result open.
static CMPIStatus DNSRemoteAccessAvailableToElement_EnumInstanceNames(CMPIInstanceMI*, const CMPIContext*,
                                                                      const CMPIResult* result,
                                                                      const CMPIObjectPath* ref) {
  ZV_PROVIDER_ENTRY(loggerDNSRemoteAccess);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  std::vector<CMPIObjectPath*> servers;
  servers.reserve(factory.getNumberOfDNSServerInstances());
  if (factory.getAllDNSServerCMPIObjPaths(broker, ref, servers, &status) != 0) {
    logError(loggerDNSRemoteAccess, ZV_HERE,  // with the possessive that the builder's text lacks
             "***Can't get DNS Server's ObjectPaths.             Exiting EnumerateInstanceNames***");
    return status;
  }
  const std::string nameSpace = nameSpaceOf(ref, &status);
  for (unsigned short s = 0; s < count16(servers); ++s) {
    CMPIObjectPath* server = servers.at(s);
    if (isMissing(server, loggerDNSRemoteAccess, ZV_HERE, "CMPIObjectPath is NULL for DNS Server")) return status;
    setNameSpace(server, nameSpace);
    std::vector<CMPIObjectPath*> clients;
    clients.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, ref, clients, &status) != 0) {
      logError(loggerDNSRemoteAccess, ZV_HERE,
               "***Can't get ObjectPaths for DNSClient.                 Exiting EnumerateInstanceNames***");
      return status;
    }
    for (unsigned short c = 0; c < count16(clients); ++c) {
      CMPIObjectPath* client = clients.at(c);
      if (isMissing(client, loggerDNSRemoteAccess, ZV_HERE, "CMPIObjectPath is NULL for DNSClient")) return status;
      setNameSpace(client, nameSpace);
      CMPIObjectPath* path = newHostPath(broker, nameSpace, remoteAccessAvailableToElementClass, &status);
      if (isMissing(path, loggerDNSRemoteAccess, ZV_HERE,
                    "Create CMPIObjectPath failed for RemoteAccessAvailableToElement.")) {
        return status;
      }
      addReferenceKey(path, "Antecedent", server);
      addReferenceKey(path, "Dependent", client);
      returnObjectPath(result, path);
    }
  }
  ZV_PROVIDER_EXIT(loggerDNSRemoteAccess);  // before it is done, in both enumerations
  returnDone(result);
  return status;
}

static CMPIStatus DNSRemoteAccessAvailableToElement_EnumInstances(CMPIInstanceMI*, const CMPIContext*,
                                                                  const CMPIResult* result, const CMPIObjectPath* ref,
                                                                  const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSRemoteAccess);
  std::vector<CMPIInstance*> instances;
  if (RemoteAccessAvailableToElementCMPIInstances(ref, properties, instances) == 0) returnAll(result, instances);
  ZV_PROVIDER_EXIT(loggerDNSRemoteAccess);
  returnDone(result);
  return kStatusOk;
}

static CMPIStatus DNSRemoteAccessAvailableToElement_GetInstance(CMPIInstanceMI*, const CMPIContext*,
                                                                const CMPIResult* result, const CMPIObjectPath* ref,
                                                                const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSRemoteAccess);
  CMPIStatus status = kStatusOk;
  std::vector<CMPIInstance*> instances;
  if (keyCountOf(ref, &status) == 0) {
    logError(loggerDNSRemoteAccess, ZV_HERE, "At least one key should be passed");
  } else if (RemoteAccessAvailableToElementCMPIInstances(ref, properties, instances) == 0) {
    returnFirstEqual(result, ref, instances, true, &status);
  }
  returnDone(result);
  ZV_PROVIDER_EXIT(loggerDNSRemoteAccess);
  return status;
}

// The four operations below never call returnDone.

// Of the far end's objects those on the source's system go out.
static CMPIStatus DNSRemoteAccessAvailableToElement_Associators(CMPIAssociationMI*, const CMPIContext*,
                                                                const CMPIResult* result, const CMPIObjectPath* ref,
                                                                const char* assocClass, const char* resultClass,
                                                                const char*, const char*, const char** properties) {
  ZV_PROVIDER_ENTRY(loggerDNSRemoteAccess);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, remoteAccessAvailableToElementClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSRemoteAccess, ZV_HERE, "Object Path is NULL in Associators.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  const std::string systemName = keyText(ref, "SystemName", &status);
  std::vector<CMPIInstance*> instances;
  if (farEndClass == remoteServiceAccessPointClass) {
    if (!passesResultClass(resultClass, remoteServiceAccessPointClass, "CIM_RemoteServiceAccessPoint")) return status;
    instances.reserve(factory.getNumberOfDNSServerInstances());
    if (factory.getAllDNSServerCMPIInstances(broker, farEnd, properties, false, instances, &status) != 0) {
      return status;  // without a word of its own
    }
  } else if (farEndClass == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndPoint")) return status;
    instances.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIInstances(broker, farEnd, properties, false, instances, &status) != 0) {
      logError(loggerDNSRemoteAccess, ZV_HERE, "getAllDNSClientCMPIInstances Failed");
      return status;
    }
  }
  for (unsigned short i = 0; i < count16(instances); ++i) {
    const CMPIInstance* instance = instances.at(i);
    if (propertyText(instance, "SystemName", &status) == systemName) returnInstance(result, instance);
  }
  ZV_PROVIDER_EXIT(loggerDNSRemoteAccess);
  return status;
}

static CMPIStatus DNSRemoteAccessAvailableToElement_AssociatorNames(CMPIAssociationMI*, const CMPIContext*,
                                                                    const CMPIResult* result, const CMPIObjectPath* ref,
                                                                    const char* assocClass, const char* resultClass,
                                                                    const char*, const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSRemoteAccess);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd = factory.get_assoc_targetClass_ObjectPath(
      broker, ref, associationOr(assocClass, remoteAccessAvailableToElementClass), resultClass, &status);
  if (isMissing(farEnd, loggerDNSRemoteAccess, ZV_HERE, "Object Path is NULL in AssociatorNames.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  const std::string systemName = keyText(ref, "SystemName", &status);
  std::vector<CMPIObjectPath*> paths;
  if (farEndClass == remoteServiceAccessPointClass) {
    if (!passesResultClass(resultClass, remoteServiceAccessPointClass, "CIM_RemoteServiceAccessPoint")) return status;
    paths.reserve(factory.getNumberOfDNSServerInstances());
    if (factory.getAllDNSServerCMPIObjPaths(broker, farEnd, paths, &status) != 0) return status;
  } else if (farEndClass == dnsProtocolEndPointClass) {
    if (!passesResultClass(resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndPoint")) return status;
    paths.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, paths, &status) != 0) return status;
  }
  const std::string nameSpace = nameSpaceOf(ref, &status);
  for (unsigned short i = 0; i < count16(paths); ++i) {
    CMPIObjectPath* path = paths.at(i);
    if (keyText(path, "SystemName", &status) != systemName) continue;
    setNameSpaceAndHost(path, nameSpace);
    returnObjectPath(result, path);
  }
  ZV_PROVIDER_EXIT(loggerDNSRemoteAccess);
  return status;
}

namespace {

// By the class of the far end, the server is the antecedent and the endpoint the dependent.
void setEnds(const CMPIInstance* reference, const std::string& farEndClass, const CMPIObjectPath* source,
             const CMPIObjectPath* farEnd) {
  const bool farEndIsServer = farEndClass == remoteServiceAccessPointClass;
  setReference(reference, "Antecedent", farEndIsServer ? farEnd : source);
  setReference(reference, "Dependent", farEndIsServer ? source : farEnd);
}

}  // namespace

// No filter of any kind: the source need not exist. OrderOfAccess is for the enumerations alone.
static CMPIStatus DNSRemoteAccessAvailableToElement_References(CMPIAssociationMI*, const CMPIContext*,
                                                               const CMPIResult* result, const CMPIObjectPath* ref,
                                                               const char*, const char*, const char**) {
  ZV_PROVIDER_ENTRY(loggerDNSRemoteAccess);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, remoteAccessAvailableToElementClass, nullptr, &status);
  CMPIObjectPath* association =
      newHostPath(broker, nameSpaceOf(ref, &status), remoteAccessAvailableToElementClass, &status);
  if (isMissing(farEnd, loggerDNSRemoteAccess, ZV_HERE, "Object Path is NULL in References.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  std::vector<CMPIInstance*> instances;  // of keys alone
  if (farEndClass == remoteServiceAccessPointClass) {
    instances.reserve(factory.getNumberOfDNSServerInstances());
    if (factory.getAllDNSServerCMPIInstances(broker, farEnd, nullptr, true, instances, &status) != 0) {
      logError(loggerDNSRemoteAccess, ZV_HERE, "getAllDNSServerCMPIInstances Failed");
      return status;
    }
  } else if (farEndClass == dnsProtocolEndPointClass) {
    instances.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIInstances(broker, farEnd, nullptr, true, instances, &status) != 0) {
      logError(loggerDNSRemoteAccess, ZV_HERE, "getAllDNSClientCMPIInstances Failed");
      return status;
    }
  }
  for (unsigned short i = 0; i < count16(instances); ++i) {
    CMPIInstance* reference = newInstance(broker, association, &status);
    setEnds(reference, farEndClass, ref, objectPathOf(instances.at(i), &status));
    returnInstance(result, reference);
  }
  ZV_PROVIDER_EXIT(loggerDNSRemoteAccess);
  return status;
}

static CMPIStatus DNSRemoteAccessAvailableToElement_ReferenceNames(CMPIAssociationMI*, const CMPIContext*,
                                                                   const CMPIResult* result, const CMPIObjectPath* ref,
                                                                   const char*, const char*) {
  ZV_PROVIDER_ENTRY(loggerDNSRemoteAccess);
  CMPIStatus status = kStatusOk;
  DNSClientObjFactory factory;
  CMPIObjectPath* farEnd =
      factory.get_assoc_targetClass_ObjectPath(broker, ref, remoteAccessAvailableToElementClass, nullptr, &status);
  const std::string nameSpace = nameSpaceOf(ref, &status);
  CMPIObjectPath* association = newHostPath(broker, nameSpace, remoteAccessAvailableToElementClass, &status);
  if (isMissing(farEnd, loggerDNSRemoteAccess, ZV_HERE, "Object Path is NULL in ReferenceNames.")) return status;

  const std::string farEndClass = classNameOf(farEnd, &status);
  std::vector<CMPIObjectPath*> paths;
  if (farEndClass == remoteServiceAccessPointClass) {
    paths.reserve(factory.getNumberOfDNSServerInstances());
    if (factory.getAllDNSServerCMPIObjPaths(broker, farEnd, paths, &status) != 0) {
      logError(loggerDNSRemoteAccess, ZV_HERE, "getAllDNSServerCMPIObjPaths Failed");
      return status;
    }
  } else if (farEndClass == dnsProtocolEndPointClass) {
    paths.reserve(factory.getNumberOfDNSClientInstances());
    if (factory.getAllDNSClientCMPIObjPaths(broker, farEnd, paths, &status) != 0) {
      logError(loggerDNSRemoteAccess, ZV_HERE, "getAllDNSClientCMPIObjPaths Failed");
      return status;
    }
  }
  for (unsigned short i = 0; i < count16(paths); ++i) {
    CMPIInstance* reference = newInstance(broker, association, &status);
    setEnds(reference, farEndClass, ref, paths.at(i));
    CMPIObjectPath* path = objectPathOf(reference, &status);  // its keys are what the server derives
    setNameSpaceAndHost(path, nameSpace);
    returnObjectPath(result, path);
  }
  ZV_PROVIDER_EXIT(loggerDNSRemoteAccess);
  return status;
}

ZV_REFUSED_INSTANCE_OPERATIONS(DNSRemoteAccessAvailableToElement)
ZV_REFUSED_MODIFICATION(DNSRemoteAccessAvailableToElement)
ZV_ASSOCIATION_CLEANUP(DNSRemoteAccessAvailableToElement)

}  // namespace ZV

ZV_INSTANCE_MI(DNSRemoteAccessAvailableToElementProvider, DNSRemoteAccessAvailableToElement)
ZV_ASSOCIATION_MI(DNSRemoteAccessAvailableToElementProvider, DNSRemoteAccessAvailableToElement)
