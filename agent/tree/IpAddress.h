#pragma once

// IP addresses in text form.

#include <string>
#include <vector>

#include "agent/tree/Node.h"

namespace zorva::agent {

/// Whether the whole text is an address for inet_pton; without a zone.
bool isIPv4Address(const std::string& text);
bool isIPv6Address(const std::string& text);

// Whether it is an IPv6 address of fe80::/10, which means something together with a link only.
bool isIPv6LinkLocal(const std::string& text);

// The text form of the 4 or 16 bytes of an address, empty for any other number of bytes; and back, nothing where the
// text is no address.
std::string textOfAddress(const std::vector<unsigned char>& address);
std::vector<unsigned char> bytesOfAddress(const std::string& text);

// Whether it is 0.0.0.0 or ::, which no host has.
bool isUnspecifiedAddress(const std::vector<unsigned char>& address);

// CIM's ProtocolIFType: 4096 IPv4, 4097 IPv6, 4098 both, 1 if there are none.
unsigned int protocolTypeOf(const AddressList& addresses);

}  // namespace zorva::agent
