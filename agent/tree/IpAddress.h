// IP addresses in text form.
#pragma once

#include <string>

namespace zorva::agent {

// Whether the whole text is an address as inet_pton takes it; without a zone.
bool isIPv4Address(const std::string& text);
bool isIPv6Address(const std::string& text);

}  // namespace zorva::agent
