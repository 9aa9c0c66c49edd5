// CMPI objects of ZORVA_DNSGeneralSettingData: at most one, the settings of the host as a whole.
#pragma once

#include <cmpidt.h>

#include <vector>

#include "settings/DNSGeneralSettingData.h"

namespace ZV {

// Results other than 0 mean failure; no function here sets a code in the status, which is handed to the broker's calls
// and must not be null. ref gives the namespace of every path. Objects belong to the broker.

// 1: the path could not be made.
unsigned short getAllDNSGeneralSettingDataCMPIObjectPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                          std::vector<CMPIObjectPath*>* paths, CMPIStatus* status);

// As makeDNSSettingDataInstance, of the interface that data stands on.
CMPIInstance* makeDNSGeneralSettingDataInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                DNSGeneralSettingData data, const char** properties, bool isObjPath,
                                                CMPIStatus* status);

// The one instance, whatever the InstanceID of ref says. Always 0.
unsigned short getOneDNSGeneralSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                       const char** properties, std::vector<CMPIInstance*>* instances,
                                                       CMPIStatus* status);

// Always 0.
unsigned short getAllDNSGeneralSettingDataCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                        const char** properties, std::vector<CMPIInstance*>* instances,
                                                        CMPIStatus* status);

}  // namespace ZV
