#pragma once

// What is shown of a host: its interfaces, their settings, the host as a whole, and where each of them comes from.

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace zorva::cli {

/// The source of a setting's value: the interface's file, the host, a value that was set and replaces the host's own,
/// or none.
enum class SettingSource { File, Host, Set, None };

const char* sourceName(SettingSource source) noexcept;

struct SettingRow {
  std::string interface;  ///< the interface whose file and host settings count
  std::string setting;    ///< the property's name
  bool isList = false;
  std::vector<std::string> values;
  SettingSource source = SettingSource::None;
};

/// What an owner of DNS settings says beside the lists; empty where it does not say. The values are the tree's. A
/// server tells the first three.
struct OwnerFacts {
  std::string owner;
  std::string profile;
  std::string origin;
  std::vector<std::string> serversInFull;
  std::vector<std::string> routingDomains;
  std::string defaultRoute;
  std::string dnsOverTls;
  std::string dnssec;
  std::string llmnr;
  std::string multicastDns;
};

struct InterfaceRow {
  std::string name;
  std::string system;
  bool isServiceProcessor = false;
  std::optional<std::uint64_t> stateNumber;
  std::string state;  ///< "Enabled"; the number as text if the class has no word for it
  std::string hostName;
  std::string endpointDomain;  ///< of the endpoint, which does not read the interface's file
  std::vector<std::string> servers;
  std::string domainName;
  std::vector<std::string> suffixes;
  std::vector<SettingRow> settings;

  SettingSource source = SettingSource::None;  ///< File or Set if that holds for any of the values
  OwnerFacts facts;
  std::vector<std::string> hostServers;  ///< those of the host where a file replaces them

  /// Whether it has servers or domains of its own, or something was set for it. The domain alone does not count: it may
  /// be the host's.
  bool hasDns() const;

  bool hasStateWord() const { return stateNumber && state != std::to_string(*stateNumber); }

  /// "NetworkManager, profile lan", "ifcfg-eth0", "/etc/resolv.conf"; empty if nothing supplies values.
  std::string from() const;
};

/// What belongs to the host and to no interface. A server may tell only the suffixes.
struct HostRow {
  std::string interface;              ///< whose file has the settings of the host; empty: none, or not known
  bool hasFile = false;               ///< it exists
  std::vector<SettingRow> settings;   ///< of ZORVA_DNSGeneralSettingData
  std::vector<std::string> suffixes;  ///< among them
  OwnerFacts facts;
  std::vector<std::string> servers;  ///< for which the owner asks on behalf of the host
  std::vector<std::string> ownSuffixes;
  std::vector<std::string> resolverServers;
  std::vector<std::string> resolverNotAsked;
  std::vector<std::string> resolverSearch;
  std::vector<std::string> resolverOptions;

  /// Which file holds the settings, and why; empty where that is not known.
  std::string place() const;
};

/// When the service processor was read. Its interfaces are as of then.
struct BmcReading {
  std::uint64_t at = 0;    ///< seconds since 1970
  std::uint64_t age = 0;   ///< seconds
  bool isUnknown = false;  ///< so long ago that nobody knows what it has now
  std::string problem;     ///< why the latest reading failed; empty if it did not

  /// "12 s ago"; and that it counts as unknown.
  std::string text() const;
};

/// "kept in ifcfg-eth0: ...": in words which file holds the settings of the host, or would.
std::string placeOfHostSettings(const std::string& interface, bool hasFile);

}  // namespace zorva::cli
