#include "http/AddressText.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include <cstring>

namespace zorva::http {

std::string hostText(const sockaddr_storage& address) {
  char text[INET6_ADDRSTRLEN] = "";
  if (address.ss_family == AF_INET6) {
    sockaddr_in6 v6{};
    std::memcpy(&v6, &address, sizeof v6);
    ::inet_ntop(AF_INET6, &v6.sin6_addr, text, sizeof text);
  } else if (address.ss_family == AF_INET) {
    sockaddr_in v4{};
    std::memcpy(&v4, &address, sizeof v4);
    ::inet_ntop(AF_INET, &v4.sin_addr, text, sizeof text);
  }
  return text;
}

std::string addressText(const sockaddr_storage& address) {
  if (address.ss_family == AF_UNIX) return "a Unix socket";
  sockaddr_in v4{};
  std::memcpy(&v4, &address, sizeof v4);  // the port is at the same offset in both families
  const std::string host = hostText(address);
  return (address.ss_family == AF_INET6 ? "[" + host + "]" : host) + ":" + std::to_string(ntohs(v4.sin_port));
}

sockaddr_storage unmapped(const sockaddr_storage& address) {
  constexpr std::size_t kPrefix = 12;
  if (address.ss_family != AF_INET6) return address;
  sockaddr_in6 v6{};
  std::memcpy(&v6, &address, sizeof v6);
  if (!IN6_IS_ADDR_V4MAPPED(&v6.sin6_addr)) return address;
  sockaddr_in v4{};
  v4.sin_family = AF_INET;
  v4.sin_port = v6.sin6_port;
  std::memcpy(&v4.sin_addr, v6.sin6_addr.s6_addr + kPrefix, sizeof v4.sin_addr);
  sockaddr_storage plain{};
  std::memcpy(&plain, &v4, sizeof v4);
  return plain;
}

bool isLoopback(const sockaddr_storage& address) {
  if (address.ss_family == AF_INET) {
    sockaddr_in v4{};
    std::memcpy(&v4, &address, sizeof v4);
    return (ntohl(v4.sin_addr.s_addr) >> 24) == 127;
  }
  sockaddr_in6 v6{};
  std::memcpy(&v6, &address, sizeof v6);
  return address.ss_family == AF_INET6 && IN6_IS_ADDR_LOOPBACK(&v6.sin6_addr);
}

}  // namespace zorva::http
