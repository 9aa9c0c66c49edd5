#pragma once

// The twelve providers by the names that a server, a client and the log know them by.

#include <gtest/gtest.h>

#include <ostream>
#include <string>
#include <string_view>
#include <vector>

#include "tests/support/ProfileObjects.h"
#include "tests/support/ProviderCall.h"

#define ZV_CREATES_INSTANCE_MI(prefix) \
  extern "C" CMPIInstanceMI* prefix##_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
#define ZV_CREATES_BOTH_MIS(prefix) \
  ZV_CREATES_INSTANCE_MI(prefix)    \
  extern "C" CMPIAssociationMI* prefix##_Create_AssociationMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

extern "C" CMPIMethodMI* DNSClientProvider_Create_MethodMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
ZV_CREATES_INSTANCE_MI(DNSClientProvider)
ZV_CREATES_INSTANCE_MI(DNSRemoteServiceAccessPointProvider)
ZV_CREATES_INSTANCE_MI(DNSSettingDataProvider)
ZV_CREATES_INSTANCE_MI(DNSGeneralSettingDataProvider)
ZV_CREATES_BOTH_MIS(DNSRemoteAccessAvailableToElementProvider)
ZV_CREATES_BOTH_MIS(DNSSAPSAPDependencyProvider)
ZV_CREATES_BOTH_MIS(DNSHostedAccessPointProvider)
ZV_CREATES_BOTH_MIS(DNSGeneralElementSettingDataProvider)
ZV_CREATES_BOTH_MIS(DNSGenEndPointElementSettingDataProvider)
ZV_CREATES_BOTH_MIS(DNSEndPointElementSettingDataProvider)
ZV_CREATES_BOTH_MIS(DNSGeneralOrderedComponentProvider)
ZV_CREATES_BOTH_MIS(DNSOrderedComponentProvider)

#undef ZV_CREATES_INSTANCE_MI
#undef ZV_CREATES_BOTH_MIS

namespace ZV::Test {

struct Provider {
  const char* prefix;  ///< of its create functions
  const char* className;
  const char* stem;    ///< of its operations' names
  const char* source;  ///< its file, without folder and ending
  InstanceProvider::Create createInstanceMI;
  AssociationProvider::Create createAssociationMI;  ///< null if it has none
  MethodProvider::Create createMethodMI;            ///< null if it has none
  /// Of an association: its two references in the order in which they are set, and an object of each end on a host with
  /// the interface eth0 and the server 192.0.2.53. Of the others: an object of the class on that host.
  Path left;
  const char* leftRole = nullptr;
  Path right = {};
  const char* rightRole = nullptr;

