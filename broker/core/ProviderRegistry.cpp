#include "broker/core/ProviderRegistry.h"

#include <algorithm>
#include <filesystem>
#include <system_error>
#include <utility>

#include "schema/Schema.h"
#include "util/Names.h"

namespace zorva::broker {

namespace {

constexpr const char* kProfileLibrary = "zorvadnsclientprofileprovider";
constexpr const char* kHostLibrary = "zorvahostprofileprovider";

// Prefix and class differ in spelling in places ("EndPoint" and "Endpoint"): the prefix is what the library exports,
// the class is what the schema has.
struct BuiltIn {
  const char* className;
  const char* prefix;
  const char* library;
  unsigned kinds;
};

constexpr BuiltIn kBuiltIn[] = {
    {"ZORVA_DNSProtocolEndPoint", "DNSClientProvider", kProfileLibrary, InstanceMi | MethodMi},
    {"ZORVA_RemoteServiceAccessPoint", "DNSRemoteServiceAccessPointProvider", kProfileLibrary, InstanceMi},
    {"ZORVA_DNSSettingData", "DNSSettingDataProvider", kProfileLibrary, InstanceMi},
    {"ZORVA_DNSGeneralSettingData", "DNSGeneralSettingDataProvider", kProfileLibrary, InstanceMi},
    {"ZORVA_RemoteAccessAvailableToElement", "DNSRemoteAccessAvailableToElementProvider", kProfileLibrary,
     InstanceMi | AssociationMi},
    {"ZORVA_DNSSAPSAPDependency", "DNSSAPSAPDependencyProvider", kProfileLibrary, InstanceMi | AssociationMi},
    {"ZORVA_DNSHostedAccessPoint", "DNSHostedAccessPointProvider", kProfileLibrary, InstanceMi | AssociationMi},
    {"ZORVA_DNSGeneralElementSettingData", "DNSGeneralElementSettingDataProvider", kProfileLibrary,
     InstanceMi | AssociationMi},
    {"ZORVA_DNSGenEndPointElementSettingData", "DNSGenEndPointElementSettingDataProvider", kProfileLibrary,
     InstanceMi | AssociationMi},
    {"ZORVA_DNSEndPointElementSettingData", "DNSEndPointElementSettingDataProvider", kProfileLibrary,
     InstanceMi | AssociationMi},
    {"ZORVA_DNSGenOrderedComponent", "DNSGeneralOrderedComponentProvider", kProfileLibrary, InstanceMi | AssociationMi},
    {"ZORVA_DNSOrderedComponent", "DNSOrderedComponentProvider", kProfileLibrary, InstanceMi | AssociationMi},
    {"ZORVA_ComputerSystem", "HostComputerSystemProvider", kHostLibrary, InstanceMi},
    {"ZORVA_SPComputerSystem", "HostComputerSystemProvider", kHostLibrary, InstanceMi},
    {"ZORVA_IPProtocolEndpoint", "HostIPProtocolEndpointProvider", kHostLibrary, InstanceMi},
    {"ZORVA_IPAssignmentSettingData", "HostIPAssignmentSettingDataProvider", kHostLibrary, InstanceMi},
};

/// ProviderEntry::keeps of the modifiable classes. Of the two setting-data providers, one empties a missing
/// ConfigurationName, the other logs an error.
std::vector<std::string> keptBy(std::string_view className) {
  if (className == "ZORVA_DNSProtocolEndPoint") return {"DNSSuffixesToAppend", "DomainName", "Hostname"};
  if (className == "ZORVA_DNSSettingData") return {"RequestedHostname", "DomainName", "DNSServerAddresses"};
  if (className == "ZORVA_DNSGeneralSettingData") return {"DNSSuffixesToAppend"};
  return {};
}

}  // namespace

ProviderRegistry ProviderRegistry::builtIn() {
  ProviderRegistry registry;
  for (const BuiltIn& row : kBuiltIn) {
    ProviderEntry entry{row.className, row.prefix, row.library, row.kinds};
    entry.keeps = keptBy(row.className);
    registry.add(std::move(entry));
  }
  return registry;
}

std::string ProviderRegistry::builtInDirectory() {
  const std::string library = std::string("lib") + kProfileLibrary + ".so.1";
  std::error_code ignored;
  const std::filesystem::path program = std::filesystem::read_symlink("/proc/self/exe", ignored);
  for (const char* libraries : {"lib", ZORVA_INSTALL_LIBDIR}) {
    const std::filesystem::path directory = program.parent_path().parent_path() / libraries;
    if (std::filesystem::exists(directory / library, ignored)) return directory.string();
  }
  return {};
}

void ProviderRegistry::add(ProviderEntry entry) {
  addNameSpace(entry.nameSpace);
  entry.nameSpace = nameSpace(entry.nameSpace);
  const auto same = std::find_if(entries_.begin(), entries_.end(), [&entry](const ProviderEntry& other) {
    return util::sameName(other.className, entry.className) && other.nameSpace == entry.nameSpace;
  });
  if (same != entries_.end()) {
    *same = std::move(entry);
  } else {
    entries_.push_back(std::move(entry));
  }
}

const ProviderEntry* ProviderRegistry::find(std::string_view nameSpace, std::string_view className) const noexcept {
  const auto found = std::find_if(entries_.begin(), entries_.end(), [&](const ProviderEntry& entry) {
    return util::sameName(entry.className, className) && schema::sameNamespace(entry.nameSpace, nameSpace);
  });
  return found != entries_.end() ? &*found : nullptr;
}

std::string_view ProviderRegistry::nameSpace(std::string_view spelling) const noexcept {
  const auto found = std::find_if(nameSpaces_.begin(), nameSpaces_.end(), [spelling](const std::string& known) {
    return schema::sameNamespace(known, spelling);
  });
  return found != nameSpaces_.end() ? std::string_view(*found) : std::string_view();
}

std::string_view ProviderRegistry::defaultNameSpace() const noexcept {
  return nameSpaces_.empty() ? std::string_view("root/cimv2") : std::string_view(nameSpaces_.front());
}

void ProviderRegistry::addNameSpace(std::string nameSpace) {
  if (this->nameSpace(nameSpace).empty()) nameSpaces_.push_back(std::move(nameSpace));
}

}  // namespace zorva::broker
