#pragma once

// The users and groups of this host, as the name service switch has them (nsswitch.conf(5)). May take long: a directory
// on the network may be asked.

#include <sys/types.h>

#include <optional>
#include <string>

namespace zorva::access {

struct LocalUser {
  std::string name;       ///< "uid 1000" if the host has no name for it
  bool isMember = false;  ///< of the group that was asked for
};

/// Looks up a user, and whether the group is the user's own or lists the user.
LocalUser lookUpUser(uid_t user, const std::string& group);

/// Nothing if there is no such group.
std::optional<gid_t> groupNamed(const std::string& name);

}  // namespace zorva::access
