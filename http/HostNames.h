#pragma once

// Keeps web pages out. A browser sends requests of any page that its user looks at, also to this host: by an address,
// or by a name of the page's owner that leads here (DNS rebinding). Such requests name another host in the header Host,
// or the page in the header Origin.

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "http/Exchange.h"
#include "http/RequestHead.h"

namespace zorva::http {

/// The names and addresses of this host that the header Host may have. Never changes. Thread-safe.
class HostNames {
 public:
  /// `further`: names that only the configuration knows.
  explicit HostNames(const std::vector<std::string>& further = {});

  /// `host` is the value of a header Host. Names must be equal: a name of somebody else's domain may begin as one of
  /// this host. Queries no name server.
  bool has(std::string_view host) const;

 private:
  std::vector<std::string> names_;
};

/// Refuses a request of a web page that is not this server's. `scheme` is "http" or "https". A page's Origin must be
/// that scheme and the Host of the request.
std::optional<Refusal> checkOrigin(const HeaderList& headers, std::string_view scheme);

/// The refusal of a request that names another host.
Refusal foreignHost(std::string_view host);

}  // namespace zorva::http
