#pragma once

// A Redfish EthernetInterface of a manager, and what the tree says of it. docs/bmc.md has the table.

#include <optional>
#include <string>
#include <vector>

#include "agent/tree/Json.h"
#include "agent/tree/Node.h"
#include "agent/tree/TreeSnapshot.h"

namespace zorva::bmc {

using agent::JsonValue;
using agent::StringList;

/// Of one family. What the service does not say is not there.
struct Dhcp {
  std::optional<bool> enabled;
  std::optional<bool> useDnsServers;
  std::optional<bool> useDomainName;

  bool givesServers() const { return enabled.value_or(false) && useDnsServers.value_or(false); }
  bool givesDomain() const { return enabled.value_or(false) && useDomainName.value_or(false); }
};

struct Ethernet {
  std::string resource;  ///< its @odata.id
  std::string settings;  ///< the resource that changes go to, where it is another one
  std::string id;
  std::string name;
  std::string hostName;
  std::optional<std::string> fqdn;
  std::optional<StringList> nameServers;    ///< in use, as the service has them
  std::optional<StringList> staticServers;  ///< with their padding; null is the empty text
  bool padsWithNull = false;                ///< and not with empty texts
  Dhcp v4;
  Dhcp v6;
  std::optional<bool> enabled;
  std::string linkStatus;
  std::string state;
  agent::AddressList addresses;

  /// The servers in use that are addresses, in the order of the service, each once.
  StringList servers() const;
  /// What follows the host name in the FQDN; empty if there is none.
  std::string domain() const;
  /// Those of servers() that nobody set by hand.
  StringList learnedServers() const;
};

/// What it holds of the wrong type counts as absent. Throws Failed if it has neither a usable Id nor an @odata.id.
Ethernet readEthernet(const JsonValue& body);

/// A list of servers without padding: empty texts, null and unspecified addresses.
StringList withoutPadding(const StringList& servers);

struct Manager {
  std::string id;
  std::vector<Ethernet> interfaces;
};

/// The nodes of all managers.
std::shared_ptr<const agent::TreeSnapshot> treeOf(const std::vector<Manager>& managers);

}  // namespace zorva::bmc
