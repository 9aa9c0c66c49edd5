#include "http/HostNames.h"

#include <algorithm>

#include "util/HostName.h"
#include "util/Names.h"
#include "util/ServiceHost.h"

namespace zorva::http {

HostNames::HostNames(const std::vector<std::string>& further) : names_(util::ownNames()) {
  names_.emplace_back("localhost.localdomain");
  for (const std::string& each : further) names_.emplace_back(util::withoutPort(each));
}

bool HostNames::has(std::string_view host) const {
  const std::string_view name = util::withoutPort(host);
  if (name.empty()) return false;
  const auto isName = [&](std::string_view each) { return util::sameName(each, name); };
  return std::any_of(names_.begin(), names_.end(), isName) || isName(util::kernelHostName()) ||
         util::isOwnAddress(name);
}

std::optional<Refusal> checkOrigin(const HeaderList& headers, std::string_view scheme) {
  const std::string* origin = findHeader(headers, "Origin");
  if (origin == nullptr) return std::nullopt;
  const std::string* host = findHeader(headers, "Host");
  const std::string own = std::string(scheme) + "://" + (host == nullptr ? std::string() : *host);
  if (util::sameName(*origin, own)) return std::nullopt;
  return Refusal{403, "the header Origin says that a web page of another server sends this; it is refused", {}};
}

Refusal foreignHost(std::string_view host) {
  constexpr std::size_t kLongest = 100;
  return Refusal{403,
                 "the header Host says '" + std::string(host.substr(0, kLongest)) +
                     "', which is no name or address of this host; if it is one, add it to listen.names",
                 {}};
}

}  // namespace zorva::http
