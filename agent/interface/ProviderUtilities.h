#pragma once

// Checks that providers share.

#include <string>

#include "AgentApi.h"

namespace ZV::ProviderUtilities {

/// Whether a text is valid as a host or domain name (limits of RFC 1035): 1 if it is, 0 if it is refused. The empty
/// text and a final dot are valid. Refused are characters other than ASCII letters, digits, hyphen, dot and underscore,
/// empty labels, labels over 63 characters and names over 253. other is ignored. Thread-safe.
ZORVA_AGENT_API int ValidateInput(std::string value, std::string other);

}  // namespace ZV::ProviderUtilities
