#pragma once

// Objects of the profile's classes, as a client or another provider names them.

#include <string>
#include <vector>

#include "tests/support/CimValues.h"

namespace ZV::Test {

inline const char* const kEndpointClass = "ZORVA_DNSProtocolEndPoint";
inline const char* const kServerClass = "ZORVA_RemoteServiceAccessPoint";
inline const char* const kSettingClass = "ZORVA_DNSSettingData";
inline const char* const kGeneralSettingClass = "ZORVA_DNSGeneralSettingData";
inline const char* const kSystemClass = "ZORVA_ComputerSystem";
inline const char* const kIpEndpointClass = "ZORVA_IPProtocolEndpoint";
inline const char* const kIpAssignmentClass = "ZORVA_IPAssignmentSettingData";

inline Path pathOnSystem(const char* className, const std::string& name, const std::string& systemName) {
  return Path(className)
      .key("SystemCreationClassName", kSystemClass)
      .key("CreationClassName", className)
      .key("SystemName", systemName.c_str())
      .key("Name", name.c_str());
}
inline Path endpointPath(const std::string& name, const std::string& systemName = "host1") {
  return pathOnSystem(kEndpointClass, name, systemName);
}
inline Path serverPath(const std::string& address, const std::string& systemName = "host1") {
  return pathOnSystem(kServerClass, address, systemName);
}
inline Path ipEndpointPath(const std::string& name) { return pathOnSystem(kIpEndpointClass, name, "host1"); }
inline Path systemPath(const std::string& name) {
  return Path(kSystemClass).key("CreationClassName", kSystemClass).key("Name", name.c_str());
}
inline Path generalSettingPath(const std::string& instanceID = "dnsgen1:host1") {
  return Path(kGeneralSettingClass).key("InstanceID", instanceID.c_str());
}
inline Path settingPath(const std::string& instanceID) {
  return Path(kSettingClass).key("InstanceID", instanceID.c_str());
}
inline Path ipAssignmentPath(const std::string& instanceID) {
  return Path(kIpAssignmentClass).key("InstanceID", instanceID.c_str());
}

/// The objects of paths, with their keys as properties, as another provider serves them.
inline Instance objectOf(const Path& path) {
  Instance object(path.className);
  for (const auto& [name, value] : path.keys) object = object.with(name, value);
  return object;
}
inline std::vector<Instance> objectsOf(const std::vector<Path>& paths) {
  std::vector<Instance> all;
  for (const Path& path : paths) all.push_back(objectOf(path));
  return all;
}

}  // namespace ZV::Test
