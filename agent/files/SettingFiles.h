#pragma once

// The files of settings in a data directory: one for each interface, named for it.

#include <string>
#include <string_view>
#include <vector>

#include "agent/interface/AgentApi.h"

namespace zorva::agent {

/// The name of an interface's file: "ifcfg-eth0".
ZORVA_AGENT_API std::string settingFileName(std::string_view interface);

struct ZORVA_AGENT_API SettingFiles {
  std::vector<std::string> interfaces;  ///< the interfaces that they are named for, in order
  int error = 0;                        ///< errno if the directory cannot be read

  bool has(const std::string& interface) const;
};

/// Those in a directory, whose name ends in a slash.
ZORVA_AGENT_API SettingFiles findSettingFiles(const std::string& directory);

}  // namespace zorva::agent
