#include "cimom/InteropModel.h"

#include "util/Names.h"

namespace zorva::cimom {

namespace {

using broker::Instance;
using broker::ObjectPath;
using broker::Scalar;
using broker::Value;
using schema::Type;

Value text(std::string value) { return Value::text(std::move(value)); }
Value number(std::uint64_t value, Type type) { return Value::unsignedNumber(value, type); }
Value numbers(std::initializer_list<std::uint64_t> values) {
  return Value::array(Type::Uint16, std::vector<Scalar>(values.begin(), values.end()));
}

/// An instance whose keys come first; they are properties too.
Instance make(const InteropWorld& world, std::string className, std::vector<broker::NamedValue> keys,
              std::vector<broker::NamedValue> properties) {
  Instance instance;
  instance.path = {"", world.nameSpace, std::move(className), std::move(keys)};
  for (const broker::NamedValue& key : instance.path.keys)
    instance.properties.push_back({key.name, key.value, nullptr});
  for (broker::NamedValue& property : properties) {
    instance.properties.push_back({std::move(property.name), std::move(property.value), nullptr});
  }
  return instance;
}

/// The system that the server runs on; if no provider returns one, the host's name is used.
broker::NamedValue systemClass(const InteropWorld& world) {
  return {"SystemCreationClassName",
          text(world.systems.empty() ? "CIM_ComputerSystem" : world.systems.front().className)};
}

broker::NamedValue systemName(const InteropWorld& world) {
  const Value* name = world.systems.empty() ? nullptr : world.systems.front().key("Name");
  return {"SystemName", text(name != nullptr ? std::string(name->asText()) : world.hostName)};
}

constexpr const char* kManagerClass = "CIM_ObjectManager";

std::string managerName(const InteropWorld& world) { return "zorvacimd:" + world.hostName; }

Instance manager(const InteropWorld& world) {
  return make(world, kManagerClass,
              {systemClass(world),
               systemName(world),
               {"CreationClassName", text(kManagerClass)},
               {"Name", text(managerName(world))}},
              {{"ElementName", text("zorvacimd")},
               {"Description", text("The CIM server zorvacimd " ZORVA_VERSION)},
               {"GatherStatisticalData", Value::boolean(false)},
               {"Started", Value::boolean(true)},
               {"EnabledState", number(2, Type::Uint16)},
               {"HealthState", number(5, Type::Uint16)},
               {"OperationalStatus", numbers({2})}});
}

Instance communication(const InteropWorld& world) {
  constexpr const char* kClass = "CIM_CIMXMLCommunicationMechanism";
  return make(world, kClass,
              {systemClass(world),
               systemName(world),
               {"CreationClassName", text(kClass)},
               {"Name", text(managerName(world) + ":cim-xml")}},
              {{"ElementName", text("CIM-XML over HTTP")},
               {"CommunicationMechanism", number(2, Type::Uint16)},
               // Basic read and write, instance manipulation, association traversal, pulled read and its count.
               {"FunctionalProfilesSupported", numbers({2, 3, 5, 6, 10, 11})},
               {"MultipleOperationsSupported", Value::boolean(true)},
               {"AuthenticationMechanismsSupported", numbers({2})},
               {"Version", text("1.2")},
               {"AdvertiseTypes", numbers({2})},
               {"CIMXMLProtocolVersion", number(1, Type::Uint16)},
               {"CIMValidated", Value::boolean(false)},
               {"PulledEnumerationClosureOnExceedingServerLimitsSupported", Value::boolean(false)},
               {"PulledEnumerationContinuationOnErrorSupported", Value::boolean(false)},
               {"PulledEnumerationNoOperationTimeoutSupported", Value::boolean(false)}});
}

Instance nameSpaceInstance(const InteropWorld& world, const std::string& name) {
  constexpr const char* kClass = "CIM_Namespace";
  return make(world, kClass,
              {systemClass(world),
               systemName(world),
               {"ObjectManagerCreationClassName", text(kManagerClass)},
               {"ObjectManagerName", text(managerName(world))},
               {"CreationClassName", text(kClass)},
               {"Name", text(name)}},
              {{"ElementName", text(name)},
               {"ClassInfo", number(1, Type::Uint16)},
               {"DescriptionOfClassInfo", text("CIM Schema 2, and extensions of it")},
               {"ClassType", number(2, Type::Uint16)}});
}

Instance profile(const InteropWorld& world) {
  Instance instance =
      make(world, kProfileClass, {{"InstanceID", text("ZORVA:DNSClient:1.0.0")}},
           {{"ElementName", text("Zorva DNS Client")},
            {"Description", text("The DNS client configuration of a host, as the classes ZORVA_DNS* publish it")},
            {"SpecificationType", number(2, Type::Uint16)},
            // Other: conformance to a profile of another publisher is not declared.
            {"RegisteredOrganization", number(1, Type::Uint16)},
            {"OtherRegisteredOrganization", text("Zorva")},
            {"RegisteredName", text("Zorva DNS Client")},
            {"RegisteredVersion", text("1.0.0")},
            {"AdvertiseTypes", numbers({2})}});
  instance.path.nameSpace = world.profileNameSpace;
  return instance;
}

/// Only for the central instances: the association and GetCentralInstances give the same.
std::vector<Instance> conformances(const InteropWorld& world) {
  std::vector<Instance> all;
  for (const ObjectPath& endpoint : world.endpoints) {
    all.push_back(make(
        world, kConformanceClass,
        {{"ConformantStandard", Value::reference(profile(world).path)}, {"ManagedElement", Value::reference(endpoint)}},
        {}));
  }
  return all;
}

std::vector<Instance> namespaceLinks(const InteropWorld& world) {
  std::vector<Instance> all;
  for (const std::string& name : world.nameSpaces) {
    all.push_back(make(world, "CIM_NamespaceInManager",
                       {{"Antecedent", Value::reference(manager(world).path)},
                        {"Dependent", Value::reference(nameSpaceInstance(world, name).path)}},
                       {}));
  }
  return all;
}

bool sameKey(const Value& a, const Value& b) {
  const auto* one = std::get_if<broker::Boxed<ObjectPath>>(&a.scalar);
  const auto* other = std::get_if<broker::Boxed<ObjectPath>>(&b.scalar);
  if (one != nullptr && other != nullptr) return sameInstance(**one, **other);
  return a.scalar == b.scalar;
}

}  // namespace

std::vector<Instance> interopInstances(const InteropWorld& world, std::string_view className) {
  const auto is = [className](std::string_view name) { return util::sameName(className, name); };
  if (is(kManagerClass)) return {manager(world)};
  if (is("CIM_CIMXMLCommunicationMechanism")) return {communication(world)};
  if (is(kProfileClass)) return {profile(world)};
  if (is(kConformanceClass)) return conformances(world);
  if (is("CIM_NamespaceInManager")) return namespaceLinks(world);
  std::vector<Instance> all;
  if (is("CIM_Namespace")) {
    for (const std::string& name : world.nameSpaces) all.push_back(nameSpaceInstance(world, name));
  }
  return all;
}

bool sameInstance(const ObjectPath& a, const ObjectPath& b) {
  if (!util::sameName(a.className, b.className) || a.keys.size() != b.keys.size()) return false;
  for (const broker::NamedValue& key : a.keys) {
    const Value* other = b.key(key.name);
    if (other == nullptr || !sameKey(key.value, *other)) return false;
  }
  return true;
}

}  // namespace zorva::cimom
