#include "util/ServiceHost.h"

#include <arpa/inet.h>
#include <ifaddrs.h>
#include <netinet/in.h>

#include <cstring>
#include <memory>
#include <optional>
#include <vector>

#include "util/HostName.h"
#include "util/Names.h"

namespace zorva::util {

namespace {

std::string kernelName() {
  const std::string name = kernelHostName();
  return name.empty() ? "localhost" : name;
}

/// "h" of "h", "h:5988", "[::1]:5988" and "::1".
std::string_view withoutPort(std::string_view text) noexcept {
  if (text.starts_with('[')) {
    const std::size_t end = text.find(']');
    return end == std::string_view::npos ? text : text.substr(1, end - 1);
  }
  const std::size_t colon = text.find(':');
  const bool isAddress = colon != std::string_view::npos && text.find(':', colon + 1) != std::string_view::npos;
  return isAddress ? text : text.substr(0, colon);
}

/// The bytes of an address; empty if the text is not an address.
std::string addressOf(std::string_view text) {
  const std::string copy(text.substr(0, INET6_ADDRSTRLEN));
  char bytes[sizeof(in6_addr)];
  if (inet_pton(AF_INET, copy.c_str(), bytes) == 1) return {bytes, sizeof(in_addr)};
  if (inet_pton(AF_INET6, copy.c_str(), bytes) == 1) return {bytes, sizeof(in6_addr)};
  return {};
}

std::string addressOf(const sockaddr* address) {
  if (address == nullptr) return {};
  if (address->sa_family == AF_INET) {
    const auto* v4 = reinterpret_cast<const sockaddr_in*>(address);
    return {reinterpret_cast<const char*>(&v4->sin_addr), sizeof v4->sin_addr};
  }
  if (address->sa_family == AF_INET6) {
    const auto* v6 = reinterpret_cast<const sockaddr_in6*>(address);
    return {reinterpret_cast<const char*>(&v6->sin6_addr), sizeof v6->sin6_addr};
  }
  return {};
}

bool isOwnAddress(const std::string& address) {
  if (address.size() == sizeof(in_addr) && address[0] == 127) return true;
  ifaddrs* list = nullptr;
  if (getifaddrs(&list) != 0) return false;
  const std::unique_ptr<ifaddrs, decltype(&freeifaddrs)> owner(list, freeifaddrs);
  for (const ifaddrs* one = list; one != nullptr; one = one->ifa_next) {
    if (addressOf(one->ifa_addr) == address) return true;
  }
  return false;
}

std::string_view firstLabel(std::string_view name) noexcept { return name.substr(0, name.find('.')); }

/// True if the names are equal, or one is the other with a domain.
bool sameHost(std::string_view a, std::string_view b) noexcept {
  if (sameName(a, b)) return true;
  const bool aIsShort = a.find('.') == std::string_view::npos;
  const bool bIsShort = b.find('.') == std::string_view::npos;
  return aIsShort != bIsShort && sameName(firstLabel(a), firstLabel(b));
}

}  // namespace

ServiceHost::ServiceHost(std::string name) : name_(name.empty() ? kernelName() : std::move(name)) {}

bool ServiceHost::isThis(std::string_view text, std::string_view hostHeader) const {
  std::string_view host = withoutPort(text);
  if (host.ends_with('.')) host.remove_suffix(1);
  if (host.empty()) return false;
  if (const std::string address = addressOf(host); !address.empty()) return isOwnAddress(address);
  return sameName(host, "localhost") || sameName(firstLabel(host), "localhost") ||
         sameName(host, withoutPort(hostHeader)) || sameHost(host, name_) || sameHost(host, kernelName());
}

}  // namespace zorva::util
