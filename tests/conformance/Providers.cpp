#include "Providers.h"

#include <algorithm>
#include <array>

#define ZV_INSTANCE(prefix) \
  extern "C" CMPIInstanceMI* prefix##_Create_InstanceMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
#define ZV_ASSOCIATION(prefix) \
  ZV_INSTANCE(prefix)          \
  extern "C" CMPIAssociationMI* prefix##_Create_AssociationMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

ZV_INSTANCE(DNSClientProvider)
extern "C" CMPIMethodMI* DNSClientProvider_Create_MethodMI(const CMPIBroker*, const CMPIContext*, CMPIStatus*);
ZV_INSTANCE(DNSRemoteServiceAccessPointProvider)
ZV_INSTANCE(DNSSettingDataProvider)
ZV_INSTANCE(DNSGeneralSettingDataProvider)
ZV_ASSOCIATION(DNSRemoteAccessAvailableToElementProvider)
ZV_ASSOCIATION(DNSSAPSAPDependencyProvider)
ZV_ASSOCIATION(DNSHostedAccessPointProvider)
ZV_ASSOCIATION(DNSGeneralElementSettingDataProvider)
ZV_ASSOCIATION(DNSGenEndPointElementSettingDataProvider)
ZV_ASSOCIATION(DNSEndPointElementSettingDataProvider)
ZV_ASSOCIATION(DNSGeneralOrderedComponentProvider)
ZV_ASSOCIATION(DNSOrderedComponentProvider)

namespace ZV::Test {

namespace {

#define ZV_INSTANCE_ALONE(prefix) \
  ProviderFunctions { #prefix, prefix##_Create_InstanceMI, nullptr, nullptr }
#define ZV_WITH_ASSOCIATION(prefix) \
  ProviderFunctions { #prefix, prefix##_Create_InstanceMI, prefix##_Create_AssociationMI, nullptr }

constexpr std::array kProviders{
    ProviderFunctions{"DNSClientProvider", DNSClientProvider_Create_InstanceMI, nullptr,
                      DNSClientProvider_Create_MethodMI},
    ZV_INSTANCE_ALONE(DNSRemoteServiceAccessPointProvider),
    ZV_INSTANCE_ALONE(DNSSettingDataProvider),
    ZV_INSTANCE_ALONE(DNSGeneralSettingDataProvider),
    ZV_WITH_ASSOCIATION(DNSRemoteAccessAvailableToElementProvider),
    ZV_WITH_ASSOCIATION(DNSSAPSAPDependencyProvider),
    ZV_WITH_ASSOCIATION(DNSHostedAccessPointProvider),
    ZV_WITH_ASSOCIATION(DNSGeneralElementSettingDataProvider),
    ZV_WITH_ASSOCIATION(DNSGenEndPointElementSettingDataProvider),
    ZV_WITH_ASSOCIATION(DNSEndPointElementSettingDataProvider),
    ZV_WITH_ASSOCIATION(DNSGeneralOrderedComponentProvider),
    ZV_WITH_ASSOCIATION(DNSOrderedComponentProvider),
};

}  // namespace

const ProviderFunctions* findProvider(const std::string& prefix) {
  const auto* found = std::find_if(kProviders.begin(), kProviders.end(),
                                   [&prefix](const ProviderFunctions& provider) { return prefix == provider.prefix; });
  return found == kProviders.end() ? nullptr : found;
}

}  // namespace ZV::Test
