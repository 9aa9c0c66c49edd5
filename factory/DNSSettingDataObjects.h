#pragma once

// CMPI objects of ZORVA_DNSSettingData: one for each network interface, those of the service processor included.

#include <cmpidt.h>

#include <vector>

#include "settings/DNSSettingData.h"

namespace ZV {

// A result other than 0 means failure. No function here sets a code in the status, which is passed to the broker's
// calls and must not be null. ref gives the namespace of every path. Objects belong to the broker.

/// 1: a path could not be made; the earlier ones are in paths. An interface without a name gives a path without a key.
unsigned short getAllDNSSettingDataCMPIObjectPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                   std::vector<CMPIObjectPath*>* paths, CMPIStatus* status);

/// An instance for the interface of data, with its key and the properties on the list. Without a list: all of them, or
/// none if isObjPath requests only the key. Null, or an instance without a handle, if none could be made.
CMPIInstance* makeDNSSettingDataInstance(const CMPIBroker* broker, const CMPIObjectPath* ref, DNSSettingData data,
                                         const char** properties, bool isObjPath, CMPIStatus* status);

/// The instance whose InstanceID is the key of ref. 1: there is none.
unsigned short getOneDNSSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                const char** properties, CMPIInstance** instance, CMPIStatus* status);

/// Always 0.
unsigned short getAllDNSSettingDataCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                 const char** properties, std::vector<CMPIInstance*>* instances,
                                                 CMPIStatus* status);

}  // namespace ZV
