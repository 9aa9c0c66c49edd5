#pragma once

// IP addresses in text form.

#include <string>

namespace zorva::agent {

/// Whether the whole text is an address for inet_pton; without a zone.
bool isIPv4Address(const std::string& text);
bool isIPv6Address(const std::string& text);

}  // namespace zorva::agent
