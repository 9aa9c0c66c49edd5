#pragma once

// The effect of ModifyInstance. The two classes of setting data write to the interface's file, the endpoint writes to
// the node. The two are not synchronized.

#include <cmpidt.h>

namespace ZV {

// Each returns CMPI_RC_OK, CMPI_RC_ERR_FAILED, or CMPI_RC_ERR_INVALID_PARAMETER if a value was refused. Every step
// takes effect at once and is not undone if a later one fails. properties is only logged: all properties of the
// instance are written. status is passed to the broker's calls and must not be null.

/// Writes RequestedHostname, DomainName, DNSServerAddresses and ConfigurationName of the interface whose InstanceID is
/// the key of ref. If the file or a key is missing, the value is dropped without an error. Without ConfigurationName
/// its key is emptied.
unsigned int modifyDNSSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                              const char** properties, const CMPIInstance* instance,
                                              CMPIStatus* status);

/// Writes DNSSuffixesToAppend and ConfigurationName; the InstanceID of ref is ignored. FAILED if the instance has
/// neither.
unsigned int modifyDNSGeneralSettingDataCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                     const char** properties, const CMPIInstance* instance,
                                                     CMPIStatus* status);

/// Writes DNSSuffixesToAppend, DomainName and Hostname of every node whose name is the key Name of ref; OK even if
/// there is none.
unsigned int modifyDNSProtocolEndpointCMPIInstance(const CMPIBroker* broker, const CMPIObjectPath* ref,
                                                   const char** properties, const CMPIInstance* instance,
                                                   CMPIStatus* status);

}  // namespace ZV
