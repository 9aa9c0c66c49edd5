#pragma once

// The agent's directory and name of this host.

#include <string>

#include "AgentApi.h"

namespace ZV {

namespace PlatformUtilities {

/// The agent's data directory, with a slash at its end. The text belongs to the agent and stays valid and unchanged
/// until the agent's library is unloaded. Thread-safe.
ZORVA_AGENT_API const char* getMaroviaDataDir();

}  // namespace PlatformUtilities

/// The managed system's name: the configured one, else the one of the tree's source. Thread-safe.
ZORVA_AGENT_API std::string getSystemName();

}  // namespace ZV
