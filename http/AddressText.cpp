#include "http/AddressText.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include <cstring>

namespace zorva::http {

std::string addressText(const sockaddr_storage& address) {
  char text[INET6_ADDRSTRLEN] = "";
  if (address.ss_family == AF_INET6) {
    sockaddr_in6 v6{};
    std::memcpy(&v6, &address, sizeof v6);
    ::inet_ntop(AF_INET6, &v6.sin6_addr, text, sizeof text);
    return "[" + std::string(text) + "]:" + std::to_string(ntohs(v6.sin6_port));
  }
  sockaddr_in v4{};
  std::memcpy(&v4, &address, sizeof v4);
  ::inet_ntop(AF_INET, &v4.sin_addr, text, sizeof text);
  return std::string(text) + ":" + std::to_string(ntohs(v4.sin_port));
}

}  // namespace zorva::http
