// The linker puts these functions in the place of the fetches of settings (--wrap), so that tests can stand in between.
#include "providers/testing/SettingAssociations.h"
#include "factory/DNSGeneralSettingDataObjects.h"
#include "factory/DNSSettingDataObjects.h"

namespace ZV::Test {

namespace {

FetchHook* activeHook = nullptr;

using Paths = std::vector<CMPIObjectPath*>;
using Instances = std::vector<CMPIInstance*>;

template <typename Objects>
unsigned short hooked(unsigned short fetched, Objects& objects,
                      std::function<unsigned short(Objects&)> FetchHook::*change) {
  return activeHook != nullptr && activeHook->*change ? (activeHook->*change)(objects) : fetched;
}

}  // namespace

FetchHook::FetchHook() { activeHook = this; }
FetchHook::~FetchHook() { activeHook = nullptr; }

// By the linker's names the function in the factory, and the one that takes its place.
#define ZV_WRAPPED(function, symbol)                            \
  decltype(function) real_##function __asm__("__real_" symbol); \
  decltype(function) wrapped_##function __asm__("__wrap_" symbol);

ZV_WRAPPED(getAllDNSGeneralSettingDataCMPIObjectPaths,
           "_ZN2ZV42getAllDNSGeneralSettingDataCMPIObjectPathsEPK11_CMPIBrokerPK15_CMPIObjectPathPSt6vectorIPS3_"
           "SaIS7_EEP11_CMPIStatus")
ZV_WRAPPED(getAllDNSSettingDataCMPIObjectPaths,
           "_ZN2ZV35getAllDNSSettingDataCMPIObjectPathsEPK11_CMPIBrokerPK15_CMPIObjectPathPSt6vectorIPS3_SaIS7_EEP11_"
           "CMPIStatus")
ZV_WRAPPED(getAllDNSGeneralSettingDataCMPIInstances,
           "_ZN2ZV40getAllDNSGeneralSettingDataCMPIInstancesEPK11_CMPIBrokerPK15_CMPIObjectPathPPKcPSt6vectorIP13_"
           "CMPIInstanceSaISB_EEP11_CMPIStatus")
ZV_WRAPPED(getAllDNSSettingDataCMPIInstances,
           "_ZN2ZV33getAllDNSSettingDataCMPIInstancesEPK11_CMPIBrokerPK15_CMPIObjectPathPPKcPSt6vectorIP13_"
           "CMPIInstanceSaISB_EEP11_CMPIStatus")

unsigned short wrapped_getAllDNSGeneralSettingDataCMPIObjectPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                                  Paths* paths, CMPIStatus* status) {
  const unsigned short fetched = real_getAllDNSGeneralSettingDataCMPIObjectPaths(broker, ref, paths, status);
  return hooked(fetched, *paths, &FetchHook::generalSettingPaths);
}

unsigned short wrapped_getAllDNSSettingDataCMPIObjectPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                           Paths* paths, CMPIStatus* status) {
  const unsigned short fetched = real_getAllDNSSettingDataCMPIObjectPaths(broker, ref, paths, status);
  return hooked(fetched, *paths, &FetchHook::settingPaths);
}

unsigned short wrapped_getAllDNSGeneralSettingDataCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                                const char** properties, Instances* instances,
                                                                CMPIStatus* status) {
  const unsigned short fetched =
      real_getAllDNSGeneralSettingDataCMPIInstances(broker, ref, properties, instances, status);
  return hooked(fetched, *instances, &FetchHook::generalSettings);
}

unsigned short wrapped_getAllDNSSettingDataCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                         const char** properties, Instances* instances,
                                                         CMPIStatus* status) {
  const unsigned short fetched = real_getAllDNSSettingDataCMPIInstances(broker, ref, properties, instances, status);
  return hooked(fetched, *instances, &FetchHook::settings);
}

}  // namespace ZV::Test
