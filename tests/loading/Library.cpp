#include "Library.h"

#include <dlfcn.h>

#include <cstdlib>
#include <sstream>
#include <stdexcept>

namespace ZV::Test {
namespace {

const char* const kTree = R"({ "system_name": "host1", "nodes": [
  { "type": "System", "name": "system", "description": "Computer", "children": [
    { "type": "Port", "name": "eth0", "description": "", "children": [
      { "type": "NetworkIPConfig", "name": "ip", "description": "",
        "properties": { "name": "eth0", "host_name": "host1", "domain_name": "example.org",
          "dns_suffixes": ["example.org"], "dns_server_addresses": ["192.0.2.53", "2001:db8::53"] } } ] },
    { "type": "Port", "name": "eth1", "description": "", "children": [
      { "type": "NetworkIPConfig", "name": "ip", "description": "", "properties": { "name": "eth1" } } ] } ] } ] })";

Instance systemOf(const char* name) {
  return Instance("ZORVA_ComputerSystem").with("CreationClassName", "ZORVA_ComputerSystem").with("Name", name);
}

void tell(std::ostream& out, const char* request, const Outcome& outcome) {
  out << request << " " << nameOf(outcome.rc) << (outcome.done() ? " done\n" : " not done\n");
  for (const Path& path : outcome.paths()) out << describeWhole(path) << "\n";
  for (const Instance& instance : outcome.instances()) out << instance;
}

}  // namespace

Library::Library(const std::string& path, int mode) : handle_(::dlopen(path.c_str(), RTLD_NOW | mode)) {
  if (handle_ == nullptr) throw std::runtime_error(::dlerror());
}

Library::~Library() { ::dlclose(handle_); }

void* Library::address(const std::string& name) const {
  void* const found = ::dlsym(handle_, name.c_str());
  if (found == nullptr) throw std::runtime_error("there is no " + name);
  return found;
}

std::string providerLibraryPath() { return ZORVA_LIB_DIR "/libzorvadnsclientprofileprovider.so.1"; }

const std::vector<ProviderNames>& allProviderNames() {
  static const std::vector<ProviderNames> all = {
      {"DNSClientProvider", "ZORVA_DNSProtocolEndPoint", false},
      {"DNSRemoteServiceAccessPointProvider", "ZORVA_RemoteServiceAccessPoint", false},
      {"DNSSettingDataProvider", "ZORVA_DNSSettingData", false},
      {"DNSGeneralSettingDataProvider", "ZORVA_DNSGeneralSettingData", false},
      {"DNSRemoteAccessAvailableToElementProvider", "ZORVA_RemoteAccessAvailableToElement", true},
      {"DNSSAPSAPDependencyProvider", "ZORVA_DNSSAPSAPDependency", true},
      {"DNSHostedAccessPointProvider", "ZORVA_DNSHostedAccessPoint", true},
      {"DNSGeneralElementSettingDataProvider", "ZORVA_DNSGeneralElementSettingData", true},
      {"DNSGenEndPointElementSettingDataProvider", "ZORVA_DNSGenEndPointElementSettingData", true},
      {"DNSEndPointElementSettingDataProvider", "ZORVA_DNSEndPointElementSettingData", true},
      {"DNSGeneralOrderedComponentProvider", "ZORVA_DNSGenOrderedComponent", true},
      {"DNSOrderedComponentProvider", "ZORVA_DNSOrderedComponent", true},
  };
  return all;
}

DocumentHost::DocumentHost() {
  directory_.write("tree.json", kTree);
  directory_.write("agent.toml", "[agent]\ndata_dir = \"" + directory_.path() +
                                     "\"\n[tree]\nsource = \"file\"\nfile = \"" + directory_ / "tree.json" +
                                     "\"\n[log]\ntarget = \"off\"\n");
  ::setenv("ZORVAGENT_CONFIG", (directory_ / "agent.toml").c_str(), 1);
}

DocumentHost::~DocumentHost() { ::unsetenv("ZORVAGENT_CONFIG"); }

void serveOthers(RecordingBroker& broker) {
  broker.serve("ZORVA_ComputerSystem", {systemOf("host1")});
  broker.serve("ZORVA_IPProtocolEndpoint", {Instance("ZORVA_IPProtocolEndpoint").with("Name", "eth0")});
  broker.serve("ZORVA_IPAssignmentSettingData",
               {Instance("ZORVA_IPAssignmentSettingData").with("InstanceID", "Computer%eth0%ipv4")});
}

std::string askEverything(const Library& library, RecordingBroker& broker) {
  std::ostringstream out;
  for (const auto& [prefix, className, isAssociation] : allProviderNames()) {
    InstanceProvider provider(library.find<InstanceProvider::Create>(std::string(prefix) + "_Create_InstanceMI"),
                              broker);
    const Outcome names = provider.enumerateInstanceNames(Path(className));
    tell(out, className, names);
    tell(out, className, provider.enumerateInstances(Path(className)));
    if (names.paths().empty()) continue;
    const Path first = names.paths().front();
    tell(out, className, provider.getInstance(first));
    if (!isAssociation) continue;
    AssociationProvider association(
        library.find<AssociationProvider::Create>(std::string(prefix) + "_Create_AssociationMI"), broker);
    for (const auto& [role, end] : first.keys) {
      tell(out, role.c_str(), association.associators(end.path(), {.assocClass = className}));
      tell(out, role.c_str(), association.associatorNames(end.path(), {.assocClass = className}));
      tell(out, role.c_str(), association.references(end.path()));
      tell(out, role.c_str(), association.referenceNames(end.path()));
    }
  }
  return out.str();
}

}  // namespace ZV::Test
