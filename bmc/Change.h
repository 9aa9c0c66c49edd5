#pragma once

// Changes of an Ethernet interface: what is sent, and how it is carried out.

#include <functional>
#include <optional>
#include <string>

#include "bmc/Ethernet.h"
#include "bmc/Redfish.h"

namespace zorva::bmc {

/// The settings that somebody asks for. What is not there stays.
struct WantedDns {
  std::optional<StringList> servers;
  std::optional<std::string> domain;
};

/// The properties that make these settings the only ones, as they would be in the resource: StaticNameServers, FQDN,
/// and DHCP's UseDNSServers and UseDomainName. Throws Failed if the interface has no place for them.
JsonValue propertiesFor(const Ethernet& now, const WantedDns& wanted);

/// The same properties as the interface has them, to be brought back later.
JsonValue propertiesOf(const Ethernet& now);

/// The part of these properties that differs from what the interface has: the body of a PATCH. StaticNameServers has as
/// many elements as the service reports. An empty object: nothing.
JsonValue differenceFrom(const Ethernet& now, const JsonValue& properties);

/// What a person should know before the change; empty for nothing.
std::string warningBefore(const Ethernet& now, const WantedDns& wanted);

/// The properties to be sent, by what the interface has now; an empty object: none.
using PropertiesOn = std::function<JsonValue(const Ethernet& now)>;

/// Makes the change that `propertiesOn` names for the interface as it is now. If somebody else changes it at the same
/// time, it is read again and the change is tried once more. Returns the service's remarks. Throws Failed.
std::string change(Redfish& redfish, const std::string& resource, const PropertiesOn& propertiesOn);

}  // namespace zorva::bmc
