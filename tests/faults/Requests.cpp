#include "Requests.h"

#include <string_view>

namespace ZV::Test {
namespace {

// The changes of a modification; without properties if the class refuses it.
Instance changeOf(const Provider& provider) {
  const Instance none(provider.className);
  const Value suffixes = texts({"new.example.org", "more.example.org"});
  const std::string_view name = provider.className;
  if (name == kEndpointClass) {
    return none.with("DNSSuffixesToAppend", suffixes).with("DomainName", "new.example.org").with("Hostname", "newhost");
  }
  if (name == kSettingClass) {
    return none.with("RequestedHostname", "newhost")
        .with("DomainName", "new.example.org")
        .with("DNSServerAddresses", texts({"192.0.2.1", "192.0.2.2"}))
        .with("ConfigurationName", "new configuration");
  }
  if (name == kGeneralSettingClass) {
    return none.with("DNSSuffixesToAppend", suffixes).with("ConfigurationName", "new configuration");
  }
  return none;
}

template <typename Operation>
std::function<Outcome(RecordingBroker&)> asking(InstanceProvider::Create create, Operation operation) {
  return [create, operation](RecordingBroker& broker) {
    InstanceProvider provider(create, broker);
    return operation(provider);
  };
}

void addInstanceRequests(const Provider& provider, std::vector<Request>& all) {
  const auto create = provider.createInstanceMI;
  const Path name(provider.className);
  const Path object = provider.object();
  const std::vector<std::string> keys = {object.keys.front().first};
  const Instance change = changeOf(provider);

  all.push_back(
      {"EnumInstanceNames", Kind::Read, asking(create, [=](auto& mi) { return mi.enumerateInstanceNames(name); })});
  all.push_back({"EnumInstances", Kind::Read, asking(create, [=](auto& mi) { return mi.enumerateInstances(name); })});
  if (!provider.isAssociation()) {  // there the list is passed to the broker, and the calls are the same
    all.push_back({"EnumInstances with a property list", Kind::Read,
                   asking(create, [=](auto& mi) { return mi.enumerateInstances(name, PropertyList(keys)); })});
  }
  all.push_back({"GetInstance", Kind::Read, asking(create, [=](auto& mi) { return mi.getInstance(object); })});
  all.push_back({"GetInstance of a name without keys", Kind::Read,
                 asking(create, [=](auto& mi) { return mi.getInstance(name); })});
  all.push_back({"ModifyInstance", !change.properties.empty() ? Kind::Modify : Kind::Refused,
                 asking(create, [=](auto& mi) { return mi.modifyInstance(object, change); })});
  all.push_back(
      {"CreateInstance", Kind::Refused, asking(create, [=](auto& mi) { return mi.createInstance(object, change); })});
  all.push_back({"DeleteInstance", Kind::Refused, asking(create, [=](auto& mi) { return mi.deleteInstance(object); })});
  all.push_back({"ExecQuery", Kind::Refused, asking(create, [=](auto& mi) {
                   return mi.execQuery(name, "SELECT * FROM CIM_ManagedElement", "DMTF:CQL");
                 })});
}

template <typename Operation>
void addAssociationRequest(const Provider& provider, const char* name, Operation operation, std::vector<Request>& all) {
  for (const Path& source : {provider.left, provider.right}) {
    const AssociationProvider::Create create = provider.createAssociationMI;
    const AssociationQuery query{.assocClass = provider.className};
    all.push_back({name + (" of " + source.className), Kind::Read, [=](RecordingBroker& broker) {
                     AssociationProvider association(create, broker);
                     return operation(association, source, query);
                   }});
  }
}

void addAssociationRequests(const Provider& provider, std::vector<Request>& all) {
  addAssociationRequest(
      provider, "Associators",
      [](auto& mi, const Path& source, const AssociationQuery& query) { return mi.associators(source, query); }, all);
  addAssociationRequest(
      provider, "AssociatorNames",
      [](auto& mi, const Path& source, const AssociationQuery& query) { return mi.associatorNames(source, query); },
      all);
  addAssociationRequest(
      provider, "References",
      [](auto& mi, const Path& source, const AssociationQuery&) { return mi.references(source); }, all);
  addAssociationRequest(
      provider, "ReferenceNames",
      [](auto& mi, const Path& source, const AssociationQuery&) { return mi.referenceNames(source); }, all);
}

void addMethodRequests(const Provider& provider, std::vector<Request>& all) {
  const Value list = texts({"192.0.2.1", "192.0.2.2"});
  const std::pair<const char*, NamedValue> methods[] = {
      {"SetDNSDomain", {"DNSDomain", text("new.example.org")}},
      {"SetDNSServerSearchOrder", {"DNSServerSearchOrder", list}},
      {"SetDNSSuffixSearchOrder", {"DNSDomainSuffixSearchOrder", list}},
      {"NoSuchMethod", {"Argument", text("")}},
  };
  for (const auto& [method, argument] : methods) {
    const MethodProvider::Create create = provider.createMethodMI;
    const Path object = provider.object();
    all.push_back({method, Kind::Method, [create, object, method = method, argument = argument](auto& broker) {
                     MethodProvider mi(create, broker);
                     return mi.invokeMethod(object, method, {argument});
                   }});
  }
}

}  // namespace

std::vector<Request> requestsOf(const Provider& provider) {
  std::vector<Request> all;
  addInstanceRequests(provider, all);
  if (provider.createAssociationMI != nullptr) addAssociationRequests(provider, all);
  if (provider.createMethodMI != nullptr) addMethodRequests(provider, all);
  return all;
}

}  // namespace ZV::Test
