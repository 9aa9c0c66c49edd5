#pragma once

// CMPI objects of ZORVA_DNSGeneralSettingData: at most one, the settings of the host as a whole.

#include <cmpidt.h>

#include <vector>

#include "settings/DNSGeneralSettingData.h"

namespace ZV {

// A result other than 0 means failure. No function here sets a code in the status, which is passed to the broker's
// calls and must not be null. ref gives the namespace of every path. Objects belong to the broker.

/// 1: the path could not be made.
unsigned short getAllDNSGeneralSettingDataCMPIObjectPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                          std::vector<CMPIObjectPath*>* paths, CMPIStatus* status);

/// Like makeDNSSettingDataInstance, for the interface of data.
CMPIInstance* makeDNSGeneralSettingDataInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                DNSGeneralSettingData data, const char** properties, bool isObjPath,
                                                CMPIStatus* status);

/// The only instance; the InstanceID of ref is ignored. Always 0.
unsigned short getOneDNSGeneralSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                       const char** properties, std::vector<CMPIInstance*>* instances,
                                                       CMPIStatus* status);

/// Always 0.
unsigned short getAllDNSGeneralSettingDataCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                        const char** properties, std::vector<CMPIInstance*>* instances,
                                                        CMPIStatus* status);

}  // namespace ZV
