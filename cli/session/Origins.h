#pragma once

// Where the DNS settings come from: the tree and the files of this host tell it, of another host its zorvacimd.

#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "cli/session/HostRows.h"
#include "cli/session/Problems.h"
#include "cli/session/Session.h"

namespace zorva::cli {

/// Of the settings of one interface.
struct Origin {
  bool hasFile = false;                    ///< then nothing else counts
  std::vector<std::string> setProperties;  ///< of the endpoint: set, in place of what the owner says
  OwnerFacts facts;
  std::vector<std::string> servers;  ///< that the owner names
};

struct Origins {
  std::map<std::pair<bool, std::string>, Origin> interfaces;  ///< of several with one name the first
  HostRow host;                                               ///< without its settings
  std::optional<BmcReading> bmc;

  /// Null if nothing says.
  const Origin* find(const std::string& interface, bool isServiceProcessor) const;
};

/// Nothing for a server that does not tell: that is no problem, since other servers than zorvacimd cannot.
std::optional<Origins> readOrigins(Session& session, std::vector<Problem>& problems);

}  // namespace zorva::cli
