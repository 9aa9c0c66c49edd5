#pragma once

// The names of the classes, in the spelling of the schema.

namespace ZV {

inline constexpr const char* computerSystemClass = "ZORVA_ComputerSystem";
inline constexpr const char* dnsProtocolEndPointClass = "ZORVA_DNSProtocolEndPoint";
inline constexpr const char* remoteServiceAccessPointClass = "ZORVA_RemoteServiceAccessPoint";
inline constexpr const char* dnsSettingDataClass = "ZORVA_DNSSettingData";
inline constexpr const char* dnsGeneralSettingDataClass = "ZORVA_DNSGeneralSettingData";
inline constexpr const char* ipInterfaceClass = "ZORVA_IPProtocolEndpoint";
inline constexpr const char* ipAssignmentSettingDataClass = "ZORVA_IPAssignmentSettingData";
inline constexpr const char* remoteAccessAvailableToElementClass = "ZORVA_RemoteAccessAvailableToElement";
inline constexpr const char* dnsSAPSAPDependencyClass = "ZORVA_DNSSAPSAPDependency";
inline constexpr const char* dnsHostedAccessPointClass = "ZORVA_DNSHostedAccessPoint";
inline constexpr const char* dnsGeneralElementSettingDataClass = "ZORVA_DNSGeneralElementSettingData";
inline constexpr const char* dnsEndpointElementSettingDataClass = "ZORVA_DNSEndPointElementSettingData";
inline constexpr const char* dnsGenEndpointElementSettingDataClass = "ZORVA_DNSGenEndPointElementSettingData";
inline constexpr const char* dnsGenOrderedComponentClass = "ZORVA_DNSGenOrderedComponent";
inline constexpr const char* dnsOrderedComponentClass = "ZORVA_DNSOrderedComponent";

}  // namespace ZV
