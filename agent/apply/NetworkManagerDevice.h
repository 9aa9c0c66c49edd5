#pragma once

// The devices of NetworkManager: what it says of an interface at present.

#include <string>

#include "agent/apply/BusCalls.h"
#include "util/Expected.h"

namespace zorva::agent {

struct NetworkManagerDevice {
  std::string path;
  bool isManaged = false;
  std::string active;       ///< the path of its active connection; "/" or empty for none
  std::string profile;      ///< the path of that one's profile
  bool isExternal = false;  ///< it only follows what another program has set up
  std::string lease;        ///< the path of its lease of IPv4; "/" or empty for none
};

/// Whether this is the path of an object.
inline bool isBusPath(const std::string& path) { return path.size() > 1; }

/// Errors are those of BusCalls::call().
Expected<NetworkManagerDevice, std::string> readDevice(BusCalls& bus, const std::string& interface);

}  // namespace zorva::agent
