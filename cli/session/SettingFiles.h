#pragma once

// The files of settings in the agent's data directory.

#include <string>
#include <vector>

#include "agent/Agent.h"
#include "agent/files/SettingFiles.h"
#include "agent/tree/TreeSnapshot.h"
#include "cli/session/Session.h"

namespace zorva::cli {

using zorva::agent::findSettingFiles;
using zorva::agent::SettingFiles;

/// Those of the interfaces that are not in the tree.
std::vector<std::string> orphansAmong(const SettingFiles& files, const zorva::agent::TreeSnapshot& tree);

/// A file for a list of them.
struct ListedFile {
  std::string path;
  std::string interface;
  bool isOrphan = false;
  std::vector<std::string> keys;
  std::string problem;  ///< why it cannot be read
};

/// Warns of files whose interfaces are gone: nothing reads what they hold. Not with a server, which does not say.
void warnOfOrphans(const Session& session);

}  // namespace zorva::cli
