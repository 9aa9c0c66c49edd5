#pragma once

#include <optional>
#include <string>

#include "cli/operations/Server.h"
#include "cli/output/OutputFormat.h"
#include "cli/session/ServerOptions.h"

namespace zorva::cli {

/// The options of zorvactl itself, which are given before or after the subcommand, and what follows from them.
struct Globals {
  OutputFormat output = OutputFormat::Table;
  std::string config;             ///< the agent's configuration; empty: as the environment says
  std::optional<int> logLevel;    ///< lines below it are dropped; absent: as the configuration says
  std::string providerDirectory;  ///< empty: beside this program
  std::string addedProviders;     ///< directory of further providers; empty: the usual one
  bool quiet = false;             ///< write errors only
  bool dryRun = false;            ///< of commands that change: show what would be done, and do nothing
  ServerOptions servers;

  std::optional<Server> server;  ///< the CIM server to ask; nothing: the providers, in this process
  bool isOneOfMany = false;      ///< its results are gathered with those of other hosts
};

}  // namespace zorva::cli
