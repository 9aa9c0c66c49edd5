#pragma once

// The mask of an IPv4 prefix.

#include <cstdint>
#include <string>

namespace zorva::host {

/// The mask with that many leading ones in dotted decimals; a length over 32 counts as 32.
inline std::string subnetMask(unsigned int prefixLength) {
  const std::uint32_t mask = prefixLength == 0 ? 0 : ~std::uint32_t{0} << (prefixLength >= 32 ? 0 : 32 - prefixLength);
  return std::to_string(mask >> 24) + "." + std::to_string(mask >> 16 & 0xff) + "." + std::to_string(mask >> 8 & 0xff) +
         "." + std::to_string(mask & 0xff);
}

}  // namespace zorva::host
