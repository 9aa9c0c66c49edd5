#pragma once

// What is known of DNS settings, as properties of the tree.

#include <cstddef>

#include "agent/sources/DnsFacts.h"
#include "agent/sources/ResolvConf.h"
#include "agent/tree/TreeSnapshot.h"

namespace zorva::agent {

/// Gives a node whatever is known beside the servers and suffixes.
void setDnsProperties(TreeBuilder& builder, std::size_t node, const DnsFacts& facts);

/// Gives the system's node what the C library makes of /etc/resolv.conf.
void setResolverProperties(TreeBuilder& builder, std::size_t node, const ResolvConf& conf);

SharedStrings share(StringList list);

}  // namespace zorva::agent
