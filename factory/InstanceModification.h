// What ModifyInstance changes. The two classes of setting data write to the interface's file and the endpoint to the
// node; nothing keeps the two in step.
#pragma once

#include <cmpidt.h>

namespace ZV {

// Each returns CMPI_RC_OK, CMPI_RC_ERR_FAILED, or CMPI_RC_ERR_INVALID_PARAMETER where a value was refused. Every step
// takes effect at once; nothing is undone when a later one fails. properties is told in the log and decides nothing:
// what the instance holds is what is written. status is handed to the broker's calls and must not be null.

// Writes RequestedHostname, DomainName, DNSServerAddresses and ConfigurationName of the interface whose InstanceID is
// the key of ref. A file or a key that is missing takes nothing, without a sign. Without ConfigurationName its key is
// emptied.
unsigned int modifyDNSSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                              const char** properties, const CMPIInstance* instance,
                                              CMPIStatus* status);

// Writes DNSSuffixesToAppend and ConfigurationName, whatever the InstanceID of ref says. FAILED where neither was
// there.
unsigned int modifyDNSGeneralSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                     const char** properties, const CMPIInstance* instance,
                                                     CMPIStatus* status);

// Writes DNSSuffixesToAppend, DomainName and Hostname of every node whose name is the key Name of ref; OK also where
// there is none.
unsigned int modifyDNSProtocolEndpointCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                   const char** properties, const CMPIInstance* instance,
                                                   CMPIStatus* status);

}  // namespace ZV
