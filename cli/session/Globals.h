#pragma once

#include <optional>
#include <string>

#include "cli/output/OutputFormat.h"

namespace zorva::cli {

/// The options of zorvactl itself, which are given before or after the subcommand.
struct Globals {
  OutputFormat output = OutputFormat::Table;
  std::string config;             ///< the agent's configuration; empty: as the environment says
  std::optional<int> logLevel;    ///< lines below it are dropped; absent: as the configuration says
  std::string providerDirectory;  ///< empty: beside this program
  bool quiet = false;             ///< write errors only
  std::string url;                ///< of the CIM server to ask; empty: the providers, in this process
};

}  // namespace zorva::cli
