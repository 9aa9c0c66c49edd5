#include "cimom/Interop.h"

#include <cmpidt.h>
#include <cmpift.h>
#include <cmpimacs.h>

#include "cimom/CmpiValues.h"
#include "cimom/InteropModel.h"
#include "cmpi/support/CmpiSupport.h"
#include "schema/Schema.h"
#include "util/HostName.h"
#include "util/Names.h"

namespace zorva::cimom {

namespace {

using broker::Instance;
using broker::ObjectPath;

constexpr const char* kPrefix = "Interop";
constexpr const char* kInterop = "interop";
constexpr const char* kEndpointNameSpace = "root/cimv2";

constexpr CMPIStatus kOk{CMPI_RC_OK, nullptr};

/// The namespaces of the program's broker, which CMPI has no function to ask for. Set before the broker is made.
std::vector<std::string>& servedNameSpaces() {
  static std::vector<std::string> names;
  return names;
}

const CMPIBroker* brokerOf(const void* hdl) noexcept { return static_cast<const CMPIBroker*>(hdl); }

/// The names of a class's instances in the namespace of the endpoints; none if they cannot be read.
std::vector<ObjectPath> namesOf(const CMPIBroker* broker, const CMPIContext* context, const char* className) {
  std::vector<ObjectPath> names;
  CMPIStatus status = kOk;
  const CMPIObjectPath* asked = CMNewObjectPath(broker, kEndpointNameSpace, className, &status);
  CMPIEnumeration* found = asked != nullptr ? CBEnumInstanceNames(broker, context, asked, &status) : nullptr;
  while (found != nullptr && CMHasNext(found, &status)) {
    const CMPIData data = CMGetNext(found, &status);
    if (data.value.ref != nullptr) names.push_back(readPath(data.value.ref));
  }
  return names;
}

std::string hostName() {
  const std::string name = util::kernelHostName();
  return name.empty() ? "localhost" : name;
}

/// The data from which the instances of a class are made. A provider is asked only if they need it: the other instances
/// can be read while it hangs.
InteropWorld worldAt(const CMPIBroker* broker, const CMPIContext* context, const CMPIObjectPath* asked,
                     std::string_view className) {
  InteropWorld world;
  world.nameSpace = cmpi::nameSpaceOf(asked, nullptr);
  world.nameSpaces = servedNameSpaces();
  world.profileNameSpace = schema::sameNamespace(world.nameSpace, kEndpointNameSpace) ? kInterop : world.nameSpace;
  world.hostName = hostName();
  if (util::sameName(className, kProfileClass)) return world;
  if (util::sameName(className, kConformanceClass)) {
    world.endpoints = namesOf(broker, context, "CIM_DNSProtocolEndpoint");
  } else {
    world.systems = namesOf(broker, context, "CIM_ComputerSystem");
  }
  return world;
}

CMPIStatus notSupported() { return {CMPI_RC_ERR_NOT_SUPPORTED, nullptr}; }

// Instances.

CMPIStatus cleanUpInstances(CMPIInstanceMI* mi, const CMPIContext*, CMPIBoolean) {
  delete mi;
  return kOk;
}

CMPIStatus enumerateNames(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                          const CMPIObjectPath* asked) {
  const CMPIBroker* broker = brokerOf(mi->hdl);
  const std::string className = readPath(asked).className;
  const InteropWorld world = worldAt(broker, context, asked, className);
  for (const Instance& one : interopInstances(world, className)) {
    CMReturnObjectPath(result, makePath(broker, one.path));
  }
  CMReturnDone(result);
  return kOk;
}

CMPIStatus enumerateInstances(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                              const CMPIObjectPath* asked, const char**) {
  const CMPIBroker* broker = brokerOf(mi->hdl);
  const std::string className = readPath(asked).className;
  const InteropWorld world = worldAt(broker, context, asked, className);
  for (const Instance& one : interopInstances(world, className)) {
    CMReturnInstance(result, makeInstance(broker, one));
  }
  CMReturnDone(result);
  return kOk;
}

CMPIStatus getInstance(CMPIInstanceMI* mi, const CMPIContext* context, const CMPIResult* result,
                       const CMPIObjectPath* asked, const char**) {
  const CMPIBroker* broker = brokerOf(mi->hdl);
  const ObjectPath path = readPath(asked);
  const InteropWorld world = worldAt(broker, context, asked, path.className);
  for (const Instance& one : interopInstances(world, path.className)) {
    if (sameInstance(one.path, path)) CMReturnInstance(result, makeInstance(broker, one));
  }
  CMReturnDone(result);
  return kOk;
}

CMPIStatus create(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const CMPIInstance*) {
  return notSupported();
}
CMPIStatus modify(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const CMPIInstance*,
                  const char**) {
  return notSupported();
}
CMPIStatus remove(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*) {
  return notSupported();
}
CMPIStatus query(CMPIInstanceMI*, const CMPIContext*, const CMPIResult*, const CMPIObjectPath*, const char*,
                 const char*) {
  return notSupported();
}

CMPIInstanceMIFT instanceTable = {
    200,    200,   "instanceInterop", cleanUpInstances, enumerateNames, enumerateInstances, getInstance, create, modify,
    remove, query,
};

// Associations.

CMPIStatus cleanUpAssociations(CMPIAssociationMI* mi, const CMPIContext*, CMPIBoolean) {
  delete mi;
  return kOk;
}

bool fits(const std::string& name, const char* role) { return role == nullptr || util::sameName(name, role); }

/// The associations of `source`: `visit(association, far end)` for each end that is `source`.
template <typename Visit>
void walk(const InteropWorld& world, const ObjectPath& source, const char* association, const char* role,
          const char* resultRole, Visit&& visit) {
  for (const Instance& one : interopInstances(world, association)) {
    for (const broker::NamedValue& nearEnd : one.path.keys) {
      const auto& here = *std::get<broker::Boxed<ObjectPath>>(nearEnd.value.scalar);
      if (!fits(nearEnd.name, role) || !sameInstance(here, source)) continue;
      for (const broker::NamedValue& farEnd : one.path.keys) {
        if (farEnd.name == nearEnd.name || !fits(farEnd.name, resultRole)) continue;
        visit(one, *std::get<broker::Boxed<ObjectPath>>(farEnd.value.scalar));
      }
    }
  }
}

CMPIStatus associators(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                       const CMPIObjectPath* asked, const char* association, const char*, const char* role,
                       const char* resultRole, const char**) {
  const CMPIBroker* broker = brokerOf(mi->hdl);
  const InteropWorld world = worldAt(broker, context, asked, association);
  walk(world, readPath(asked), association, role, resultRole, [&](const Instance&, const ObjectPath& farEnd) {
    CMPIStatus status = kOk;
    const CMPIInstance* found = CBGetInstance(broker, context, makePath(broker, farEnd), nullptr, &status);
    if (found != nullptr) CMReturnInstance(result, found);  // else it was removed meanwhile
  });
  CMReturnDone(result);
  return kOk;
}

CMPIStatus associatorNames(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                           const CMPIObjectPath* asked, const char* association, const char*, const char* role,
                           const char* resultRole) {
  const CMPIBroker* broker = brokerOf(mi->hdl);
  const InteropWorld world = worldAt(broker, context, asked, association);
  walk(world, readPath(asked), association, role, resultRole,
       [&](const Instance&, const ObjectPath& farEnd) { CMReturnObjectPath(result, makePath(broker, farEnd)); });
  CMReturnDone(result);
  return kOk;
}

CMPIStatus references(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                      const CMPIObjectPath* asked, const char* association, const char* role, const char**) {
  const CMPIBroker* broker = brokerOf(mi->hdl);
  const InteropWorld world = worldAt(broker, context, asked, association);
  walk(world, readPath(asked), association, role, nullptr,
       [&](const Instance& one, const ObjectPath&) { CMReturnInstance(result, makeInstance(broker, one)); });
  CMReturnDone(result);
  return kOk;
}

CMPIStatus referenceNames(CMPIAssociationMI* mi, const CMPIContext* context, const CMPIResult* result,
                          const CMPIObjectPath* asked, const char* association, const char* role) {
  const CMPIBroker* broker = brokerOf(mi->hdl);
  const InteropWorld world = worldAt(broker, context, asked, association);
  walk(world, readPath(asked), association, role, nullptr,
       [&](const Instance& one, const ObjectPath&) { CMReturnObjectPath(result, makePath(broker, one.path)); });
  CMReturnDone(result);
  return kOk;
}

CMPIAssociationMIFT associationTable = {
    200, 200, "associationInterop", cleanUpAssociations, associators, associatorNames, references, referenceNames,
};

// Methods.

CMPIStatus cleanUpMethods(CMPIMethodMI* mi, const CMPIContext*, CMPIBoolean) {
  delete mi;
  return kOk;
}

/// The central class of the profile is the endpoint.
CMPIStatus invoke(CMPIMethodMI* mi, const CMPIContext* context, const CMPIResult* result, const CMPIObjectPath* asked,
                  const char* method, const CMPIArgs*, CMPIArgs* output) {
  if (!util::sameName(method, "GetCentralInstances")) {
    return {CMPI_RC_ERR_METHOD_NOT_AVAILABLE, nullptr};
  }
  const CMPIBroker* broker = brokerOf(mi->hdl);
  const InteropWorld world = worldAt(broker, context, asked, kConformanceClass);
  const std::vector<Instance> profiles = interopInstances(world, kProfileClass);
  if (!sameInstance(profiles.front().path, readPath(asked))) return {CMPI_RC_ERR_NOT_FOUND, nullptr};
  CMPIStatus status = kOk;
  const auto count = static_cast<CMPICount>(world.endpoints.size());
  CMPIArray* paths = CMNewArray(broker, count, CMPI_ref, &status);
  for (CMPICount i = 0; i < count; ++i) {
    CMPIValue value;
    value.ref = makePath(broker, world.endpoints[i]);
    CMSetArrayElementAt(paths, i, &value, CMPI_ref);
  }
  CMPIValue value;
  value.array = paths;
  CMAddArg(output, "CentralInstances", &value, CMPI_refA);
  value.uint8 = 0;
  CMReturnData(result, &value, CMPI_uint8);
  CMReturnDone(result);
  return kOk;
}

CMPIMethodMIFT methodTable = {200, 200, "methodInterop", cleanUpMethods, invoke};

template <typename Mi, typename Table, Table* table>
Mi* createMi(const CMPIBroker* broker, const CMPIContext*, CMPIStatus* status) {
  if (status != nullptr) *status = kOk;
  return new Mi{const_cast<CMPIBroker*>(broker), table};
}

template <typename Function>
broker::LinkedFunction linked(const char* kind, Function* function) {
  return {std::string(kPrefix) + "_Create_" + kind, reinterpret_cast<void (*)()>(function)};
}

}  // namespace

void serveInterop(broker::BrokerOptions& options) {
  struct Row {
    const char* className;
    unsigned kinds;
  };
  constexpr Row kClasses[] = {
      {"CIM_ObjectManager", broker::InstanceMi},
      {"CIM_CIMXMLCommunicationMechanism", broker::InstanceMi},
      {"CIM_Namespace", broker::InstanceMi},
      {"CIM_NamespaceInManager", broker::InstanceMi | broker::AssociationMi},
      {kProfileClass, broker::InstanceMi | broker::MethodMi},
      {kConformanceClass, broker::InstanceMi | broker::AssociationMi},
  };
  for (const char* nameSpace : {kInterop, "root/interop"}) {
    for (const Row& row : kClasses) options.registry.add({row.className, kPrefix, "", row.kinds, nameSpace});
  }
  options.registry.add(
      {kConformanceClass, kPrefix, "", broker::InstanceMi | broker::AssociationMi, kEndpointNameSpace});
  servedNameSpaces() = options.registry.nameSpaces();
  options.linked.push_back(linked("InstanceMI", createMi<CMPIInstanceMI, CMPIInstanceMIFT, &instanceTable>));
  options.linked.push_back(
      linked("AssociationMI", createMi<CMPIAssociationMI, CMPIAssociationMIFT, &associationTable>));
  options.linked.push_back(linked("MethodMI", createMi<CMPIMethodMI, CMPIMethodMIFT, &methodTable>));
}

}  // namespace zorva::cimom
