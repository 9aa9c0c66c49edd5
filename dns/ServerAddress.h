#pragma once

// Addresses of DNS servers as owners of settings write them.

#include <netinet/in.h>
#include <sys/socket.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace zorva::dns {

inline constexpr std::uint16_t kUsualPort = 53;

struct ServerAddress {
  int family = AF_INET;
  in6_addr bytes{};  ///< the first 4 of IPv4
  std::string zone;  ///< of an IPv6 address: the name or number of an interface
  std::uint16_t port = kUsualPort;

  /// "192.0.2.1", "fe80::1%eth0", with a port other than 53 "192.0.2.1:5353", "[2001:db8::1]:5353".
  std::string text() const;
};

/// The address of "192.0.2.1", "192.0.2.1:853#dns.example.org", "2001:db8::1%eth0", "[2001:db8::1]:5353". The name
/// after "#" is left out. Nothing for any other text.
std::optional<ServerAddress> parseServer(std::string_view text);

/// The servers, each as it stands at its place in `inFull` if that is the same address with a port or a name. What was
/// set instead of the owner's servers is another address, and stays.
std::vector<std::string> withPorts(const std::vector<std::string>& servers, const std::vector<std::string>& inFull);

/// The same with the zone as the number of an interface of this host. Nothing if it has none of that name.
struct SocketAddress {
  sockaddr_storage storage{};
  socklen_t size = 0;
};
std::optional<SocketAddress> socketAddress(const ServerAddress& server);

}  // namespace zorva::dns
