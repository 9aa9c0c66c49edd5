#pragma once

// Where the configuration and the data are that belong to this installation.

#include <string>

namespace zorva::util {

/// Directories, each with a slash at its end.
struct InstalledPlaces {
  std::string config = "/etc/zorvagent/";
  std::string data = "/var/lib/zorvagent/";
};

/// The places of the program or library at that path. PREFIX/bin, sbin, lib and lib/TRIPLET belong to the prefix, whose
/// places are PREFIX/etc/zorvagent/ and PREFIX/var/lib/zorvagent/ if the first of them exists: an installation makes
/// it. Otherwise, and for the prefix /usr, they are those of the system.
InstalledPlaces placesOf(const std::string& file);

/// The places of the program or library that contains the caller.
InstalledPlaces installedPlaces();

}  // namespace zorva::util
