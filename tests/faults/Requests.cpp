#include "Requests.h"

#include "providers/testing/AssociationTestSupport.h"

#define ZV_PROVIDER(prefix) \
  extern "C" CMPIInstanceMI* prefix##_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*)
#define ZV_ASSOCIATION(prefix) \
  ZV_PROVIDER(prefix);         \
  extern "C" CMPIAssociationMI* prefix##_Create_AssociationMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*)

ZV_PROVIDER(DNSClientProvider);
extern "C" CMPIMethodMI* DNSClientProvider_Create_MethodMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
ZV_PROVIDER(DNSRemoteServiceAccessPointProvider);
ZV_PROVIDER(DNSSettingDataProvider);
ZV_PROVIDER(DNSGeneralSettingDataProvider);
ZV_ASSOCIATION(DNSRemoteAccessAvailableToElementProvider);
ZV_ASSOCIATION(DNSSAPSAPDependencyProvider);
ZV_ASSOCIATION(DNSHostedAccessPointProvider);
ZV_ASSOCIATION(DNSGeneralElementSettingDataProvider);
ZV_ASSOCIATION(DNSGenEndPointElementSettingDataProvider);
ZV_ASSOCIATION(DNSEndPointElementSettingDataProvider);
ZV_ASSOCIATION(DNSGeneralOrderedComponentProvider);
ZV_ASSOCIATION(DNSOrderedComponentProvider);

namespace ZV::Test {

Path Provider::object() const {
  return isAssociation() ? Path(className).key(leftRole, ref(left)).key(rightRole, ref(right)) : left;
}

namespace {

const Path kEndpoint = endpointPath("eth0");
const Path kServer = serverPath("192.0.2.53");
const Path kSetting = settingPath("Computer%eth0");
const Path kGeneralSetting = generalSettingPath();
const Path kSystem = systemPath("host1");
const Path kIpEndpoint = ipEndpointPath("eth0");
const Path kAssignment = ipAssignmentPath("Computer%eth0%ipv4");

#define ZV_BOTH(prefix) prefix##_Create_InstanceMI, prefix##_Create_AssociationMI

std::vector<Provider> makeProviders() {
  return {
      {.prefix = "DNSClientProvider",
       .className = "ZORVA_DNSProtocolEndPoint",
       .createInstanceMI = DNSClientProvider_Create_InstanceMI,
       .createMethodMI = DNSClientProvider_Create_MethodMI,
       .left = kEndpoint,
       .change = Instance("ZORVA_DNSProtocolEndPoint")
                     .with("DNSSuffixesToAppend", texts({"new.example.org", "more.example.org"}))
                     .with("DomainName", "new.example.org")
                     .with("Hostname", "newhost")},
      {.prefix = "DNSRemoteServiceAccessPointProvider",
       .className = "ZORVA_RemoteServiceAccessPoint",
       .createInstanceMI = DNSRemoteServiceAccessPointProvider_Create_InstanceMI,
       .left = kServer},
      {.prefix = "DNSSettingDataProvider",
       .className = "ZORVA_DNSSettingData",
       .createInstanceMI = DNSSettingDataProvider_Create_InstanceMI,
       .left = kSetting,
       .change = Instance("ZORVA_DNSSettingData")
                     .with("RequestedHostname", "newhost")
                     .with("DomainName", "new.example.org")
                     .with("DNSServerAddresses", texts({"192.0.2.1", "192.0.2.2"}))
                     .with("ConfigurationName", "new configuration")},
      {.prefix = "DNSGeneralSettingDataProvider",
       .className = "ZORVA_DNSGeneralSettingData",
       .createInstanceMI = DNSGeneralSettingDataProvider_Create_InstanceMI,
       .left = kGeneralSetting,
       .change = Instance("ZORVA_DNSGeneralSettingData")
                     .with("DNSSuffixesToAppend", texts({"new.example.org", "more.example.org"}))
                     .with("ConfigurationName", "new configuration")},
      {"DNSRemoteAccessAvailableToElementProvider", "ZORVA_RemoteAccessAvailableToElement",
       ZV_BOTH(DNSRemoteAccessAvailableToElementProvider), nullptr, "Antecedent", kServer, "Dependent", kEndpoint},
      {"DNSSAPSAPDependencyProvider", "ZORVA_DNSSAPSAPDependency", ZV_BOTH(DNSSAPSAPDependencyProvider), nullptr,
       "Antecedent", kIpEndpoint, "Dependent", kEndpoint},
      {"DNSHostedAccessPointProvider", "ZORVA_DNSHostedAccessPoint", ZV_BOTH(DNSHostedAccessPointProvider), nullptr,
       "Antecedent", kSystem, "Dependent", kEndpoint},
      {"DNSGeneralElementSettingDataProvider", "ZORVA_DNSGeneralElementSettingData",
       ZV_BOTH(DNSGeneralElementSettingDataProvider), nullptr, "ManagedElement", kSystem, "SettingData",
       kGeneralSetting},
      {"DNSGenEndPointElementSettingDataProvider", "ZORVA_DNSGenEndPointElementSettingData",
       ZV_BOTH(DNSGenEndPointElementSettingDataProvider), nullptr, "ManagedElement", kEndpoint, "SettingData",
       kGeneralSetting},
      {"DNSEndPointElementSettingDataProvider", "ZORVA_DNSEndPointElementSettingData",
       ZV_BOTH(DNSEndPointElementSettingDataProvider), nullptr, "ManagedElement", kEndpoint, "SettingData", kSetting},
      {"DNSGeneralOrderedComponentProvider", "ZORVA_DNSGenOrderedComponent",
       ZV_BOTH(DNSGeneralOrderedComponentProvider), nullptr, "GroupComponent", kAssignment, "PartComponent",
       kGeneralSetting},
      {"DNSOrderedComponentProvider", "ZORVA_DNSOrderedComponent", ZV_BOTH(DNSOrderedComponentProvider), nullptr,
       "GroupComponent", kAssignment, "PartComponent", kSetting},
  };
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
  const bool isChangeable = !provider.change.properties.empty();
  const Instance change = isChangeable ? provider.change : Instance(provider.className);

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
  all.push_back({"ModifyInstance", isChangeable ? Kind::Modify : Kind::Refused,
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

const std::vector<Provider>& allProviders() {
  static const std::vector<Provider> all = makeProviders();
  return all;
}

std::vector<Request> requestsOf(const Provider& provider) {
  std::vector<Request> all;
  addInstanceRequests(provider, all);
  if (provider.createAssociationMI != nullptr) addAssociationRequests(provider, all);
  if (provider.createMethodMI != nullptr) addMethodRequests(provider, all);
  return all;
}

}  // namespace ZV::Test
