#pragma once

// The host's name and domain, as far as the host itself knows them.

#include <string>
#include <string_view>

#include "agent/sources/ResolvConf.h"

namespace zorva::agent {

struct HostNames {
  std::string host;    ///< up to the first dot of the kernel's node name
  std::string domain;  ///< empty if unknown
};

/// The domain is the rest of the node name, if that has a dot. Else it is the domain of the host's canonical name in a
/// hosts(5) file: of the first line that names the host with a domain and is not about localhost. Else it is
/// resolv.conf's "domain", else the first entry of its search list. No resolver is asked, because that could block.
HostNames findHostNames(const std::string& nodeName, std::string_view hosts, const ResolvConf& conf);

}  // namespace zorva::agent
