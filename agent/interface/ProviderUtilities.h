// Checks that providers share.
#pragma once

#include <string>

#include "AgentApi.h"

namespace ZV::ProviderUtilities {

// Whether a text will do as a host or domain name (RFC 1035's limits): 1 when it will, 0 when it is refused. The empty
// text and a final dot will do. Refused are characters other than ASCII letters, digits, hyphen, dot and underscore,
// empty labels, labels over 63 characters and names over 253. other is not looked at. Thread-safe.
ZORVA_AGENT_API int ValidateInput(std::string value, std::string other);

}  // namespace ZV::ProviderUtilities
