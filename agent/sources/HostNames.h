// The host's name and domain, as far as the host itself knows them.
#pragma once

#include <string>
#include <string_view>

#include "agent/sources/ResolvConf.h"

namespace zorva::agent {

struct HostNames {
  std::string host;    // up to the first dot of the kernel's node name
  std::string domain;  // empty where nothing tells it
};

// The domain is the rest of the node name where that has a dot; else that of the host's canonical name in a hosts(5)
// file, of the first line that names the host with a domain and is not about localhost; else what resolv.conf's
// "domain" says, else the first of its search list. No resolver is asked: that could block.
HostNames findHostNames(const std::string& nodeName, std::string_view hosts, const ResolvConf& conf);

}  // namespace zorva::agent
