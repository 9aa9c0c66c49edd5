#pragma once

// The files of settings in the agent's data directory.

#include <string>
#include <vector>

namespace zorva::frontend {

struct SettingFiles {
  std::vector<std::string> interfaces;  ///< the interfaces that they are named for, in order
  int error = 0;                        ///< errno if the directory cannot be read

  bool has(const std::string& interface) const;
};

SettingFiles findSettingFiles();

}  // namespace zorva::frontend
