#include "agent/tree/IpAddress.h"

#include <arpa/inet.h>

#include <algorithm>
#include <array>

namespace zorva::agent {
namespace {

bool parse(int family, const std::string& text, std::vector<unsigned char>& bytes) {
  return text.find('\0') == std::string::npos && ::inet_pton(family, text.c_str(), bytes.data()) == 1;
}

bool isAddress(int family, const std::string& text) {
  std::vector<unsigned char> bytes(sizeof(in6_addr));
  return parse(family, text, bytes);
}

}  // namespace

bool isIPv4Address(const std::string& text) { return isAddress(AF_INET, text); }

bool isIPv6Address(const std::string& text) { return isAddress(AF_INET6, text); }

bool isIPv6LinkLocal(const std::string& text) {
  const std::vector<unsigned char> bytes = bytesOfAddress(text);
  return bytes.size() == sizeof(in6_addr) && bytes[0] == 0xFE && (bytes[1] & 0xC0) == 0x80;
}

std::string textOfAddress(const std::vector<unsigned char>& address) {
  if (address.size() != sizeof(in_addr) && address.size() != sizeof(in6_addr)) return {};
  std::array<char, INET6_ADDRSTRLEN> text;
  return ::inet_ntop(address.size() == sizeof(in_addr) ? AF_INET : AF_INET6, address.data(), text.data(), text.size());
}

std::vector<unsigned char> bytesOfAddress(const std::string& text) {
  std::vector<unsigned char> bytes(sizeof(in6_addr));
  if (parse(AF_INET6, text, bytes)) return bytes;
  bytes.resize(sizeof(in_addr));
  return parse(AF_INET, text, bytes) ? bytes : std::vector<unsigned char>();
}

bool isUnspecifiedAddress(const std::vector<unsigned char>& address) {
  return std::all_of(address.begin(), address.end(), [](unsigned char byte) { return byte == 0; });
}

unsigned int protocolTypeOf(const AddressList& addresses) {
  constexpr unsigned int kOther = 1;
  constexpr unsigned int kIPv4 = 4096;
  constexpr unsigned int kIPv6 = 4097;
  constexpr unsigned int kBoth = 4098;
  const auto has = [&addresses](AddressFamily family) {
    return std::any_of(addresses.begin(), addresses.end(),
                       [family](const InterfaceAddress& address) { return address.family() == family; });
  };
  const bool ipv4 = has(AddressFamily::IPv4);
  const bool ipv6 = has(AddressFamily::IPv6);
  if (ipv4 && ipv6) return kBoth;
  if (!ipv4 && !ipv6) return kOther;
  return ipv4 ? kIPv4 : kIPv6;
}

}  // namespace zorva::agent
