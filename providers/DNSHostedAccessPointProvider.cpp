// ZORVA_DNSHostedAccessPoint: the computer system that hosts each DNS endpoint. Instance and association provider; the
// computer systems are served by another provider and read through the broker.
//
// A system's Name is compared with an endpoint's SystemName. For the builder a part of the Name matches too; the names,
// the associators and the references need the whole Name. The associators of a system also leave out the endpoints of
// the service processor.

#include <strings.h>

#include "factory/ClassNames.h"
#include "factory/DNSClientObjFactory.h"
#include "providers/AssociationOperation.h"
#include "providers/ProviderFrame.h"

namespace ZV {

static const Association hostedAccessPoint = {"Zorvagent.DNSHostedAccessPointProvider", dnsHostedAccessPointClass,
                                              kPathsOnThisHost, kAntecedentAndDependent};

static unsigned short DNSHostedAccessPointCMPIInstances(Operation operation, std::vector<CMPIInstance*>& instances) {
  operation = enter(operation, hostedAccessPoint.category);
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  const auto systems = askForAll<CMPIObjectPath>(operation, nameSpace, computerSystemClass,
                                                 "Create CMPIObjectPath failed for ComputerSystem.");
  if (!systems) return 1;
  while (hasNext(*systems, &operation.status)) {
    const CMPIObjectPath* system = nextPath(*systems, &operation.status);
    const std::string name = keyText(system, "Name", &operation.status);
    const auto endpoints = fetchEndpoints<CMPIObjectPath>(operation, factory, operation.ref);
    if (!endpoints) {
      return failBuilder(operation,
                         "***Can't get DNS Client ObjectPaths.                 Exiting EnumerateInstanceNames***");
    }
    for (CMPIObjectPath* endpoint : counted16(*endpoints)) {
      if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Client")) return 1;
      if (name.find(keyText(endpoint, "SystemName", &operation.status)) == std::string::npos) continue;
      setNameSpace(endpoint, nameSpace);
      CMPIObjectPath* path = newHostPath(broker, nameSpace, hostedAccessPoint.className, &operation.status);
      if (isMissing(operation, path,
                    "Create CMPIObjectPath failed for                     dnsHostedAccessPointClass.")) {
        return 1;
      }
      CMPIInstance* instance = newInstance(broker, path, &operation.status);
      setPairFilter(operation, hostedAccessPoint, instance);
      setPair(instance, hostedAccessPoint, system, endpoint);
      instances.push_back(instance);  // good or not
    }
  }
  return endBuilder(operation);
}

ZV_BUILT_INSTANCES(DNSHostedAccessPoint, hostedAccessPoint, DNSHostedAccessPointCMPIInstances)

// Returns each path at once: after a later failure these paths are already delivered, and the result stays open.
static CMPIStatus DNSHostedAccessPoint_EnumInstanceNames(Operation operation) {
  operation = enter(operation, hostedAccessPoint.category);
  DNSClientObjFactory factory;
  const std::string nameSpace = nameSpaceOf(operation.ref, &operation.status);
  const auto systems = askForAll<CMPIObjectPath>(operation, nameSpace, computerSystemClass,
                                                 "Create CMPIObjectPath failed for ComputerSystem.");
  if (!systems) return operation.status;
  while (hasNext(*systems, &operation.status)) {
    const CMPIObjectPath* system = nextPath(*systems, &operation.status);
    const std::string name = keyText(system, "Name", &operation.status);
    const auto endpoints = fetchEndpoints<CMPIObjectPath>(operation, factory, operation.ref);
    if (!endpoints) {
      return fail(operation, "***Can't get DNS Client ObjectPaths.                  Exiting EnumerateInstanceNames***");
    }
    for (CMPIObjectPath* endpoint : counted16(*endpoints)) {
      if (isMissing(operation, endpoint, "CMPIObjectPath is NULL for DNS Client")) return operation.status;
      if (name != keyText(endpoint, "SystemName", &operation.status)) continue;  // the builder also accepts a part
      setNameSpace(endpoint, nameSpace);
      if (!returnPair(operation, hostedAccessPoint, nameSpace,
                      "Create CMPIObjectPath failed for                     dnsHostedAccessPointClass.", system,
                      endpoint)) {
        return operation.status;
      }
    }
  }
  return end(operation);
}

// The four operations below never call returnDone.

static bool isOfComputerSystem(const std::string& systemCreationClassName) {
  return strcasecmp(systemCreationClassName.c_str(), computerSystemClass) == 0;
}

template <typename Found>
static CMPIStatus associate(Operation& operation, DNSClientObjFactory& factory, const FarEnd& farEnd) {
  if (farEnd.className == computerSystemClass) {
    const std::string systemName = sourceKey(operation, "SystemName");
    if (!passesResultClass(operation.resultClass, computerSystemClass, "CIM_ComputerSystem")) return operation.status;
    const auto systems = askFor<Found>(operation, farEnd.path,
                                       either<Found>("CBEnumInstances Failed for the target Class",
                                                     "CBEnumInstanceNames Failed for the target Class"));
    if (!systems) return operation.status;
    while (hasNext(*systems, &operation.status)) {
      Found* system = next<Found>(operation, *systems);
      if (keyText(pathOf(operation, system), "Name", &operation.status) == systemName) returnOne(operation, system);
    }
  } else if (farEnd.className == dnsProtocolEndPointClass) {
    const std::string name = sourceKey(operation, "Name");
    if (!passesResultClass(operation.resultClass, dnsProtocolEndPointClass, "CIM_DNSProtocolEndpoint")) {
      return operation.status;
    }
    const auto endpoints = fetchEndpoints<Found>(operation, factory, farEnd.path);
    if (!endpoints) {
      return fail(operation,
                  either<Found>("***Can't get DNS Client ObjectPaths.                 Exiting Associators***",
                                "***Can't get Service processor ObjectPaths.                 Exiting "
                                "AssociatorNames***"));
    }
    const std::string nameSpace = nameSpaceForPaths<Found>(operation);
    for (Found* endpoint : counted16(*endpoints)) {
      if (textIn(operation, endpoint, "SystemName") != name) continue;
      if (!isOfComputerSystem(textIn(operation, endpoint, "SystemCreationClassName"))) continue;
      returnOnThisHost(operation, endpoint, nameSpace);
    }
  }
  return endWithoutDone(operation);
}

template <typename Found>
static CMPIStatus refer(Operation& operation, DNSClientObjFactory& factory, const ReferenceParts& parts) {
  const auto& [farEnd, nameSpace, association] = parts;
  if (farEnd.className == dnsProtocolEndPointClass) {
    const std::string name = sourceKey(operation, "Name");
    const auto endpoints = fetchEndpoints<CMPIObjectPath>(operation, factory, farEnd.path);
    if (!endpoints) {
      return fail(operation, "***Can't get DNS Client instances                 Exiting References***");
    }
    for (CMPIObjectPath* endpoint : counted16(*endpoints)) {
      if (keyText(endpoint, "SystemName", &operation.status) != name) continue;
      const CMPIInstance* reference = newInstance(broker, association, &operation.status);
      setNameSpaceAndHost(endpoint, nameSpace);
      setPair(reference, hostedAccessPoint, operation.ref, endpoint);
      deliverOnThisHost<Found>(operation, reference, nameSpace);
    }
  } else if (farEnd.className == computerSystemClass) {
    const std::string systemName = sourceKey(operation, "SystemName");
    const auto systems = askFor<CMPIObjectPath>(operation, farEnd.path);
    if (!systems) return operation.status;
    while (hasNext(*systems, &operation.status)) {
      const CMPIObjectPath* system = nextPath(*systems, &operation.status);
      if (keyText(system, "Name", &operation.status) != systemName) continue;
      deliverOnThisHost<Found>(operation, newPair(operation, hostedAccessPoint, association, system, operation.ref),
                               nameSpace);
    }
  }
  return endWithoutDone(operation);
}

}  // namespace ZV

ZV_ASSOCIATION_PROVIDER(DNSHostedAccessPointProvider, DNSHostedAccessPoint, hostedAccessPoint)
