#include "agent/tree/IpAddress.h"

#include <arpa/inet.h>

#include <array>

namespace zorva::agent {
namespace {

bool isAddress(int family, const std::string& text) {
  std::array<unsigned char, sizeof(in6_addr)> address;
  return text.find('\0') == std::string::npos && ::inet_pton(family, text.c_str(), address.data()) == 1;
}

}  // namespace

bool isIPv4Address(const std::string& text) { return isAddress(AF_INET, text); }

bool isIPv6Address(const std::string& text) { return isAddress(AF_INET6, text); }

}  // namespace zorva::agent