  bool isAssociation() const { return createAssociationMI != nullptr; }
  /// An object of the class: the association of its two ends, or the object that left names.
  Path object() const {
    return isAssociation() ? Path(className).key(leftRole, ref(left)).key(rightRole, ref(right)) : left;
  }
  std::string file() const { return "providers/" + std::string(source) + ".cpp"; }
  /// The source's name, but for the one whose category keeps the long word.
  std::string category() const {
    const std::string_view name = source;
    return "Zorvagent." +
           std::string(name == "DNSGenOrderedComponentProvider" ? "DNSGeneralOrderedComponentProvider" : name);
  }
};

inline void PrintTo(const Provider& provider, std::ostream* out) { *out << provider.prefix; }

#define ZV_ONE_MI(prefix) prefix##_Create_InstanceMI, nullptr, nullptr
#define ZV_BOTH_MIS(prefix) prefix##_Create_InstanceMI, prefix##_Create_AssociationMI, nullptr

inline std::vector<Provider> makeProviders() {
  const Path endpoint = endpointPath("eth0");
  const Path server = serverPath("192.0.2.53");
  const Path setting = settingPath("Computer%eth0");
  const Path generalSetting = generalSettingPath();
  const Path system = systemPath("host1");
  const Path ipEndpoint = ipEndpointPath("eth0");
  const Path assignment = ipAssignmentPath("Computer%eth0%ipv4");
  return {
      {"DNSClientProvider", kEndpointClass, "DNSClient", "DNSClientProvider", DNSClientProvider_Create_InstanceMI,
       nullptr, DNSClientProvider_Create_MethodMI, endpoint},
      {"DNSRemoteServiceAccessPointProvider", kServerClass, "DNSRemoteServiceAccessPoint",
       "DNSRemoteServiceAccessPointProvider", ZV_ONE_MI(DNSRemoteServiceAccessPointProvider), server},
      {"DNSSettingDataProvider", kSettingClass, "DNSSettingData", "DNSSettingDataProvider",
       ZV_ONE_MI(DNSSettingDataProvider), setting},
      {"DNSGeneralSettingDataProvider", kGeneralSettingClass, "DNSGeneralSettingData", "DNSGeneralSettingDataProvider",
       ZV_ONE_MI(DNSGeneralSettingDataProvider), generalSetting},
      {"DNSRemoteAccessAvailableToElementProvider", "ZORVA_RemoteAccessAvailableToElement",
       "DNSRemoteAccessAvailableToElement", "DNSRemoteAccessAvailableToElementProvider",
       ZV_BOTH_MIS(DNSRemoteAccessAvailableToElementProvider), server, "Antecedent", endpoint, "Dependent"},
      {"DNSSAPSAPDependencyProvider", "ZORVA_DNSSAPSAPDependency", "DNSSAPSAPDependency", "DNSSAPSAPDependencyProvider",
       ZV_BOTH_MIS(DNSSAPSAPDependencyProvider), ipEndpoint, "Antecedent", endpoint, "Dependent"},
      {"DNSHostedAccessPointProvider", "ZORVA_DNSHostedAccessPoint", "DNSHostedAccessPoint",
       "DNSHostedAccessPointProvider", ZV_BOTH_MIS(DNSHostedAccessPointProvider), system, "Antecedent", endpoint,
       "Dependent"},
      {"DNSGeneralElementSettingDataProvider", "ZORVA_DNSGeneralElementSettingData", "DNSGeneralElementSettingData",
       "DNSGeneralElementSettingDataProvider", ZV_BOTH_MIS(DNSGeneralElementSettingDataProvider), system,
       "ManagedElement", generalSetting, "SettingData"},
      {"DNSGenEndPointElementSettingDataProvider", "ZORVA_DNSGenEndPointElementSettingData",
       "DNSGenEndpointElementSettingData", "DNSGenEndpointElementSettingDataProvider",
       ZV_BOTH_MIS(DNSGenEndPointElementSettingDataProvider), endpoint, "ManagedElement", generalSetting,
       "SettingData"},
      {"DNSEndPointElementSettingDataProvider", "ZORVA_DNSEndPointElementSettingData", "DNSEndpointElementSettingData",
       "DNSEndpointElementSettingDataProvider", ZV_BOTH_MIS(DNSEndPointElementSettingDataProvider), endpoint,
       "ManagedElement", setting, "SettingData"},
      {"DNSGeneralOrderedComponentProvider", "ZORVA_DNSGenOrderedComponent", "DNSGeneralOrderedComponent",
       "DNSGenOrderedComponentProvider", ZV_BOTH_MIS(DNSGeneralOrderedComponentProvider), assignment, "GroupComponent",
       generalSetting, "PartComponent"},
      {"DNSOrderedComponentProvider", "ZORVA_DNSOrderedComponent", "DNSOrderedComponent", "DNSOrderedComponentProvider",
       ZV_BOTH_MIS(DNSOrderedComponentProvider), assignment, "GroupComponent", setting, "PartComponent"},
  };
}

#undef ZV_ONE_MI
#undef ZV_BOTH_MIS

inline const std::vector<Provider>& allProviders() {
  static const std::vector<Provider> all = makeProviders();
  return all;
}

/// The provider with that prefix; null if there is none.
inline const Provider* findProvider(std::string_view prefix) {
  for (const Provider& provider : allProviders()) {
    if (prefix == provider.prefix) return &provider;
  }
  return nullptr;
}

inline std::vector<Provider> associationProviders() {
  std::vector<Provider> some;
  for (const Provider& provider : allProviders()) {
    if (provider.isAssociation()) some.push_back(provider);
  }
  return some;
}

inline std::string stemOf(const ::testing::TestParamInfo<Provider>& row) { return row.param.stem; }

}  // namespace ZV::Test
