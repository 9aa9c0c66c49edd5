// CMPI objects of ZORVA_DNSSettingData: one for each network interface, those of the service processor included.
#pragma once

#include <cmpidt.h>

#include <vector>

#include "settings/DNSSettingData.h"

namespace ZV {

// Results other than 0 mean failure; no function here sets a code in the status, which is handed to the broker's calls
// and must not be null. ref gives the namespace of every path. Objects belong to the broker.

// 1: a path could not be made; those before it are in paths. An interface without a name gives a path without a key.
unsigned short getAllDNSSettingDataCMPIObjectPaths(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                   std::vector<CMPIObjectPath*>* paths, CMPIStatus* status);

// An instance of the interface that data stands on, with its key and the properties that the list names: without a list
// all of them, or none where isObjPath asks for the key alone. Null, or an instance without a handle, where none could
// be made.
CMPIInstance* makeDNSSettingDataInstance(const CMPIBroker* broker, const CMPIObjectPath* ref, DNSSettingData data,
                                         const char** properties, bool isObjPath, CMPIStatus* status);

// The instance whose InstanceID is the key of ref. 1: there is none.
unsigned short getOneDNSSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                const char** properties, CMPIInstance** instance, CMPIStatus* status);

// Always 0.
unsigned short getAllDNSSettingDataCMPIInstances(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                 const char** properties, std::vector<CMPIInstance*>* instances,
                                                 CMPIStatus* status);

}  // namespace ZV
