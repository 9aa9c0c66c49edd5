#pragma once

// The profiles of NetworkManager, in which it keeps the settings that a person has made.

#include <string>

#include "agent/apply/BusObject.h"
#include "agent/sources/BusNames.h"
#include "agent/tree/Node.h"

namespace zorva::agent {

/// What a profile says of DNS for one family of addresses.
struct ProfileDns {
  StringList servers;   ///< as the profile has them, "192.0.2.1" or "192.0.2.1#dns.example.org"
  StringList searches;  ///< "~" in front marks a routing-only domain
  bool ignoresLearned = false;
  bool operator==(const ProfileDns&) const = default;
};

struct NetworkManagerProfile {
  struct Family {
    std::string method;  ///< how its addresses come: "auto", "disabled"; empty where the profile has no such family
    ProfileDns dns;
  };

  std::string path;  ///< on the bus
  std::string name;
  std::string uuid;
  std::string file;
  bool isInMemory = false;  ///< and gone when NetworkManager ends
  Family ipv4;
  Family ipv6;

  bool hasSameDns(const NetworkManagerProfile& other) const {
    return ipv4.dns == other.ipv4.dns && ipv6.dns == other.ipv6.dns;
  }
};

inline BusObject networkManagerObject(BusCalls& bus, const std::string& path) {
  return {bus, kNetworkManagerService, path};
}

/// The profile at a path. Errors are those of BusCalls::call().
Expected<NetworkManagerProfile, std::string> readProfile(BusCalls& bus, const std::string& path);

/// Writes the profile to disk with these settings of DNS. The other settings are what NetworkManager has: it gives them
/// without the passwords and keys, and keeps those where the new settings bring none.
Expected<void, std::string> replaceDns(BusCalls& bus, const NetworkManagerProfile& profile);

}  // namespace zorva::agent
