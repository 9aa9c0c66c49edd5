#pragma once

// Where the host differs from the settings in the data directory.

#include <optional>
#include <string>
#include <vector>

#include "agent/interface/AgentApi.h"

namespace zorva::agent {

/// One interface with settings in its file or in the overlay. Of each kind: whether the host has something else;
/// nothing if it is not set there.
struct SettingsDrift {
  std::string interface;
  std::optional<bool> servers;
  std::optional<bool> suffixes;
  std::optional<bool> domain;
};

/// For each interface of the host, in tree order, that has settings in the data directory. Those of service processors
/// are left out. What cannot be read or applied counts as a difference. The order of servers counts within IPv4 and
/// within IPv6: some owners keep the two apart. It takes no lock and asks nobody: of a file that is being rewritten it
/// may report a difference once. Thread-safe. Throws as currentTree() does.
ZORVA_AGENT_API std::vector<SettingsDrift> settingsDrift();

}  // namespace zorva::agent
