#pragma once

// Pages for clients that may read.

#include "http/Exchange.h"

namespace zorva::server {

/// Whether the client may read the namespace of the DNS settings.
inline bool mayRead(const http::HttpRequest& request) {
  constexpr const char* kNameSpace = "root/cimv2";
  return request.who != nullptr && request.who->grants.in(kNameSpace) >= access::Role::Read;
}

inline constexpr const char* kMayNotRead = "reading needs the role read in root/cimv2";

}  // namespace zorva::server
